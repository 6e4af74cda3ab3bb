#pragma once

// Where runs of bytes of one kind end, sixteen bytes at a time where the processor can look at as
// many together. A zero byte stands at `end`, and is of no kind: every run ends there at the
// latest.

#include <algorithm>
#include <array>
#include <bit>
#include <cstddef>
#include <cstdint>
#include <cstring>

#if defined(__SSE2__)
#include <emmintrin.h>
#endif

namespace qx {

// What a byte may be part of. Bytes beyond ASCII count as parts of names: a name is looked at in
// full when it is new.
enum ByteKind : std::uint8_t {
    whiteByte = 1,
    nameByte = 2,
    textByte = 4,      // plain in text
    attributeByte = 8, // plain in an attribute's value
    markupByte = 16,   // plain in comments, instructions and CDATA
    blankByte = 32,    // white, and no carriage return
    tagByte = 64,      // no quote in a tag, and not where it begins or ends
    writtenByte = 128, // written as it is, in texts and values alike
};

inline constexpr std::array<std::uint8_t, 256> byteKinds = [] {
    std::array<std::uint8_t, 256> kinds{};
    for (unsigned c = 0x20; c < 0x80; ++c)
        kinds[c] = textByte | attributeByte | markupByte;
    for (const unsigned char c : {' ', '\t', '\n', '\r'})
        kinds[c] |= c == '\r' ? whiteByte : whiteByte | blankByte;
    kinds['\t'] |= textByte | markupByte;
    kinds['\n'] |= textByte | markupByte;
    for (const unsigned char c : {'<', '&', ']'})
        kinds[c] &= static_cast<std::uint8_t>(~textByte);
    for (const unsigned char c : {'<', '&', '"', '\''})
        kinds[c] &= static_cast<std::uint8_t>(~attributeByte);
    for (const unsigned char c : {'-', '?', ']'})
        kinds[c] &= static_cast<std::uint8_t>(~markupByte);
    for (unsigned c = 'a'; c <= 'z'; ++c)
        kinds[c] |= nameByte;
    for (unsigned c = 'A'; c <= 'Z'; ++c)
        kinds[c] |= nameByte;
    for (unsigned c = '0'; c <= '9'; ++c)
        kinds[c] |= nameByte;
    for (const unsigned char c : {'-', '.', '_', ':'})
        kinds[c] |= nameByte;
    for (unsigned c = 0x80; c < 0x100; ++c)
        kinds[c] = nameByte;
    for (unsigned c = 0x20; c < 0x80; ++c)
        kinds[c] |= c == '<' || c == '>' || c == '&' || c == '"' ? 0 : writtenByte;
    for (unsigned c = 1; c < 0x100; ++c)
        kinds[c] |= c == '"' || c == '\'' || c == '<' || c == '>' ? 0 : tagByte;
    return kinds;
}();

inline bool is(char c, std::uint8_t kinds) noexcept {
    return (byteKinds[static_cast<unsigned char>(c)] & kinds) != 0;
}

#if defined(__SSE2__)

// Sixteen bytes.
class ByteBlock {
public:
    static constexpr std::size_t size = 16;

    static bool fits(const char* at, const char* end) noexcept {
        return end - at >= static_cast<std::ptrdiff_t>(size);
    }
    explicit ByteBlock(const char* at) noexcept
        : _bytes(_mm_loadu_si128(reinterpret_cast<const __m128i*>(at))) {}
    // Eight bytes, zeros behind them.
    static ByteBlock half(const char* at) noexcept {
        return ByteBlock(_mm_loadl_epi64(reinterpret_cast<const __m128i*>(at)));
    }

    // The bytes of two such halves, or four from each of two places and zeros behind them.
    static ByteBlock halves(const char* lower, const char* upper) noexcept {
        return ByteBlock(_mm_unpacklo_epi64(half(lower)._bytes, half(upper)._bytes));
    }
    static ByteBlock quarters(const char* lower, const char* upper) noexcept {
        int words[2];
        std::memcpy(&words[0], lower, sizeof words[0]);
        std::memcpy(&words[1], upper, sizeof words[1]);
        return ByteBlock(
            _mm_unpacklo_epi32(_mm_cvtsi32_si128(words[0]), _mm_cvtsi32_si128(words[1])));
    }
    void store(char* to) const noexcept {
        _mm_storeu_si128(reinterpret_cast<__m128i*>(to), _bytes);
    }

