#pragma once

// How much a document declares in its DOCTYPE. The C parser's work grows faster than the number of
// declarations, of names in one, and of references to parameter entities; so all that it reads
// there, with what those entities bring in, is bounded.

#include <string_view>

namespace qx {

class InternalSubset {
public:
    explicit InternalSubset(std::size_t limit) noexcept : _limit(limit) {}

    // The document from the bracket that opens the subset; without one there is none. Throws
    // ParseFailure for a subset beyond the limit.
    void read(std::string_view text);
    // A parameter entity brings in more. Throws likewise.
    void expand(std::size_t bytes);

private:
    std::size_t _limit;
    std::size_t _size = 0;
};

} // namespace qx
