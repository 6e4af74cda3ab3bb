#pragma once

// How a document is laid out: what stands before an element on its line, and the habits that what
// is new in it follows: line ends, indentation, quotes, the tags of empty elements.

#include "saving/SourceMarkup.h"

#include <optional>
#include <string>
#include <unordered_map>

namespace qx::detail {

class SourceLayout {
public:
    using Number = SourceMarkup::Number;
    using Offset = SourceMarkup::Offset;

    // Both must outlive this.
    SourceLayout(const XMLIndex& index, const SourceMarkup& markup);

    // The line break and the blanks before a place, where nothing else stands before it on its
    // line; null where something does.
    std::optional<std::string_view> lineStart(Offset place) const;
    // The same for what is to stand inside the element, which has nothing inside yet.
    std::optional<std::string> lineStartInside(Number element) const;
    // Whether white space inside the element is its content: beside other text, and where xml:space
    // says so.
    bool isInline(Number element) const;
    // Whether there are elements inside, and no line ends.
    bool isOnOneLine(Number element) const;
    // Where the comments before an element begin that stand on lines of their own.
    Offset withComments(Offset begin) const;
    // Behind the element and the comments behind it on its line.
    Offset behind(Number entry) const;
    // Whether nothing but a line's or an element's end stands behind the place.
    bool endsLine(Offset place) const;
    // What goes with the element: its line, where it has that to itself.
    std::pair<Offset, Offset> region(Number entry, Offset begin) const;

    // The indentation of one level.
    const std::string& unit() const { return habits().unit; }
    char quote() const { return habits().quote; }
    std::string_view newline() const noexcept { return _newline; }
    // "/>", " />", or nothing where empty elements have an end tag.
    std::string_view emptyTag() const { return habits().emptyTag; }

private:
    // What is found out when something new is to be laid out.
    struct Habits {
        std::string unit = "    ";
        char quote = '"';
        std::string_view emptyTag = "/>";
    };

    const Habits& habits() const {
        if (!_habits)
            _habits = findHabits();
        return *_habits;
    }
    Habits findHabits() const;
    std::optional<std::string_view> findUnit(Number root) const;
    bool hasInlineText(Number element) const;

    const XMLIndex& _index;
    const SourceMarkup& _markup;
    mutable std::unordered_map<Number, bool> _inline, _onOneLine; // what was asked for
    mutable std::optional<Habits> _habits;
    std::string_view _newline = "\n";
};

} // namespace qx::detail
