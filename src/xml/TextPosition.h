#pragma once

// Line and column of places in a text, both 1-based, a column being one code point. Going forward
// from place to place looks at each byte once, however long the lines are.

#include <cstddef>
#include <cstdint>
#include <string_view>

namespace qx {

class TextPosition {
public:
    // The text must outlive the position, which starts at its first character.
    explicit TextPosition(std::string_view text) noexcept : _text(text) {}

    // Moves to the byte offset; going back starts over at the first line.
    void moveTo(std::size_t offset) noexcept;

    std::size_t line() const noexcept { return _line; }
    std::size_t column() const noexcept { return _column; }

private:
    std::string_view _text;
    std::size_t _offset = 0;
    std::size_t _line = 1;
    std::size_t _column = 1;
};

} // namespace qx
