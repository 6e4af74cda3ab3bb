#include <QXXMLMarshalling/model/Format.h>

#include <algorithm>
#include <optional>

namespace qx {

namespace {

// One directive: %[position$][0][width][length]conversion
struct Directive {
    std::size_t position = 0; // 1-based; 0: the next one
    bool zeros = false;
    std::size_t width = 0;
    char conversion = '\0';
    std::size_t length = 0; // of the directive's own text, percent sign included
};

constexpr std::size_t widestField = 64;

std::size_t readNumber(std::string_view text, std::size_t& at) {
    std::size_t number = 0;
    for (; at < text.size() && text[at] >= '0' && text[at] <= '9'; ++at)
        number =
            std::min<std::size_t>(number * 10 + static_cast<std::size_t>(text[at] - '0'), 1000000);
    return number;
}

// `text` begins with a percent sign.
std::optional<Directive> readDirective(std::string_view text) {
    Directive directive;
    std::size_t at = 1;
    const std::size_t digits = at;
    const std::size_t number = readNumber(text, at);
    if (at > digits && at < text.size() && text[at] == '$') {
        if (number == 0)
            return std::nullopt;
        directive.position = number;
        ++at;
        directive.zeros = at < text.size() && text[at] == '0';
        directive.width = readNumber(text, at);
    } else {
        directive.zeros = at > digits && text[digits] == '0';
        directive.width = number;
    }
    while (at < text.size() && (text[at] == 'l' || text[at] == 'q'))
        ++at;
    if (at >= text.size())
        return std::nullopt;
    directive.conversion = text[at];
    directive.width = std::min(directive.width, widestField);
    directive.length = at + 1;
    return directive;
}

std::string hexadecimal(std::uint64_t number, bool capitals) {
    const char* digits = capitals ? "0123456789ABCDEF" : "0123456789abcdef";
    std::string text;
    do {
        text.insert(text.begin(), digits[number & 0xF]);
        number >>= 4;
    } while (number != 0);
    return text;
}

std::optional<std::string> converted(const Directive& directive, const Value& value) {
    switch (directive.conversion) {
    case '@':
    case 's':
        return value.description().str();
    case 'd':
    case 'i':
        return std::to_string(value.intValue());
    case 'u':
        return std::to_string(static_cast<std::uint64_t>(value.intValue()));
    case 'x':
    case 'X':
        return hexadecimal(static_cast<std::uint64_t>(value.intValue()),
                           directive.conversion == 'X');
    default:
        return std::nullopt;
    }
}

} // namespace

String format(std::string_view format, std::span<const Value> arguments) {
    std::string result;
    std::size_t next = 0;
    while (!format.empty()) {
        const std::size_t percent = std::min(format.find('%'), format.size());
        result += format.substr(0, percent);
        format.remove_prefix(percent);
        if (format.empty())
            break;
        if (format.starts_with("%%")) {
            result += '%';
            format.remove_prefix(2);
            continue;
        }
        const auto directive = readDirective(format);
        const std::size_t index =
            directive ? (directive->position != 0 ? directive->position - 1 : next) : 0;
        std::optional<std::string> text;
        if (directive && index < arguments.size())
            text = converted(*directive, arguments[index]);
        if (!text) {
            result += '%';
            format.remove_prefix(1);
            continue;
        }
        if (directive->position == 0)
            ++next;
        if (text->size() < directive->width)
            text->insert(0, directive->width - text->size(), directive->zeros ? '0' : ' ');
        result += *text;
        format.remove_prefix(directive->length);
    }
    return result;
}

} // namespace qx
