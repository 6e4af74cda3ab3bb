#pragma once

// Finds where a document can be cut, so that each piece, with the tags that are open around it, is
// a document of its own. It goes over the text tag by tag, inside an item only over those of its
// name, and checks next to nothing: whoever parses the pieces finds the faults. A document can be
// cut behind
//
// 1. a start tag, an end tag, a text, a comment or an instruction outside of the items: elements of
//    one name that stand in no other of that name,
// 2. an item as a whole.
//
// The same text is shown again, longer, until there is a cut; what was looked at is not looked at
// again.

#include <QXXMLMarshalling/base/String.h>

#include "xml/XMLIndex.h"

#include <algorithm>
#include <string>
#include <vector>

namespace qx {

class XMLSplitter {
public:
    static constexpr std::size_t none = std::string_view::npos;

    // Items are matched by their names as written, or, where the prefixes that a document writes
    // are not known, by what stands behind these: then there are more.
    enum class Match : std::uint8_t { names, localNames };
    XMLSplitter(String itemName, Match match);

    // Goes on until a cut at `enough` bytes or more, or as far as whole tags reach. Always shown
    // with what it was shown before, from the last removal on. Part of a text that a zero byte
    // follows.
    void goOver(std::string_view text, std::size_t enough);
    // The last place found where the text can be cut; 0 where there is none.
    std::size_t cut() const noexcept { return _cut; }
    // How many items end before it.
    std::size_t itemCount() const noexcept { return _itemCount; }
    // Up to where it came: inside what begins there the text ends.
    std::size_t position() const noexcept { return _at; }
    // The text does not go on as a document could.
    bool isFaulty() const noexcept { return _isFaulty; }
    // Where the text up to the cut goes.
    void removeUpToCut();

    // What makes a document of the text that follows the cut, before and behind it: the prologue
    // and the start tags, and the end tags.
    std::string opening() const;
    std::string closing() const;
    std::size_t prologueSize() const noexcept { return _prologue.size(); }
    // How many tags are open, and where those begin that have come since the last removal, in the
    // text; none of others.
    std::size_t openCount() const noexcept { return _open.size(); }
    std::size_t placeOfOpen(std::size_t i) const noexcept { return _open[i].place; }
    bool hasRootEnded() const noexcept { return !_root.empty(); }
    // How many items have ended in the element of that tag; 0 where their name is not known.
    std::size_t itemsInOpen(std::size_t i) const noexcept { return _open[i].items; }
    std::string_view itemName() const noexcept {
        return _match == Match::names ? _itemName.view() : std::string_view();
    }

private:
    struct Open {
        std::string tag; // the start tag, of its attributes those that hold inside
        std::size_t nameSize;
        std::size_t place;
        std::size_t items = 0;
        std::string_view name() const noexcept { return std::string_view(tag).substr(1, nameSize); }
    };
    // Where something ends; none where the text ends before.
    using End = std::size_t;

    bool goOverNext();
    void goOverItem();
    std::string_view nameAt(std::size_t begin) const noexcept;
    bool goOverDeclaration();
    bool goOverInstruction();
    bool goOverStartTag();
    bool goOverEndTag();
    bool endElement(End end);
    End behind(std::string_view mark, std::size_t from) const;
    std::size_t nextMark(std::size_t from) const noexcept;
    End endOfTag();
    End endOfDoctype() const;
    static std::string reopened(std::string_view tag, std::size_t nameSize);
    std::string noItem() const;
    bool pass(End end);
    bool fail();
    // Where to go on with what begins at _at, of which so much is a start.
    std::size_t resume(std::size_t start) const noexcept { return std::max(_at + start, _seen); }

    bool isItemName(std::string_view name) const noexcept;

    Match _match;
    String _itemName;
    char _itemStart;
    std::string_view _text;
    std::size_t _at = 0;
    std::size_t _seen = 0; // up to here what begins at _at does not end
    char _quote = 0;       // that is open there, in a tag
    std::size_t _cut = 0;
    std::size_t _itemCount = 0;
    std::size_t _depth = 0; // of elements of its name in an item, itself among them
    bool _isFaulty = false;
    std::string _prologue; // the declaration and the DOCTYPE
    std::vector<Open> _open;
    std::string _root; // an empty element in its place, once it has ended
};

} // namespace qx
