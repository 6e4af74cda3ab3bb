#pragma once

// Texts in the user's language.

#include <QXXMLMarshalling/base/String.h>

namespace qx {

// The translation of an English text from <language>.lproj/Localizable.strings in the folder; the
// English text itself where there is none. See Bundle::localizedString.
String localizedString(const String& folder, std::string_view englishText);

} // namespace qx
