#pragma once

// The white space of XML: space, tab, line feed and carriage return.

#include <algorithm>
#include <string_view>

namespace qx {

constexpr std::string_view whiteSpace = " \t\r\n";

constexpr bool isWhite(char c) noexcept { return c == ' ' || c == '\n' || c == '\t' || c == '\r'; }

// Whether nothing else is there.
inline bool isWhite(std::string_view text) noexcept {
    return std::all_of(text.begin(), text.end(), [](char c) { return isWhite(c); });
}

constexpr std::string_view withoutLeadingWhite(std::string_view text) noexcept {
    while (!text.empty() && isWhite(text.front()))
        text.remove_prefix(1);
    return text;
}
constexpr std::string_view withoutTrailingWhite(std::string_view text) noexcept {
    while (!text.empty() && isWhite(text.back()))
        text.remove_suffix(1);
    return text;
}
constexpr std::string_view trimmed(std::string_view text) noexcept {
    return withoutTrailingWhite(withoutLeadingWhite(text));
}

} // namespace qx
