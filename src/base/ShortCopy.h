#pragma once

// Copies of a few bytes, for which a call would cost more than the copy.

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace qx {

inline void copyShort(const char* from, std::size_t size, char* to) noexcept {
    // The ends overlap.
    const auto copyEnds = [&]<class Word>(Word first, Word last) {
        std::memcpy(&first, from, sizeof(Word));
        std::memcpy(&last, from + size - sizeof(Word), sizeof(Word));
        std::memcpy(to, &first, sizeof(Word));
        std::memcpy(to + size - sizeof(Word), &last, sizeof(Word));
    };
    if (size > 2 * sizeof(std::uint64_t))
        std::memcpy(to, from, size);
    else if (size >= sizeof(std::uint64_t))
        copyEnds(std::uint64_t{}, std::uint64_t{});
    else if (size >= sizeof(std::uint32_t))
        copyEnds(std::uint32_t{}, std::uint32_t{});
    else
        for (std::size_t i = 0; i < size; ++i)
            to[i] = from[i];
}

} // namespace qx
