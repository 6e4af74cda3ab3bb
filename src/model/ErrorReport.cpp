// An error as a few lines for people.

#include <QXXMLMarshalling/model/Error.h>
#include <QXXMLMarshalling/model/Format.h>

#include "base/Unicode.h"
#include "base/WhiteSpace.h"
#include "model/ErrorDetails.h"
#include "model/Localizer.h"

#include <algorithm>

namespace qx {

namespace {

using detail::ErrorDetails;

// Of an argument in a message: some 120 characters, on one line.
constexpr std::size_t longestArgument = 120;
// Of a source line, in columns of a terminal; and how many of them stand before the marked one.
constexpr std::size_t widestLine = 76;
constexpr std::size_t mostBefore = 50;
constexpr std::size_t tabWidth = 4;

Value shortened(const Value& argument) {
    if (!argument.isString() && !argument.isObject())
        return argument;
    const std::string text = unicode::printable(argument.description().view());
    const std::size_t end = unicode::endOfCharacters(text, longestArgument);
    return end == text.size() ? text : text.substr(0, end) + "...";
}

// What one character takes on the screen.
struct Cell {
    std::string text;
    std::size_t width;
};

// The characters of a line as a terminal shows them, with blanks for tabs; `marked`
// becomes the cell of that column of the line.
std::vector<Cell> cellsOf(std::string_view line, std::size_t column, std::size_t& marked) {
    std::vector<Cell> cells;
    std::size_t at = 0; // the column of the screen
    for (std::size_t number = 1; !line.empty(); ++number) {
        if (number == column)
            marked = cells.size();
        const std::size_t size = unicode::endOfCharacters(line, 1);
        if (line.front() == '\t') {
            const std::size_t blanks = tabWidth - at % tabWidth;
            cells.insert(cells.end(), blanks, {" ", 1});
            at += blanks;
        } else {
            std::string character = unicode::printable(line.substr(0, size));
            const std::size_t width = unicode::terminalWidth(character);
            cells.push_back({std::move(character), width});
            at += width;
        }
        line.remove_prefix(size);
        if (number < column)
            marked = cells.size();
    }
    return cells;
}

// The line, cut around the marked place where it is long, and the mark below it.
std::string marked(const detail::SourcePlace& source, std::string_view before,
                   std::string_view behind) {
    constexpr std::string_view cut = "...";
    std::size_t mark = 0;
    const auto cells = cellsOf(source.excerpt.view(), source.excerptColumn, mark);
    std::size_t first = mark;
    std::size_t blanks = 0;
    for (; first > 0 && blanks + cells[first - 1].width <= mostBefore; --first)
        blanks += cells[first - 1].width;
    std::string line = first != 0 ? std::string(cut) : "";
    blanks += line.size();
    std::size_t width = 0;
    std::size_t last = first;
    for (; last < cells.size() && width + cells[last].width <= widestLine; ++last) {
        line += cells[last].text;
        width += cells[last].width;
    }
    if (last != cells.size())
        line += cut;
    return "\n    " + line + "\n    " + std::string(blanks, ' ') + std::string(before) + "^" +
           std::string(behind);
}

std::string written(const DocumentPlace& place) {
    std::string text =
        unicode::printable(place.documentName.isNull() ? "" : place.documentName.view());
    if (place.line != 0)
        text += (text.empty() ? "" : ":") + std::to_string(place.line) + ":" +
                std::to_string(place.column);
    return text;
}

std::string placeLine(const detail::SourcePlace& source) {
    std::string line = written(source.place);
    if (!source.path.isEmpty())
        line += (line.empty() ? "" : " ") + unicode::printable(source.path.view());
    return line.empty() ? line : "\n  at " + line;
}

std::string mappingLines(const detail::MappingNote& mapping) {
    std::string line = written(mapping.place);
    const auto add = [&line](const char* separator, const char* kind, const String& name) {
        if (!name.isEmpty())
            line += (line.empty() ? "" : separator) + std::string(kind) + " \"" +
                    unicode::printable(name.view()) + "\"";
    };
    add(", ", "field", mapping.field);
    add(mapping.field.isEmpty() ? ", " : " of ", "class", mapping.className);
    if (line.empty())
        return line;
    line.insert(0, "\n  by ");
    for (const DocumentPlace& include : mapping.includes)
        line += "\n    included by " + written(include);
    return line;
}

} // namespace

String Error::shortDescription() const {
    if (_text == nullptr)
        return unicode::printable(_message.view());
    std::vector<Value> arguments;
    std::ranges::transform(_arguments, std::back_inserter(arguments), shortened);
    return unicode::printable(qx::format(localizedText(_text->message), arguments).view());
}

String Error::report(Style style) const {
    const bool isColoured = style == Style::coloured;
    const std::string_view strong = isColoured ? "\033[1m" : "";
    const std::string_view red = isColoured ? "\033[31m" : "";
    const std::string_view normal = isColoured ? "\033[0m" : "";
    const detail::ErrorContext& context = ErrorDetails::contextOf(*this);
    const detail::SourcePlace source = context.source();
    std::string text;
    text.append(strong).append(shortDescription().view()).append(normal);
    text += placeLine(source);
    if (!source.excerpt.isNull() && !isWhite(source.excerpt.view()))
        text += marked(source, red, normal);
    text += mappingLines(context.mapping());
    if (const String suggestion = context.suggestion(); !suggestion.isEmpty())
        text.append("\n  ")
            .append(strong)
            .append(unicode::printable(suggestion.view()))
            .append(normal);
    return text;
}

} // namespace qx
