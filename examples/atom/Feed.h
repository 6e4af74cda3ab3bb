#pragma once

// Atom feeds as plain structs. What an entry says, its authors, and elements of other namespaces
// stay in the members of type QXUnknownXML.

#include <QXXMLMarshalling/QXUnknownXML.h>
#include <QXXMLMarshalling/model/DateTime.h>

namespace atom {

struct Text {
    std::optional<std::string> type; // "text" where it is not there, "html" or "xhtml"
    std::string text;                // of "xhtml" without its markup
    QXUnknownXML unknown;
};
struct Link {
    std::optional<std::string> rel; // "alternate" where it is not there
    std::string href;
    QXUnknownXML unknown;
};
struct Entry {
    std::string id;
    std::optional<Text> title;
    std::optional<qx::DateTime> updated;
    std::vector<Link> links;
    QXUnknownXML unknown;
};
struct Feed {
    std::string id;
    std::optional<Text> title;
    std::optional<qx::DateTime> updated;
    std::vector<Link> links;
    std::vector<Entry> entries;
    QXUnknownXML unknown;
};

void describeClasses();

// The title of the feed, or of the entry, with this id; made where it has none. Null where there is
// no such id.
Text* titleOf(Feed& feed, const std::string& id);

} // namespace atom
