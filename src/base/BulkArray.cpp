#include "base/BulkArray.h"

#include <cstdint>

#include <sys/mman.h>
#include <unistd.h>

namespace qx {

// All pages are of one kind then, up to the first and the last byte: memory of two kinds could no
// longer be moved as a whole when it grows.
void askForLargePages([[maybe_unused]] void* memory, [[maybe_unused]] std::size_t size) noexcept {
#ifdef MADV_HUGEPAGE
    constexpr std::size_t worthIt = 4 * 1024 * 1024;
    if (size < worthIt)
        return;
    static const auto page = static_cast<std::uintptr_t>(::sysconf(_SC_PAGESIZE));
    const auto begin = reinterpret_cast<std::uintptr_t>(memory);
    const std::uintptr_t from = begin / page * page;
    const std::uintptr_t to = (begin + size + page - 1) / page * page;
    // Without them all works as well, but slower.
    (void)::madvise(reinterpret_cast<void*>(from), to - from, MADV_HUGEPAGE);
#endif
}

} // namespace qx
