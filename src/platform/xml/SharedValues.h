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
        if (text.size() > longest)
            return text;
        String& kept = _kept[slot(text)];
        if (kept != text)
            kept = String(text);
        return kept;
    }

private:
    static constexpr std::size_t longest = 24;
    static constexpr unsigned slotBits = 9;

    // From the first and the last eight bytes.
    static std::size_t slot(std::string_view text) noexcept {
        std::uint64_t first = text.size();
        std::uint64_t last = 0;
        if (text.size() >= 8) {
            std::memcpy(&first, text.data(), 8);
            std::memcpy(&last, text.data() + text.size() - 8, 8);
        } else {
            for (const char c : text)
                first = first << 8 | static_cast<unsigned char>(c);
        }
        return ((first ^ (last * 0x9E3779B97F4A7C15U)) * 0xC2B2AE3D27D4EB4FU) >> (64 - slotBits);
    }

    std::array<String, 1U << slotBits> _kept;
};

} // namespace qx
