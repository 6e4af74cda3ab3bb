#pragma once

// Files of translations, in UTF-8:
//
//     /* comment */
//     "Class redefined: %@" = "Klasse doppelt definiert: %@";   // comment
//
// Inside quotation marks \" \\ \n \t and \Uxxxx (hexadecimal) stand for themselves.

#include <QXXMLMarshalling/platform/String.h>

#include <map>

namespace qx {

using Strings = std::map<std::string, String, std::less<>>;

// What the file holds up to the first place that is no such entry. An empty translation counts as
// none.
Strings parseStrings(std::string_view file);

} // namespace qx
