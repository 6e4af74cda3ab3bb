#include "platform/object/Unicode.h"

#include <algorithm>

#include <unicode/brkiter.h>
#include <unicode/locid.h>
#include <unicode/unistr.h>
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

std::string_view withoutLeadingSpace(std::string_view text) noexcept {
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

} // namespace qx::unicode
