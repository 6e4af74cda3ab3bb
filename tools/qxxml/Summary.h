#pragma once

// What a run passes over, summed up: a line for each kind, name and element, however often it
// comes. Bounded: after some hundred different ones the rest is only counted.

#include <QXXMLMarshalling/QXXMLReport.h>

#include <map>
#include <string>
#include <tuple>

namespace qxxml {

class Summary {
public:
    void add(const QXXMLReport& report);
    // The lines, each behind "qxxml: warning: ", or as JSON; empty where nothing was passed over.
    std::string text(bool isJson) const;

private:
    struct Entry {
        std::size_t elements = 0; // that hold such a thing
        std::size_t count = 0;    // how many they hold
        qx::DocumentPlace first;
    };
    using Kind = QXXMLReport::Kind;
    // The kind, whether it is kept, the name, the element's name.
    using Key = std::tuple<Kind, bool, std::string, std::string>;

    static std::string lineOf(const Key& key, const Entry& entry);
    static std::string jsonLineOf(const Key& key, const Entry& entry);

    std::map<Key, Entry> _entries;
    std::size_t _others = 0;
};

// The report by itself, as one line with its place.
std::string lineOf(const QXXMLReport& report);

} // namespace qxxml
