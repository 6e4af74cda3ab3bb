#pragma once

// Numbers in text: reading them at the start of a string, and writing them.

#include <QXXMLMarshalling/base/String.h>

#include <array>
#include <cstdint>
#include <optional>

namespace qx {

// The signed integer at the start: white space of any script is skipped, a sign is taken, reading
// stops at the first character that is no digit; beyond 64 bits the limit value. None where no
// digit stands.
std::optional<std::int64_t> scanInteger(std::string_view text) noexcept;

// The number at the start, likewise.
std::optional<double> scanReal(std::string_view text) noexcept;

// The shortest text that reads back equal, without an exponent from 1e-5 to below 1e17; NaN, INF
// and -INF as XML Schema writes them.
String describeReal(double value);
// The same in memory of the caller's.
using RealText = std::array<char, 32>;
std::string_view describeReal(double value, RealText& text);

} // namespace qx
