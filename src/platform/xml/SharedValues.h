#pragma once

// Short texts that a document repeats, such as the few values of an attribute, are kept in memory
// once. A small table that forgets: a text that meets another in its place puts that one out.

#include <QXXMLMarshalling/platform/String.h>

#include <array>
#include <cstdint>
#include <cstring>

namespace qx {

class SharedValues {
public:
    String valued(std::string_view text) {
        if (text.empty() || text.size() > longest)
            return String::inBlock(text);
        const Digits digits = digitsOf(text);
        Entry& entry = _entries[slot(digits)];
        if (entry.digits != digits || entry.size != text.size())
            entry = {digits, text.size(), String::inBlock(text)};
        return entry.value;
    }

private:
    static constexpr std::size_t longest = 24;
    static constexpr unsigned slotBits = 8;

    // The text's bytes, some of them twice: with the size they tell texts apart without a look at
    // where those stand.
    using Digits = std::array<std::uint64_t, 3>;
    struct Entry {
        Digits digits{};
        std::size_t size = 0;
        String value;
    };

    template <class Number>
    static std::uint64_t numberAt(const char* bytes) noexcept {
        Number number;
        std::memcpy(&number, bytes, sizeof number);
        return number;
    }

    static Digits digitsOf(std::string_view text) noexcept {
        const char* const first = text.data();
        const char* const end = first + text.size();
        if (text.size() >= 8)
            return {numberAt<std::uint64_t>(first), numberAt<std::uint64_t>(end - 8),
                    numberAt<std::uint64_t>(text.size() > 16 ? first + 8 : first)};
        if (text.size() >= 4)
            return {numberAt<std::uint32_t>(first), numberAt<std::uint32_t>(end - 4), 0};
        return {numberAt<std::uint8_t>(first),
                numberAt<std::uint8_t>(first + text.size() / 2) << 8 |
                    numberAt<std::uint8_t>(end - 1),
                0};
    }

    static std::size_t slot(const Digits& digits) noexcept {
        const std::uint64_t mixed = digits[0] ^ (digits[1] * 0x9E3779B97F4A7C15U);
        return (mixed * 0xC2B2AE3D27D4EB4FU) >> (64 - slotBits);
    }

    std::array<Entry, 1U << slotBits> _entries;
};

} // namespace qx
