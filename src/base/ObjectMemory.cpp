#include <QXXMLMarshalling/detail/ObjectMemory.h>

#include "base/BulkObjects.h"
#include "base/MemoryBlocks.h"

namespace qx {

namespace {

// Larger ones would leave much of a block unused.
constexpr std::size_t largestShare = 1024;

// In the library's initial block of thread memory: it is looked at for every such object.
[[gnu::tls_model("initial-exec")]] constinit thread_local unsigned bulks = 0;

} // namespace

BulkObjects::BulkObjects() noexcept {
    if (bulks++ == 0) {
        MemoryBlocks::ofObjects().beginRun();
        MemoryBlocks::ofNodes().beginRun();
    }
}
BulkObjects::~BulkObjects() { --bulks; }

namespace detail {

void* ObjectMemory::allocate(std::size_t size) {
    return bulks != 0 && size <= largestShare
               ? MemoryBlocks::ofObjects().allocate<MemoryBlocks::anyScalar>(size)
               : MemoryBlocks::allocateAlone(size);
}

void ObjectMemory::release(void* memory) noexcept { MemoryBlocks::release(memory); }

} // namespace detail
} // namespace qx
