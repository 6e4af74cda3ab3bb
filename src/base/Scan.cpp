#include "base/Scan.h"

#include "base/Unicode.h"

#include <charconv>
#include <cmath>
#include <cstdlib>

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

namespace {

// A number with up to three decimals, without the zeros at their end; null where it has more. Such
// a text is the shortest: no two numbers of at most 15 digits are the same real.
char* describeDecimal(double value, RealText& text) {
    constexpr double beyond = 1e12;
    if (!(std::fabs(value) < beyond))
        return nullptr;
    const auto thousandths = static_cast<std::int64_t>(value * 1000 + (value < 0 ? -0.5 : 0.5));
    if (thousandths == 0 || static_cast<double>(thousandths) / 1000 != value)
        return nullptr;
    char* at = text.data();
    if (thousandths < 0)
        *at++ = '-';
    const std::int64_t magnitude = std::abs(thousandths);
    at = std::to_chars(at, text.data() + text.size(), magnitude / 1000).ptr;
    std::int64_t rest = magnitude % 1000;
    if (rest != 0)
        *at++ = '.';
    for (; rest != 0; rest = rest % 100 * 10)
        *at++ = static_cast<char>('0' + rest / 100);
    return at;
}

} // namespace

std::string_view describeReal(double value, RealText& text) {
    if (std::isnan(value))
        return "NaN";
    if (std::isinf(value))
        return value < 0 ? "-INF" : "INF";
    if (const char* const end = describeDecimal(value, text))
        return {text.data(), end};
    constexpr double smallest = 1e-5;
    constexpr double beyond = 1e17;
    const double magnitude = std::fabs(value);
    const bool plain = value == 0 || (magnitude >= smallest && magnitude < beyond);
    const auto format = plain ? std::chars_format::fixed : std::chars_format::scientific;
    const auto end = std::to_chars(text.data(), text.data() + text.size(), value, format);
    return {text.data(), end.ptr};
}

String describeReal(double value) {
    RealText text;
    return describeReal(value, text);
}

} // namespace qx
