#pragma once

// The library's messages. They go to the host's functions (QXXMLMarshalling/host/Log.h) or to
// standard error. Arguments are whatever makes a Value; they cost nothing where nobody listens.

#include <QXXMLMarshalling/host/Log.h>

#include <array>

namespace qx {

using LogFunction = void (*)(std::string_view format, std::span<const Value> arguments);

// The host's function; null where it has none. Ask before each use.
LogFunction hostLogDebug() noexcept;
LogFunction hostLogWarning() noexcept;
inline bool hostHasLogWarning() noexcept { return hostLogWarning() != nullptr; }

// One line on standard error: time, process name and identifier, message.
void writeLogLine(std::string_view format, std::span<const Value> arguments);

namespace detail {
template <class... Arguments>
void logThrough(LogFunction function, std::string_view format, const Arguments&... arguments) {
    const std::array<Value, sizeof...(Arguments)> values{Value(arguments)...};
    function(format, values);
}
} // namespace detail

// To standard error, whatever the host has.
template <class... Arguments>
void log(std::string_view format, const Arguments&... arguments) {
    detail::logThrough(&writeLogLine, format, arguments...);
}

// To the host's debugging function; nothing without one.
template <class... Arguments>
void logDebug(std::string_view format, const Arguments&... arguments) {
    if (const LogFunction function = hostLogDebug())
        detail::logThrough(function, format, arguments...);
}

// To the host's warning function, else to standard error.
template <class... Arguments>
void logWarningOrLine(std::string_view format, const Arguments&... arguments) {
    const LogFunction function = hostLogWarning();
    detail::logThrough(function != nullptr ? function : &writeLogLine, format, arguments...);
}

} // namespace qx
