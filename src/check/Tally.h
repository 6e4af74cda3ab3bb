#pragma once

// Findings that are alike, counted: the first one's place stands for all.

#include <QXXMLMarshalling/QXXMLFinding.h>

#include "check/FindingTexts.h"

#include <functional>
#include <map>
#include <vector>

namespace qx::detail {

class Tally {
public:
    // The class and the field that took what is around; null for none.
    struct Concerned {
        String className = {};
        String fieldName = {};
        friend auto operator<=>(const Concerned&, const Concerned&) = default;
    };
    // What is alike: the text and what it is filled with, but for the count, which comes last.
    struct Entry {
        const FindingText* text;
        std::vector<String> arguments;
        Concerned concerned;
        String suggestion;
        QXXMLMappingPlace place;
        std::size_t count;
    };

    // Counts one more; of the first of its kind the place and the suggestion are asked for.
    void add(const FindingText& text, std::vector<String> arguments, const Concerned& concerned,
             const std::function<QXXMLMappingPlace()>& place,
             const std::function<String()>& suggestion = {});
    // In the order in which the first of each came.
    std::vector<QXXMLFinding> findings() const;
    // Adds what the other one counted.
    void add(const Tally& other);

private:
    using Key = std::tuple<const FindingText*, std::vector<String>, Concerned>;

    std::map<Key, std::size_t> _numbers;
    std::vector<Entry> _entries;
};

} // namespace qx::detail
