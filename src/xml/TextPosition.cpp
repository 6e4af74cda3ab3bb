#include "xml/TextPosition.h"

#include "xml/ByteRuns.h"

#include <algorithm>
#include <cstdint>
#include <cstring>

namespace qx {

namespace {

// Bytes that are no continuation of a UTF-8 sequence, eight at a time.
std::size_t countCodePoints(const char* from, const char* to) noexcept {
    auto count = static_cast<std::size_t>(to - from);
    constexpr std::uint64_t lowBits = 0x0101010101010101U;
    for (; to - from >= 8; from += 8) {
        std::uint64_t word = 0;
        std::memcpy(&word, from, 8);
        const std::uint64_t continuations = (word >> 7) & ~(word >> 6) & lowBits;
        count -= static_cast<std::size_t>((continuations * lowBits) >> 56); // adds the bytes up
    }
    for (; from != to; ++from)
        count -= (static_cast<unsigned char>(*from) & 0xC0U) == 0x80U;
    return count;
}

} // namespace

void TextPosition::moveTo(std::size_t offset) {
    offset = std::min(offset - std::min(offset, _added), _text.size());
    if (offset < _at.offset) {
        const std::size_t passed = offset / blockSize;
        _at = passed != 0 ? _passed[passed - 1] : _start;
    }
    for (std::size_t end = 0; (end = (_at.offset / blockSize + 1) * blockSize) <= offset;) {
        advance(end);
        if (_passed.size() < end / blockSize)
            _passed.push_back(_at);
    }
    advance(offset);
}

void TextPosition::advance(std::size_t offset) noexcept {
    const char* from = _text.data() + _at.offset;
    const char* const to = _text.data() + offset;
    _at.offset = offset;
    if (const std::size_t lines = countOf('\n', from, to); lines != 0) {
        _at.line += lines;
        _at.column = 1;
        from = to;
        while (from[-1] != '\n')
            --from;
    }
    _at.column += countCodePoints(from, to);
}

} // namespace qx
