#include "base/BulkArray.h"

#include <cstdint>

#include <sys/mman.h>

namespace qx {

// Smaller memory may be cut from what others use, too.
void askForLargePages([[maybe_unused]] void* memory, [[maybe_unused]] std::size_t size) noexcept {
#ifdef MADV_HUGEPAGE
    constexpr std::uintptr_t largePage = 2 * 1024 * 1024;
    if (size < 2 * largePage)
        return;
    const auto begin = reinterpret_cast<std::uintptr_t>(memory);
    const std::uintptr_t from = (begin + largePage - 1) / largePage * largePage;
    const std::uintptr_t to = (begin + size) / largePage * largePage;
    // Without them all works as well, but slower.
    (void)::madvise(reinterpret_cast<void*>(from), to - from, MADV_HUGEPAGE);
#endif
}

} // namespace qx
