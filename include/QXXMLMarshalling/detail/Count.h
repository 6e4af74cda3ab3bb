#pragma once

// Counts of references. Any thread may change one; in a process of one thread that costs no atomic
// operation, which would make reading orders take 12 % longer (bench/orders_bench.cpp, read).
//
// 1. The C library takes `isAlone` back before it starts a second thread, and whoever starts a
//    thread has done so after its own stores: the new thread sees the counts as they are.
// 2. The last decrease sees what every earlier one has done to the object: it acquires, and each
//    releases.

#include <atomic>
#include <cstdint>

#if __has_include(<sys/single_threaded.h>)
#include <sys/single_threaded.h>
#endif

namespace qx::detail {

inline bool isAlone() noexcept {
#if __has_include(<sys/single_threaded.h>)
    return __libc_single_threaded != 0;
#else
    return false;
#endif
}

inline void increaseCount(std::atomic<std::uint32_t>& count) noexcept {
    if (isAlone())
        count.store(count.load(std::memory_order_relaxed) + 1, std::memory_order_relaxed);
    else
        count.fetch_add(1, std::memory_order_relaxed);
}

// The count as it was.
inline std::uint32_t decreaseCount(std::atomic<std::uint32_t>& count,
                                   std::uint32_t by = 1) noexcept {
    if (!isAlone())
        return count.fetch_sub(by, std::memory_order_acq_rel);
    const std::uint32_t before = count.load(std::memory_order_relaxed);
    count.store(before - by, std::memory_order_relaxed);
    return before;
}

} // namespace qx::detail
