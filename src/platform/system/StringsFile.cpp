#include "platform/system/StringsFile.h"

#include <charconv>

namespace qx {

namespace {

class Scanner {
public:
    explicit Scanner(std::string_view text) noexcept : _rest(text) {
        constexpr std::string_view byteOrderMark = "\xEF\xBB\xBF";
        accept(byteOrderMark);
    }

    bool accept(std::string_view token) noexcept {
        if (!_rest.starts_with(token))
            return false;
        _rest.remove_prefix(token.size());
        return true;
    }

    // White space and comments.
    void skipLayout() noexcept {
        while (!_rest.empty()) {
            if (_rest.starts_with("/*"))
                skipBehind("*/", 2);
            else if (_rest.starts_with("//"))
                skipBehind("\n", 2);
            else if (std::string_view(" \t\r\n").find(_rest.front()) != std::string_view::npos)
                _rest.remove_prefix(1);
            else
                return;
        }
    }

    // A text in quotation marks. False when none stands here or it does not end.
    bool quoted(std::string& text) {
        skipLayout();
        if (!accept("\""))
            return false;
        text.clear();
        while (!_rest.empty()) {
            const char c = take();
            if (c == '"')
                return true;
            if (c == '\\' && !_rest.empty())
                escaped(text);
            else
                text += c;
        }
        return false;
    }

private:
    char take() noexcept {
        const char c = _rest.front();
        _rest.remove_prefix(1);
        return c;
    }

    void skipBehind(std::string_view token, std::size_t from) noexcept {
        const std::size_t found = _rest.find(token, from);
        _rest.remove_prefix(found == std::string_view::npos ? _rest.size() : found + token.size());
    }

    void escaped(std::string& text) {
        const char c = take();
        if (c == 'n')
            text += '\n';
        else if (c == 't')
            text += '\t';
        else if ((c == 'U' || c == 'u') && _rest.size() >= 4)
            appendCodePoint(text);
        else
            text += c;
    }

    void appendCodePoint(std::string& text) {
        unsigned point = 0;
        const char* const end = _rest.data() + 4;
        if (std::from_chars(_rest.data(), end, point, 16).ptr != end)
            return;
        _rest.remove_prefix(4);
        if (point < 0x80) {
            text += static_cast<char>(point);
            return;
        }
        if (point < 0x800) {
            text += static_cast<char>(0xC0U | point >> 6U);
        } else {
            text += static_cast<char>(0xE0U | point >> 12U);
            text += static_cast<char>(0x80U | (point >> 6U & 0x3FU));
        }
        text += static_cast<char>(0x80U | (point & 0x3FU));
    }

    std::string_view _rest;
};

} // namespace

Strings parseStrings(std::string_view file) {
    Strings strings;
    Scanner scanner(file);
    std::string key;
    std::string translation;
    const auto punctuation = [&](std::string_view token) {
        scanner.skipLayout();
        return scanner.accept(token);
    };
    while (scanner.quoted(key) && punctuation("=") && scanner.quoted(translation) &&
           punctuation(";"))
        if (!translation.empty())
            strings.insert_or_assign(key, String(translation));
    return strings;
}

} // namespace qx
