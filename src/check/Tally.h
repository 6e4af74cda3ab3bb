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
    // What is alike: the text and what it is filled with, but for the count, which comes last.
    struct Entry {
        const FindingText* text;
        std::vector<String> arguments;
        String className;
        String meant; // perhaps
        QXXMLMappingPlace place;
        std::size_t count;
    };

    // Counts one more; of the first of its kind the place, and what was perhaps meant, are
    // asked for.
    void add(const FindingText& text, std::vector<String> arguments, const String& className,
             const std::function<QXXMLMappingPlace()>& place,
             const std::function<String()>& meant = {});
    // In the order in which the first of each came.
    std::vector<QXXMLFinding> findings() const;
    // Adds what the other one counted.
    void add(const Tally& other);

private:
    using Key = std::tuple<const FindingText*, std::vector<String>, String>;

    std::map<Key, std::size_t> _numbers;
    std::vector<Entry> _entries;
};

} // namespace qx::detail
