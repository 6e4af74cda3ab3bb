#pragma once

// Texts in the user's language.

#include <QXXMLMarshalling/platform/String.h>

namespace qx {

// The translation of an English text, from <language>.lproj/Localizable.strings of the framework
// bundle; the English text itself where there is none. The language is that of the first of
// LC_ALL, LC_MESSAGES and LANG that is set. Any thread may ask.
String localizedText(std::string_view englishText);

} // namespace qx
