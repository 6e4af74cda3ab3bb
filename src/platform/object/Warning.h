#pragma once

// Warnings of this room, which knows no log of its own: whoever has one installs it here.

#include <QXXMLMarshalling/platform/String.h>

namespace qx {

using WarningSink = void (*)(const String& message);

// Standard error until something else is installed.
void installWarningSink(WarningSink sink) noexcept;
void reportWarning(const String& message);

} // namespace qx
