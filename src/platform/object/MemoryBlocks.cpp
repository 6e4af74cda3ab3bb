#include "platform/object/MemoryBlocks.h"

#include <QXXMLMarshalling/platform/Count.h>

namespace qx {

namespace {

constexpr std::size_t blockSize = 64 * 1024 - 64;

// Without destructors, so that they can be used until the very end of the thread.
[[gnu::tls_model("initial-exec")]] constinit thread_local MemoryBlocks nodesOfThread;
[[gnu::tls_model("initial-exec")]] constinit thread_local MemoryBlocks objectsOfThread;

} // namespace

MemoryBlocks& MemoryBlocks::ofNodes() noexcept { return nodesOfThread; }
MemoryBlocks& MemoryBlocks::ofObjects() noexcept { return objectsOfThread; }

inline void MemoryBlocks::giveUp(Block* block, std::uint32_t things) noexcept {
    if (count::decrease(block->live, things) == things)
        ::operator delete(block);
}

void MemoryBlocks::begin() {
    struct Retirement {
        ~Retirement() {
            nodesOfThread.retire();
            objectsOfThread.retire();
        }
    };
    static thread_local const Retirement atThreadsEnd;
    (void)atThreadsEnd;
    retire();
    auto* const memory = static_cast<char*>(::operator new(blockSize));
    _block = new (memory) Block{reserve};
    // So that what follows the address in front is aligned.
    constexpr std::size_t start = 2 * anyScalar - sizeof(Block*);
    static_assert(start >= sizeof(Block));
    _next = memory + start;
    _left = blockSize - start;
}

void MemoryBlocks::retire() noexcept {
    if (_block != nullptr)
        giveUp(_block, reserve - _cut);
    _block = nullptr;
    _left = 0;
    _cut = 0;
}

void* MemoryBlocks::allocateAlone(std::size_t size) {
#ifdef QX_MEMORY_APART
    return ::operator new(size);
#else
    char* const memory = static_cast<char*>(::operator new(size + anyScalar)) + anyScalar;
    new (memory - sizeof(Block*)) Block*(nullptr);
    return memory;
#endif
}

void MemoryBlocks::release(void* memory) noexcept {
#ifdef QX_MEMORY_APART
    ::operator delete(memory);
#else
    if (memory == nullptr)
        return;
    if (Block* const block = *(static_cast<Block**>(memory) - 1))
        giveUp(block, 1);
    else
        ::operator delete(static_cast<char*>(memory) - anyScalar);
#endif
}

} // namespace qx
