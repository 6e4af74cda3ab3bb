#include "base/Scan.h"

#include "base/Unicode.h"

#include <array>
#include <charconv>
#include <cmath>

namespace qx {

std::optional<std::int64_t> scanInteger(std::string_view text) noexcept {
    text = unicode::withoutLeadingSpace(text);
    const bool negative = !text.empty() && text.front() == '-';
    if (negative || (!text.empty() && text.front() == '+'))
        text.remove_prefix(1);
    if (text.empty() || text.front() < '0' || text.front() > '9')
        return std::nullopt;
    std::uint64_t magnitude = 0;
    const auto read = std::from_chars(text.data(), text.data() + text.size(), magnitude);
    constexpr auto limit = static_cast<std::uint64_t>(INT64_MAX);
    const bool beyond = read.ec == std::errc::result_out_of_range || magnitude > limit;
    if (negative)
        return beyond ? INT64_MIN : -static_cast<std::int64_t>(magnitude);
    return beyond ? INT64_MAX : static_cast<std::int64_t>(magnitude);
}

std::optional<double> scanReal(std::string_view text) noexcept {
    text = unicode::withoutLeadingSpace(text);
    if (!text.empty() && text.front() == '+')
        text.remove_prefix(1);
    double value = 0;
    const auto read = std::from_chars(text.data(), text.data() + text.size(), value);
    if (read.ec == std::errc::invalid_argument)
        return std::nullopt;
    return value;
}

String describeReal(double value) {
    if (std::isnan(value))
        return "NaN";
    if (std::isinf(value))
        return value < 0 ? "-INF" : "INF";
    constexpr double smallest = 1e-5;
    constexpr double beyond = 1e17;
    const double magnitude = std::fabs(value);
    const bool plain = value == 0 || (magnitude >= smallest && magnitude < beyond);
    std::array<char, 64> text;
    const auto format = plain ? std::chars_format::fixed : std::chars_format::scientific;
    const auto end = std::to_chars(text.data(), text.data() + text.size(), value, format);
    return std::string_view(text.data(), static_cast<std::size_t>(end.ptr - text.data()));
}

} // namespace qx
