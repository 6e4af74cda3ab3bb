#pragma once

// Line and column of places in a text, both 1-based, a column being one code point. Going from
// place to place looks at each byte of the way once; going back, at a few thousand at most, however
// long the lines are.

#include <cstddef>
#include <string_view>
#include <vector>

namespace qx {

class TextPosition {
public:
    // The text must outlive the position, which starts at its first character.
    explicit TextPosition(std::string_view text) noexcept : _text(text) {}

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
    Place _at;
    std::vector<Place> _passed; // one for each block of the text: where the block ends
};

} // namespace qx
