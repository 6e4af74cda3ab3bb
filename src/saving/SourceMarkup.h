#pragma once

// Where each entry of an index stands in the document's text, with its name, quotes and tags:
//
//     <a x="1">hi<b/></a>           entry        begin  insideBegin  insideEnd  end
//     0         1                   element a        0            9         15   19
//     0123456789012345678           attribute x      3            6          7    8
//                                   text             9            9         11   11
//                                   element b       11           15         15   15
//
// An index that the scanner filled has most of that, and its entries are all the text's own: a spot
// is worked out when somebody asks. One that the C parser filled does not tell it. So the text,
// which is known to be well formed, is gone over once and laid beside the index. What an entity or
// an attribute's default brought in has no place; nor has anything inside an element of which a
// child came in so.

#include "xml/XMLIndex.h"

#include <vector>

namespace qx::detail {

class SourceMarkup {
public:
    using Number = XMLIndex::Number; // of an entry
    using Offset = std::uint32_t;
    static constexpr Offset none = UINT32_MAX;

    struct Spot {
        Offset begin = none, end = none;
        Offset insideBegin = none, insideEnd = none;
        bool isPlaced() const noexcept { return begin != none; }
        bool isEmptyTag() const noexcept { return insideBegin == end; } // <a/>
        Offset size() const noexcept { return end - begin; }
    };

    // Of a parsed document; the index must outlive this.
    explicit SourceMarkup(const XMLIndex& index);

    std::string_view text() const noexcept { return _index.text(); }
    Spot operator[](Number entry) const noexcept {
        return _isScanned ? scannedSpot(entry) : _spots[entry];
    }
    // The element that an entry stands in; none of the root.
    Number parent(Number entry) const {
        if (_parents.empty())
            findParents();
        return _parents[entry];
    }
    std::string_view raw(Number entry) const noexcept {
        const Spot spot = (*this)[entry];
        return text().substr(spot.begin, spot.size());
    }

private:
    // A part of the text: an element, a run of text, a comment or an instruction.
    struct Token {
        XMLNodeKind kind;
        Spot spot;
        std::uint32_t next = 0; // the token after everything inside
        std::uint32_t attributes = 0, attributesEnd = 0;
    };
    struct Attribute {
        Spot spot;
        std::string_view name;
    };

    Spot scannedSpot(Number entry) const noexcept;
    Spot scannedElement(Number element) const noexcept;
    void findParents() const;
    void tokenise();
    std::size_t skipProlog() const;
    std::size_t startTag(std::size_t at);
    void add(XMLNodeKind kind, std::size_t begin, std::size_t end);
    std::string_view nameAt(std::size_t begin) const;
    void place();
    void placeAttributes(Number element, const Token& token);
    void placeChildren(Number element, std::uint32_t token);

    const XMLIndex& _index;
    bool _isScanned = false;
    std::vector<Spot> _spots;             // of an index that the C parser filled
    mutable std::vector<Number> _parents; // once they are asked for
    std::vector<Token> _tokens;
    std::vector<Attribute> _attributes;
    std::vector<std::uint32_t> _open; // tokens of elements
    // Of an entry and a token: elements that are still to be gone into, and what else an element
    // has.
    std::vector<std::pair<Number, std::uint32_t>> _pairs, _leaves;
};

} // namespace qx::detail
