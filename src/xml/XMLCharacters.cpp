#include "xml/XMLCharacters.h"

#include "xml/ByteRuns.h"

#include <algorithm>
#include <iterator>

namespace qx {

namespace {

struct CharacterRange {
    char32_t first;
    char32_t last;
};

// Beyond ASCII, in order.
constexpr CharacterRange nameStarts[] = {{0xC0, 0xD6},     {0xD8, 0xF6},     {0xF8, 0x2FF},
                                         {0x370, 0x37D},   {0x37F, 0x1FFF},  {0x200C, 0x200D},
                                         {0x2070, 0x218F}, {0x2C00, 0x2FEF}, {0x3001, 0xD7FF},
                                         {0xF900, 0xFDCF}, {0xFDF0, 0xFFFD}, {0x10000, 0xEFFFF}};
constexpr CharacterRange nameRests[] = {{0xB7, 0xB7}, {0x300, 0x36F}, {0x203F, 0x2040}};

template <std::size_t N>
bool isIn(const CharacterRange (&ranges)[N], char32_t c) noexcept {
    return std::any_of(std::begin(ranges), std::end(ranges),
                       [c](CharacterRange range) { return c >= range.first && c <= range.last; });
}

bool isNameStart(char32_t c) noexcept {
    if (c < 0x80)
        return (c >= 'a' && c <= 'z') || (c >= 'A' && c <= 'Z') || c == '_' || c == ':';
    return isIn(nameStarts, c);
}

bool isNameCharacter(char32_t c) noexcept {
    if (c < 0x80)
        return isNameStart(c) || (c >= '0' && c <= '9') || c == '-' || c == '.';
    return isNameStart(c) || isIn(nameRests, c);
}

} // namespace

char32_t decodeCharacter(std::string_view text, std::size_t& position) noexcept {
    const auto byteAt = [text](std::size_t at) {
        return static_cast<unsigned>(static_cast<unsigned char>(text[at]));
    };
    const std::size_t start = position++;
    const unsigned lead = byteAt(start);
    if (lead < 0x80)
        return lead;
    const std::size_t length = lead >= 0xF0 ? 4 : lead >= 0xE0 ? 3 : 2;
    if (lead < 0xC2 || lead > 0xF4 || text.size() - start < length)
        return malformedCharacter;
    char32_t c = lead & (0x7FU >> length);
    for (std::size_t i = 1; i < length; ++i) {
        const unsigned next = byteAt(start + i);
        if ((next & 0xC0U) != 0x80U)
            return malformedCharacter;
        c = (c << 6) | (next & 0x3FU);
    }
    constexpr char32_t smallest[] = {0x80, 0x800, 0x10000};
    if (c < smallest[length - 2] || c > 0x10FFFF || (c >= 0xD800 && c <= 0xDFFF))
        return malformedCharacter;
    position = start + length;
    return c;
}

void appendCharacter(char32_t c, std::string& text) {
    const auto add = [&](char32_t byte) { text += static_cast<char>(byte); };
    if (c < 0x80)
        return add(c);
    if (c < 0x800) {
        add(0xC0U | c >> 6U);
    } else {
        if (c < 0x10000) {
            add(0xE0U | c >> 12U);
        } else {
            add(0xF0U | c >> 18U);
            add(0x80U | (c >> 12U & 0x3FU));
        }
        add(0x80U | (c >> 6U & 0x3FU));
    }
    add(0x80U | (c & 0x3FU));
}

std::string referenceTo(char32_t c) {
    switch (c) {
    case '&':
        return "&amp;";
    case '<':
        return "&lt;";
    case '>':
        return "&gt;";
    case '"':
        return "&quot;";
    case '\'':
        return "&apos;";
    default:
        return "&#" + std::to_string(static_cast<std::uint32_t>(c)) + ";";
    }
}

bool isXMLCharacter(char32_t c) noexcept {
    if (c < 0x20)
        return c == '\t' || c == '\n' || c == '\r';
    return c <= 0xD7FF || (c >= 0xE000 && c <= 0xFFFD) || (c >= 0x10000 && c <= 0x10FFFF);
}

bool isXMLText(std::string_view text) noexcept {
    for (std::size_t at = 0; at < text.size();)
        if (!isXMLCharacter(decodeCharacter(text, at)))
            return false;
    return true;
}

bool isXMLName(std::string_view text) noexcept {
    std::size_t at = 0;
    if (text.empty() || !isNameStart(decodeCharacter(text, at)))
        return false;
    while (at < text.size()) {
        const bool isPlain = static_cast<unsigned char>(text[at]) < 0x80 && is(text[at], nameByte);
        if (isPlain)
            ++at;
        else if (!isNameCharacter(decodeCharacter(text, at)))
            return false;
    }
    return true;
}

bool isXMLVersion(std::string_view text) noexcept {
    return text.size() > 2 && text.starts_with("1.") &&
           text.find_first_not_of("0123456789", 2) == std::string_view::npos;
}

} // namespace qx
