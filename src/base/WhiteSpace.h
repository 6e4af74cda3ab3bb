#pragma once

// The white space of XML: space, tab, line feed and carriage return.

#include <algorithm>
#include <cstring>
#include <string_view>

namespace qx {

constexpr std::string_view whiteSpace = " \t\r\n";

constexpr bool isWhite(char c) noexcept { return c == ' ' || c == '\n' || c == '\t' || c == '\r'; }

// Whether nothing else is there. Layout is blanks for the most part: those are looked at four at a
// time.
inline bool isWhite(std::string_view text) noexcept {
    const char* at = text.data();
    const char* const end = at + text.size();
    while (at != end) {
        if (end - at >= 4 && std::memcmp(at, "    ", 4) == 0)
            at += 4;
        else if (isWhite(*at))
            ++at;
        else
            return false;
    }
    return true;
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
