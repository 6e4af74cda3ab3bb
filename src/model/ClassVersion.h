#pragma once

#include <atomic>
#include <cstdint>

namespace qx {

// How often a class has been described or forgotten.
extern std::atomic<std::uint64_t> classChanges;

// What was found out about classes by their names holds as long as it stays. Any thread may ask.
inline std::uint64_t classVersion() noexcept {
    return classChanges.load(std::memory_order_acquire);
}

} // namespace qx
