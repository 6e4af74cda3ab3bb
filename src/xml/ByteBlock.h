#pragma once

// Sixteen bytes of a text, looked at together. Where the processor has no instructions for that,
// `isAvailable` says so, and whoever scans goes byte by byte, as near the end of a text.

#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

namespace qx {

// A bit for each byte, the first one lowest.
using ByteMask = std::uint32_t;

#if defined(__SSE2__)

class ByteBlock {
public:
    static constexpr std::size_t size = 16;
    static constexpr bool isAvailable = true;

    // As many bytes are there.
    explicit ByteBlock(const char* at) noexcept
        : _bytes(_mm_loadu_si128(reinterpret_cast<const __m128i*>(at))) {}

    ByteMask equal(char c) const noexcept {
        return maskOf(_mm_cmpeq_epi8(_bytes, _mm_set1_epi8(c)));
    }
    // Control characters, and what is beyond ASCII.
    ByteMask unusual() const noexcept {
        return maskOf(_mm_cmplt_epi8(_bytes, _mm_set1_epi8(' ')));
    }
    // Blanks and control characters.
    ByteMask upToBlank() const noexcept {
        return maskOf(_mm_cmpeq_epi8(_mm_min_epu8(_bytes, _mm_set1_epi8(' ')), _bytes));
    }
    // The first bytes, zeros behind them, as two words.
    struct Words {
        std::uint64_t first = 0;
        std::uint64_t second = 0;
        bool operator==(const Words&) const = default;
    };
    Words firstBytes(std::size_t count) const noexcept {
        alignas(16) static constexpr std::uint8_t ones[2 * size] = {
            255, 255, 255, 255, 255, 255, 255, 255, 255, 255, 255, 255, 255, 255, 255, 255};
        const __m128i kept = _mm_and_si128(
            _bytes, _mm_loadu_si128(reinterpret_cast<const __m128i*>(ones + size - count)));
        return {static_cast<std::uint64_t>(_mm_cvtsi128_si64(kept)),
                static_cast<std::uint64_t>(_mm_cvtsi128_si64(_mm_unpackhi_epi64(kept, kept)))};
    }

private:
    static ByteMask maskOf(__m128i bytes) noexcept {
        return static_cast<ByteMask>(_mm_movemask_epi8(bytes));
    }

    __m128i _bytes;
};

#else
