#include "host/StringsFile.h"

#include "base/Unicode.h"
#include "base/WhiteSpace.h"

#include <algorithm>
#include <charconv>

namespace qx {

namespace {

// Reads tokens. One that fails leaves the place where it was given up; no place is looked at by
// more than a few entries, however many are faulty.
class Scanner {
public:
    explicit Scanner(std::string_view text) noexcept : _text(text), _lineEnd(endOfLine(0)) {}

    bool isAtEnd() const noexcept { return _at == _text.size(); }
    std::size_t position() const noexcept { return _at; }

    // White space and comments. One that does not end is none: it would hide all that follows.
    void skipLayout() noexcept {
        do
            _at = std::min(_text.find_first_not_of(whiteSpace, _at), _text.size());
        while (skipComment());
    }

    bool accept(char c) noexcept {
        skipLayout();
        if (isAtEnd() || _text[_at] != c)
            return false;
        ++_at;
        return true;
    }

    // A text in quotation marks. False when none stands here, it does not end, or it holds what is
    // no character.
    bool quoted(std::string& text) {
        if (!accept('"'))
            return false;
        text.clear();
        bool isSound = true;
        while (!isAtEnd()) {
            const char c = _text[_at++];
            if (c == '"')
                return isSound && unicode::isWellFormed(text);
            if (c == '\\' && !isAtEnd())
                isSound = escaped(text) && isSound;
            else
                text += c;
        }
        return false;
    }

    // To where the next entry may begin after one that began at `start` is faulty: behind its
    // semicolon on the same line, else on the line below. A quotation mark that is missing or too
    // many costs no entry of a further line so.
    void recover(std::size_t start) noexcept {
        const std::size_t from = std::max(start, _behindComment);
        if (_lineEnd < from)
            _lineEnd = endOfLine(from);
        const std::size_t end = skipToSemicolon(_at, _lineEnd);
        _at = end != std::string_view::npos ? end : std::min(_lineEnd + 1, _text.size());
    }

private:
    std::string_view rest() const noexcept { return _text.substr(_at); }
    std::size_t endOfLine(std::size_t from) const noexcept {
        return std::min(_text.find('\n', from), _text.size());
    }

    bool skipComment() noexcept {
        std::size_t end = std::string_view::npos;
        if (rest().starts_with("//")) {
            end = endOfLine(_at);
        } else if (rest().starts_with("/*") && _mayEndComment) {
            end = _text.find("*/", _at + 2);
            _mayEndComment = end != std::string_view::npos;
            end += _mayEndComment ? 2 : 0;
        }
        if (end == std::string_view::npos)
            return false;
        _at = _behindComment = end;
        return true;
    }

    std::size_t skipToSemicolon(std::size_t at, std::size_t end) const noexcept {
        bool isQuoted = false;
        for (; at < end; ++at) {
            if (_text[at] == ';' && !isQuoted)
                return at + 1;
            if (_text[at] == '"')
                isQuoted = !isQuoted;
            else if (_text[at] == '\\')
                ++at;
        }
        return std::string_view::npos;
    }

    bool escaped(std::string& text) {
        constexpr std::string_view letters = "nrt";
        constexpr std::string_view characters = "\n\r\t";
        const char c = _text[_at++];
        if (c == 'U' || c == 'u')
            return escapedUnits(text);
        const std::size_t letter = letters.find(c);
        text += letter != std::string_view::npos ? characters[letter] : c;
        return true;
    }

    // "xxxx" and as many "\\Uxxxx" as follow: two may be one character.
    bool escapedUnits(std::string& text) {
        std::u16string units;
        while (true) {
            const char* const digits = _text.data() + _at;
            unsigned unit = 0;
            if (rest().size() < 4 ||
                std::from_chars(digits, digits + 4, unit, 16).ptr != digits + 4 || unit == 0)
                return false;
            units += static_cast<char16_t>(unit);
            _at += 4;
            if (!rest().starts_with("\\U") && !rest().starts_with("\\u"))
                break;
            _at += 2;
        }
        text += unicode::fromUTF16(units);
        return true;
    }

    std::string_view _text;
    std::size_t _at = 0;
    std::size_t _behindComment = 0;
    std::size_t _lineEnd;       // the first at or behind the last faulty entry
    bool _mayEndComment = true; // false once no "*/" stands in what is left
};

// The text as UTF-8, without a byte-order mark. UTF-16 shows by one, or by the zero byte that is
// half of its first character.
std::string decoded(std::string_view file) {
    if (file.starts_with("\xEF\xBB\xBF"))
        return std::string(file.substr(3));
    if (file.size() < 2)
        return std::string(file);
    const bool hasMark = file.starts_with("\xFF\xFE") || file.starts_with("\xFE\xFF");
    if (!hasMark && file[0] != '\0' && file[1] != '\0')
        return std::string(file);
    const std::size_t high = file[0] == '\0' || file[0] == '\xFE' ? 0 : 1;
    std::u16string units;
    units.reserve(file.size() / 2);
    for (std::size_t i = hasMark ? 2 : 0; i + 1 < file.size(); i += 2)
        units += static_cast<char16_t>(static_cast<unsigned char>(file[i + high]) << 8U |
                                       static_cast<unsigned char>(file[i + 1 - high]));
    return unicode::fromUTF16(units);
}

} // namespace

StringsFile parseStrings(std::string_view file) {
    constexpr std::size_t mostFaults = 10;
    const std::string text = decoded(file);
    StringsFile result;
    Scanner scanner(text);
    std::string key;
    std::string translation;
    std::size_t line = 1;
    std::size_t counted = 0;
    while (scanner.skipLayout(), !scanner.isAtEnd()) {
        const std::size_t start = scanner.position();
        if (scanner.quoted(key) && scanner.accept('=') && scanner.quoted(translation) &&
            scanner.accept(';')) {
            if (!translation.empty())
                result.texts.insert_or_assign(key, String(translation));
            continue;
        }
        if (result.faultyLines.size() < mostFaults) {
            line += static_cast<std::size_t>(
                std::count(text.data() + counted, text.data() + start, '\n'));
            counted = start;
            if (result.faultyLines.empty() || result.faultyLines.back() != line)
                result.faultyLines.push_back(line);
        }
        scanner.recover(start);
    }
    return result;
}

} // namespace qx