    // How many bytes from the first on are of the kind, or fewer, where the next one may be, too.
    template <ByteKind kind>
    std::size_t run() const noexcept {
        return firstIn(stops<kind>());
    }
    // How many come before what ends a name: a blank or a control character, "/", "=" or ">".
    std::size_t untilNameEnds() const noexcept {
        return firstIn(_mm_or_si128(
            _mm_or_si128(equal('/'), equal('=')),
            _mm_or_si128(equal('>'),
                         _mm_cmpeq_epi8(_mm_min_epu8(_bytes, _mm_set1_epi8(' ')), _bytes))));
    }
    // How many of them are that one.
    std::size_t count(char c) const noexcept {
        const __m128i ones = _mm_and_si128(equal(c), _mm_set1_epi8(1));
        const ByteBlock sums(_mm_sad_epu8(ones, _mm_setzero_si128()));
        return sums.lowerWord() + sums.upperWord();
    }
    // A bit for each that is that one.
    std::uint64_t marks(char c) const noexcept {
        return static_cast<std::uint32_t>(_mm_movemask_epi8(equal(c)));
    }
    // The first bytes, zeros behind them.
    ByteBlock first(std::size_t count) const noexcept {
        static constexpr std::array<std::uint8_t, 2 * size> ones = [] {
            std::array<std::uint8_t, 2 * size> bytes{};
            for (std::size_t i = 0; i < size; ++i)
                bytes[i] = 0xFF;
            return bytes;
        }();
        return ByteBlock(_mm_and_si128(
            _bytes, _mm_loadu_si128(reinterpret_cast<const __m128i*>(&ones[size - count]))));
    }
    std::uint64_t lowerWord() const noexcept {
        return static_cast<std::uint64_t>(_mm_cvtsi128_si64(_bytes));
    }
    std::uint64_t upperWord() const noexcept {
        return static_cast<std::uint64_t>(_mm_cvtsi128_si64(_mm_unpackhi_epi64(_bytes, _bytes)));
    }

private:
    explicit ByteBlock(__m128i bytes) noexcept : _bytes(bytes) {}

    __m128i equal(char c) const noexcept { return _mm_cmpeq_epi8(_bytes, _mm_set1_epi8(c)); }
    template <ByteKind kind>
    __m128i stops() const noexcept {
        // Control characters, and what is beyond ASCII, whose sign it is.
        const __m128i unusual = _mm_cmplt_epi8(_bytes, _mm_set1_epi8(' '));
        const auto any = [&](char a, char b, char c) {
            return _mm_or_si128(_mm_or_si128(unusual, equal(a)), _mm_or_si128(equal(b), equal(c)));
        };
        if constexpr (kind == textByte)
            return any('<', '&', ']');
        else if constexpr (kind == attributeByte)
            return _mm_or_si128(any('<', '&', '"'), equal('\''));
        else if constexpr (kind == markupByte)
            return any('-', '?', ']');
        else if constexpr (kind == tagByte)
            return _mm_or_si128(_mm_or_si128(equal('"'), equal('\'')),
                                _mm_or_si128(_mm_or_si128(equal('<'), equal('>')), equal(0)));
        else if constexpr (kind == writtenByte)
            return _mm_or_si128(any('<', '>', '&'), equal('"'));
        else if constexpr (kind == blankByte)
            return _mm_andnot_si128(
                _mm_or_si128(equal(' '), _mm_or_si128(equal('\n'), equal('\t'))),
                _mm_set1_epi8(-1));
    }
    static std::size_t firstIn(__m128i marks) noexcept {
        const auto mask = static_cast<std::uint32_t>(_mm_movemask_epi8(marks));
        return static_cast<std::size_t>(std::countr_zero(mask | 1U << size));
    }

