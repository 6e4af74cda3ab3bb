#pragma once

// Short texts that a document repeats, such as the few values of an attribute, are kept in memory
// once. A small table that forgets: a text that meets another in its place puts that one out.

#include <QXXMLMarshalling/base/String.h>

#include <array>
#include <bit>
#include <cstdint>
#include <cstring>

namespace qx {

class SharedValues {
public:
    // A text that its taker keeps at least as long as the table stands: the table owns none.
    String valued(std::string_view text) {
        if (text.empty() || text.size() > longest)
            return String::inBlock(text);
        const std::uint64_t hash = hashOf(text);
        Entry& entry = _entries[hash >> (64 - slotBits)];
        if (entry.hash == hash && isText(*entry.rep, text)) {
            String shared(entry.rep);
            shared.retain();
            return shared;
        }
        String made = String::inBlock(text);
        entry = {hash, made._rep};
        return made;
    }

private:
    static constexpr std::size_t longest = 24;
    static constexpr unsigned slotBits = 8;

    struct Entry {
        std::uint64_t hash = 0; // 0 only where there is no text yet
        String::Rep* rep = nullptr;
    };

    static bool isText(const String::Rep& rep, std::string_view text) noexcept {
        return rep.size == text.size() &&
               std::memcmp(String::text(&rep), text.data(), text.size()) == 0;
    }

    template <class Number>
    static std::uint64_t numberAt(const char* bytes) noexcept {
        Number number;
        std::memcpy(&number, bytes, sizeof number);
        return number;
    }

    // Each byte counts, some of them twice.
    static std::uint64_t hashOf(std::string_view text) noexcept {
        const char* const first = text.data();
        const char* const end = first + text.size();
        if (text.size() >= 8)
            return mixed(numberAt<std::uint64_t>(first), numberAt<std::uint64_t>(end - 8),
                         numberAt<std::uint64_t>(text.size() > 16 ? first + 8 : first));
        if (text.size() >= 4)
            return mixed(numberAt<std::uint32_t>(first), numberAt<std::uint32_t>(end - 4), 0);
        return mixed(numberAt<std::uint8_t>(first),
                     numberAt<std::uint8_t>(first + text.size() / 2) << 8 |
                         numberAt<std::uint8_t>(end - 1),
                     0);
    }
    static std::uint64_t mixed(std::uint64_t a, std::uint64_t b, std::uint64_t c) noexcept {
        const std::uint64_t sum = a + std::rotl(b, 23) * 0x9E3779B97F4A7C15U + std::rotl(c, 41);
        return (sum ^ sum >> 29) * 0xC2B2AE3D27D4EB4FU | 1;
    }

    std::array<Entry, 1U << slotBits> _entries;
};

} // namespace qx
