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
    text.remove_prefix(std::min(text.find_first_not_of(whiteSpace), text.size()));
    return text;
}
constexpr std::string_view withoutTrailingWhite(std::string_view text) noexcept {
    return text.substr(0, text.find_last_not_of(whiteSpace) + 1);
}
constexpr std::string_view trimmed(std::string_view text) noexcept {
    return withoutTrailingWhite(withoutLeadingWhite(text));
}

} // namespace qx
