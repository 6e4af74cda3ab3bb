#pragma once

// Which characters XML 1.0 allows, and where.

#include <cstddef>
#include <cstring>
#include <string>
#include <string_view>

namespace qx {

// What decodeCharacter answers for bytes that are no UTF-8.
constexpr char32_t malformedCharacter = 0xFFFFFFFF;

// The code point at `position`, which moves behind it (by one byte for malformed ones). The
// position must lie inside the text.
char32_t decodeCharacter(std::string_view text, std::size_t& position) noexcept;

// Adds the code point in UTF-8.
void appendCharacter(char32_t c, std::string& text);

// Space, tab, line feed and carriage return.
constexpr bool isWhite(char c) noexcept { return c == ' ' || c == '\n' || c == '\t' || c == '\r'; }
// Layout is blanks for the most part: those are looked at four at a time.
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

bool isXMLCharacter(char32_t c) noexcept;
// UTF-8 whose every character XML allows in some place of a document.
bool isXMLText(std::string_view text) noexcept;
// A name of an element, an attribute or a target, colons included.
bool isXMLName(std::string_view text) noexcept;
// "1." and digits.
bool isXMLVersion(std::string_view text) noexcept;

} // namespace qx
