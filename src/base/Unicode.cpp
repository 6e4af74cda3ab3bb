#include "base/Unicode.h"

#include <algorithm>

#include <unicode/brkiter.h>
#include <unicode/locid.h>
#include <unicode/uchar.h>
#include <unicode/unistr.h>
#include <unicode/utf16.h>
#include <unicode/utf8.h>

namespace qx::unicode {

namespace {

bool isASCII(std::string_view text) {
    return std::all_of(text.begin(), text.end(),
                       [](char c) { return static_cast<unsigned char>(c) < 0x80; });
}

char asciiLower(char c) { return c >= 'A' && c <= 'Z' ? static_cast<char>(c + ('a' - 'A')) : c; }

char asciiUpper(char c) { return c >= 'a' && c <= 'z' ? static_cast<char>(c - ('a' - 'A')) : c; }

bool isASCIILetter(char c) { return asciiLower(c) >= 'a' && asciiLower(c) <= 'z'; }

icu::UnicodeString decoded(std::string_view text) {
    return icu::UnicodeString::fromUTF8(
        icu::StringPiece(text.data(), static_cast<std::int32_t>(text.size())));
}

std::string encoded(const icu::UnicodeString& text) {
    std::string result;
    text.toUTF8String(result);
    return result;
}

} // namespace

std::string lowercased(std::string_view text) {
    if (!isASCII(text))
        return encoded(decoded(text).toLower(icu::Locale::getRoot()));
    std::string result(text);
    std::transform(result.begin(), result.end(), result.begin(), asciiLower);
    return result;
}

// A word is a run of letters; what is no letter ends it, so that "first-name" is two words.
std::string capitalized(std::string_view text) {
    std::string result;
    if (isASCII(text)) {
        bool inWord = false;
        for (const char c : text) {
            result += inWord ? asciiLower(c) : asciiUpper(c);
            inWord = isASCIILetter(c);
        }
        return result;
    }
    const icu::UnicodeString source = decoded(text);
    icu::UnicodeString target;
    bool inWord = false;
    for (std::int32_t i = 0; i < source.length(); i = source.moveIndex32(i, 1)) {
        icu::UnicodeString letter(source.char32At(i));
        const bool isLetter = u_isalpha(source.char32At(i)) != 0;
        target += inWord ? letter.toLower(icu::Locale::getRoot())
                         : letter.toTitle(nullptr, icu::Locale::getRoot());
        inWord = isLetter;
    }
    return encoded(target);
}

bool equalIgnoringCase(std::string_view a, std::string_view b) {
    if (isASCII(a) && isASCII(b)) {
        return std::equal(a.begin(), a.end(), b.begin(), b.end(),
                          [](char x, char y) { return asciiLower(x) == asciiLower(y); });
    }
    return decoded(a).caseCompare(decoded(b), U_FOLD_CASE_DEFAULT) == 0;
}

std::size_t endOfCharacters(std::string_view text, std::size_t count) noexcept {
    const auto size = static_cast<std::int32_t>(std::min<std::size_t>(text.size(), INT32_MAX));
    const auto* const bytes = reinterpret_cast<const std::uint8_t*>(text.data());
    std::int32_t end = 0;
    for (UChar32 point = 0; count != 0 && end < size; --count)
        U8_NEXT(bytes, end, size, point);
    return static_cast<std::size_t>(end);
}

std::size_t terminalWidth(std::string_view character) noexcept {
    const auto* const bytes = reinterpret_cast<const std::uint8_t*>(character.data());
    std::int32_t at = 0;
    UChar32 point = 0;
    U8_NEXT(bytes, at, static_cast<std::int32_t>(character.size()), point);
    if (point < 0)
        return 1;
    const std::int8_t kind = u_charType(point);
    if (kind == U_NON_SPACING_MARK || kind == U_ENCLOSING_MARK || kind == U_FORMAT_CHAR)
        return 0;
    const int width = u_getIntPropertyValue(point, UCHAR_EAST_ASIAN_WIDTH);
    return width == U_EA_WIDE || width == U_EA_FULLWIDTH ? 2 : 1;
}

std::string printable(std::string_view text) {
    std::string shown;
    shown.reserve(text.size());
    const auto* const bytes = reinterpret_cast<const std::uint8_t*>(text.data());
    for (std::size_t next = 0, at = 0; at < text.size(); at = next) {
        UChar32 point = 0;
        U8_NEXT(bytes, next, text.size(), point);
        const bool turns =
            (point >= 0x202A && point <= 0x202E) || (point >= 0x2066 && point <= 0x2069);
        if (point < 0 || turns)
            shown += "\uFFFD";
        else if (u_charType(point) == U_CONTROL_CHAR)
            shown += ' ';
        else
            shown += text.substr(at, next - at);
    }
    return shown;
}

bool isWellFormed(std::string_view text) {
    const auto* const bytes = reinterpret_cast<const std::uint8_t*>(text.data());
    for (std::size_t i = 0; i < text.size();) {
        UChar32 point = 0;
        U8_NEXT(bytes, i, text.size(), point);
        if (point < 0)
            return false;
    }
    return true;
}

std::string fromUTF16(std::u16string_view units) {
    std::string text;
    for (std::size_t i = 0; i < units.size();) {
        UChar32 point = 0;
        U16_NEXT_OR_FFFD(units, i, units.size(), point);
        std::uint8_t bytes[U8_MAX_LENGTH];
        std::size_t size = 0;
        U8_APPEND_UNSAFE(bytes, size, point);
        text.append(bytes, bytes + size);
    }
    return text;
}

std::string_view withoutLeadingSpace(std::string_view text) noexcept {
    const auto isPlain = [](char c) { return c > ' ' && c <= '~'; };
    if (!text.empty() && isPlain(text.front()))
        return text;
    const auto* const bytes = reinterpret_cast<const std::uint8_t*>(text.data());
    std::size_t start = 0;
    for (std::size_t next = 0; next < text.size(); start = next) {
        UChar32 c = 0;
        U8_NEXT(bytes, next, text.size(), c);
        if (c < 0 || !u_isUWhiteSpace(c))
            break;
    }
    return text.substr(start);
}

} // namespace qx::unicode
