#pragma once

// Line and column of places in a text, both 1-based, a column being one code point. Going from
// place to place looks at each byte of the way once; going back, at a few thousand at most, however
// long the lines are.

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace qx {

// Where a text that is one piece of a document begins in it. What was put before the piece, to make
// it a document, stands at that place as a whole.
struct TextOrigin {
    std::size_t added = 0; // bytes before the piece: a prologue, and start tags
    std::size_t prologue = 0;
    std::size_t line = 1;
    std::size_t column = 1;
    std::vector<std::size_t> tagLines; // of the tags among what was added
    // The elements that the pieces are cut behind, and how many of them stand before the piece in
    // the elements of those tags; empty where their name is not known.
    std::string itemName;
    std::vector<std::size_t> tagItems;
};

class TextPosition {
public:
    // The text must outlive the position, which starts at its first character.
    explicit TextPosition(std::string_view text, const TextOrigin& origin = {}) noexcept
        : _text(text.substr(origin.added)),
          _added(origin.added), _start{0, origin.line, origin.column}, _at(_start) {}

    void moveTo(std::size_t offset);

    std::size_t line() const noexcept { return _at.line; }
    std::size_t column() const noexcept { return _at.column; }

private:
    struct Place {
        std::size_t offset = 0;
        std::size_t line = 1;
        std::size_t column = 1;
    };
    static constexpr std::size_t blockSize = 4096;

    void advance(std::size_t offset) noexcept;

    std::string_view _text;
    const std::size_t _added;
    const Place _start;
    Place _at;
    std::vector<Place> _passed; // one for each block of the text: where the block ends
};

} // namespace qx
