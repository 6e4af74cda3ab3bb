#pragma once

// Files of translations, in UTF-8 or UTF-16:
//
//     /* comment */
//     "Class redefined: %@" = "Klasse doppelt definiert: %@";   // comment
//
// Inside quotation marks \" \\ \n \r \t and \Uxxxx (hexadecimal, UTF-16) stand for themselves.

#include <QXXMLMarshalling/base/String.h>

#include <map>
#include <vector>

namespace qx {

struct StringsFile {
    using Texts = std::map<std::string, String, std::less<>>;

    // An empty translation counts as none; of two for one text the last counts.
    Texts texts;
    // Where entries begin that are none, or that hold what is no text; the first few of them.
    std::vector<std::size_t> faultyLines;
};

StringsFile parseStrings(std::string_view file);

} // namespace qx
