#pragma once

// A text in memory: this head, its bytes, a zero byte.

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <string_view>

namespace qx::detail {

struct StringRep {
    std::atomic<std::uint32_t> count;
    std::atomic<std::uint32_t> hash; // 0: not worked out yet
    std::size_t isInBlock : 1;       // in memory shared with others
    std::size_t size : sizeof(std::size_t) * 8 - 1;

    std::string_view view() const noexcept {
        return {reinterpret_cast<const char*>(this + 1), size};
    }
};

} // namespace qx::detail
