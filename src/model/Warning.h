#pragma once

// Messages of this folder, which knows no log of its own: whoever has one installs it here.

#include <QXXMLMarshalling/model/Value.h>

#include <span>
#include <string_view>

namespace qx {

using WarningSink = void (*)(const String& message);

// Standard error until something else is installed.
void installWarningSink(WarningSink sink) noexcept;
void reportWarning(const String& message);

// Takes a format (Format.h) and its arguments.
using DebugSink = void (*)(std::string_view format, std::span<const Value> arguments);
// Who listens may come and go: what is installed looks for it, and gives null when there is nobody.
using DebugSinkFinder = DebugSink (*)() noexcept;

void installDebugSinkFinder(DebugSinkFinder finder) noexcept;
// Null where nobody listens: to be asked before each message.
DebugSink debugSink() noexcept;

} // namespace qx
