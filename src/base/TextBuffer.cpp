#include "base/TextBuffer.h"

#include "base/BulkArray.h"

#include <algorithm>

namespace qx {

namespace {

constexpr std::size_t firstCapacity = 240;

} // namespace

TextBuffer::~TextBuffer() {
    if (_rep != nullptr)
        String::destroy(_rep);
}

// Large memory is moved by changing its addresses, so that doubling it copies nothing.
void TextBuffer::grow(std::size_t count) {
    const std::size_t capacity = std::max({firstCapacity, _size + count, 2 * _capacity});
    _rep = String::resized(_rep, capacity);
    askForLargePages(_rep, sizeof *_rep + capacity);
    _capacity = capacity;
}

String TextBuffer::take() {
    if (_size == 0)
        return std::string_view();
    String::Rep* const rep = String::resized(_rep, _size);
    _rep = nullptr;
    _size = _capacity = 0;
    return String(rep);
}

} // namespace qx
