#include "base/MemoryBlocks.h"

#include <QXXMLMarshalling/detail/Count.h>

#include "base/BulkArray.h"

#include <algorithm>

namespace qx {

namespace {

// A host may keep a few of many objects, and one text of each document, but seldom a few nodes.
constexpr std::size_t smallestBlock = 512 - 16;
constexpr std::size_t largestNodeBlock = 64 * 1024 - 64;
constexpr std::size_t largestObjectBlock = 8 * 1024 - 64;

// From here on a run of objects has blocks for which large pages are asked.
constexpr std::size_t largeRun = 64 * 1024 * 1024;
constexpr std::size_t objectBlockOfLargeRun = 4 * 1024 * 1024;

// Without destructors, so that they can be used until the very end of the thread.
[[gnu::tls_model("initial-exec")]] constinit thread_local MemoryBlocks
    nodesOfThread(smallestBlock, largestNodeBlock, largestNodeBlock);
[[gnu::tls_model("initial-exec")]] constinit thread_local MemoryBlocks
    objectsOfThread(smallestBlock, largestObjectBlock, objectBlockOfLargeRun);
[[gnu::tls_model("initial-exec")]] constinit thread_local MemoryBlocks
    textsOfThread(smallestBlock, smallestBlock, smallestBlock);

} // namespace

MemoryBlocks& MemoryBlocks::ofNodes() noexcept { return nodesOfThread; }
MemoryBlocks& MemoryBlocks::ofTexts() noexcept { return textsOfThread; }
MemoryBlocks& MemoryBlocks::ofObjects() noexcept { return objectsOfThread; }

inline void MemoryBlocks::giveUp(Block* block, std::uint32_t things) noexcept {
    if (detail::decreaseCount(block->live, things) == things)
        ::operator delete(block);
}

void MemoryBlocks::begin(std::size_t whole) {
    // What is made while the thread's other objects end, after its blocks, gets a block of its own.
    static thread_local bool hasRetired = false;
    struct Retirement {
        ~Retirement() {
            nodesOfThread.retire();
            textsOfThread.retire();
            objectsOfThread.retire();
            hasRetired = true;
        }
    };
    static thread_local const Retirement atThreadsEnd;
    (void)atThreadsEnd;
    retire();
    // So that what follows the address in front is aligned.
    constexpr std::size_t start = 2 * anyScalar - header;
    static_assert(start >= sizeof(Block));
    const std::size_t usual = _sizeOfRun < largeRun
                                  ? std::clamp(_sizeOfRun / 64, _smallest, _largest)
                                  : _largestOfLargeRun;
    const std::size_t size = hasRetired ? start + whole : std::max(usual, start + whole);
    _sizeOfRun += size;
    auto* const memory = static_cast<char*>(::operator new(size));
    askForLargePages(memory, size);
    _block = new (memory) Block{hasRetired ? 1 : reserve};
    _isReserved = !hasRetired;
    _next = memory + start;
    _left = size - start;
}

void MemoryBlocks::retire() noexcept {
    if (_block != nullptr && _isReserved)
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
    new (memory - header) Block*(nullptr);
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