    __m128i _bytes;
};

#endif

// Likewise, of a run that no zero byte ends.
template <ByteKind kind>
const char* endOfRunBefore(const char* at, const char* end) noexcept {
#if defined(__SSE2__)
    for (; ByteBlock::fits(at, end); at += ByteBlock::size) {
        const std::size_t run = ByteBlock(at).run<kind>();
        if (run != ByteBlock::size)
            return at + run;
    }
    constexpr std::size_t half = ByteBlock::size / 2;
    if (end - at >= static_cast<std::ptrdiff_t>(half)) {
        const std::size_t run = ByteBlock::half(at).run<kind>();
        at += run;
        if (run != half)
            return at;
    }
#endif
    while (at != end && is(*at, kind))
        ++at;
    return at;
}

// Copies the bytes and answers whether all are of the kind; where they are not, perhaps only some.
template <ByteKind kind>
bool copyRun(const char* from, std::size_t size, char* to) noexcept {
#if defined(__SSE2__)
    constexpr std::size_t half = ByteBlock::size / 2;
    constexpr std::size_t quarter = ByteBlock::size / 4;
    if (size >= ByteBlock::size) {
        const std::size_t last = size - ByteBlock::size;
        for (std::size_t at = 0; at < last; at += ByteBlock::size) {
            const ByteBlock block(from + at);
            block.store(to + at);
            if (block.run<kind>() != ByteBlock::size)
                return false;
        }
        const ByteBlock block(from + last);
        block.store(to + last);
        return block.run<kind>() == ByteBlock::size;
    }
    // The ends overlap.
    if (size >= half) {
        const ByteBlock block = ByteBlock::halves(from, from + size - half);
        std::memcpy(to, from, half);
        std::memcpy(to + size - half, from + size - half, half);
        return block.run<kind>() == ByteBlock::size;
    }
    if (size >= quarter) {
        const ByteBlock block = ByteBlock::quarters(from, from + size - quarter);
        std::memcpy(to, from, quarter);
        std::memcpy(to + size - quarter, from + size - quarter, quarter);
        return block.run<kind>() == half;
    }
#endif
    bool isRun = true;
    for (std::size_t i = 0; i < size; ++i) {
        to[i] = from[i];
        isRun = isRun && is(from[i], kind);
    }
    return isRun;
}

template <ByteKind kind>
const char* endOfRun(const char* at, [[maybe_unused]] const char* end) noexcept {
    while (true) {
#if defined(__SSE2__)
        if (ByteBlock::fits(at, end)) {
            const std::size_t run = ByteBlock(at).run<kind>();
            at += run;
            if (run == ByteBlock::size)
                continue;
        }
#endif
        if (!is(*at, kind))
            return at;
        ++at;
    }
}

// Walks over the "<" of a text: those of 64 bytes are found together.
class MarkupStarts {
public:
    // From there on, where the text goes on.
    MarkupStarts(const char* at, const char* end) noexcept : _at(at), _end(end) {}

    // The next one; null where fewer than 64 bytes are left to look at.
    const char* next() noexcept {
        while (_marks == 0) {
            if (_end - _at < size)
                return nullptr;
            for (int i = 0; i < size; i += 16)
                _marks |= marksOf(_at + i) << i;
            _at += size;
        }
        const char* const found = _at - size + std::countr_zero(_marks);
        _marks &= _marks - 1;
        return found;
    }

private:
    static constexpr int size = 64;

    // A bit for each of sixteen bytes.
    static std::uint64_t marksOf(const char* at) noexcept {
#if defined(__SSE2__)
        return ByteBlock(at).marks('<');
#else
        std::uint64_t marks = 0;
        for (unsigned i = 0; i < 16; ++i)
            marks |= std::uint64_t{at[i] == '<'} << i;
        return marks;
#endif
    }

    const char* _at; // what was not looked at
    const char* const _end;
    std::uint64_t _marks = 0; // in the block before, of those that were not handed out
};

// How often the byte stands there.
inline std::size_t countOf(char c, const char* from, const char* to) noexcept {
    std::size_t count = 0;
#if defined(__SSE2__)
    for (; ByteBlock::fits(from, to); from += ByteBlock::size)
        count += ByteBlock(from).count(c);
#endif
    return count + static_cast<std::size_t>(std::count(from, to, c));
}

// A name of at most 15 bytes as two words, zeros behind it.
struct ShortName {
    static constexpr std::size_t longest = 15;

    std::uint64_t lower = 0;
    std::uint64_t upper = 0;
    bool operator==(const ShortName&) const = default;

    static ShortName of(const char* begin, std::size_t size) noexcept {
        std::array<std::uint64_t, 2> words{};
        std::memcpy(words.data(), begin, size);
        return {words[0], words[1]};
    }
    // How long the name is that begins there, which is not looked at closely; 0 where none does, or
    // none that is short, or it stands near the end.
    static std::size_t read([[maybe_unused]] const char* at, [[maybe_unused]] const char* end,
                            [[maybe_unused]] ShortName& name) noexcept {
#if defined(__SSE2__)
        if (ByteBlock::fits(at, end)) {
            const ByteBlock block(at);
            const std::size_t size = block.untilNameEnds();
            if (size <= longest) {
                const ByteBlock bytes = block.first(size);
                name = {bytes.lowerWord(), bytes.upperWord()};
                return size;
            }
        }
#endif
        return 0;
    }
    // Whether it begins there; false also near the end.
    bool standsAt([[maybe_unused]] const char* at, [[maybe_unused]] const char* end,
                  [[maybe_unused]] std::size_t size) const noexcept {
#if defined(__SSE2__)
        if (ByteBlock::fits(at, end)) {
            const ByteBlock bytes = ByteBlock(at).first(size);
            return ((bytes.lowerWord() ^ lower) | (bytes.upperWord() ^ upper)) == 0;
        }
#endif
        return false;
    }
};

} // namespace qx
