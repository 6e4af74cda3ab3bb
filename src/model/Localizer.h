#pragma once

// The texts of errors in the user's language. This folder has no translations: whoever has them
// installs a look-up here.

#include <QXXMLMarshalling/base/String.h>

namespace qx {

// Answers the English text itself where there is no translation.
using Localizer = String (*)(std::string_view englishText);

void installLocalizer(Localizer localizer) noexcept;
// The English text until something is installed.
String localizedText(std::string_view englishText);

} // namespace qx
