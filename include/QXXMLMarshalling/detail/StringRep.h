#pragma once

// A text in memory: this head, its bytes, a zero byte.
//
//     | count 32 | hash 32 | isInBlock 1 | size 63 | bytes … | 0 |
//
//     count   | immortal 1 | interned 1 | property 1 | references 29 |
//
// 1. An immortal text is never freed, and copying it changes no count: threads that share names
//    share no counter.
// 2. An interned text is immortal, and the only interned one with its bytes: two interned texts are
//    equal exactly when they are the same.
// 3. `property` is set once, when a class is described with a property of that name, and never
//    taken back. A key without it needs no look-up in a class, which would make reading orders take
//    5 % more instructions (bench/orders_bench.cpp, read).

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
