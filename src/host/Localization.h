#pragma once

// Texts in the user's language.

#include <QXXMLMarshalling/base/String.h>

namespace qx {

// Bundle::localizedString of the framework bundle. An error that comes about while that bundle is
// opened for a text gets the English one.
String localizedText(std::string_view englishText);

} // namespace qx
