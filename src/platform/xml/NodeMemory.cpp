#include "platform/xml/NodeMemory.h"

#include <atomic>
#include <cstdint>
#include <new>

namespace qx {

#if defined(__SANITIZE_ADDRESS__)
#define QX_NODES_APART 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define QX_NODES_APART 1
#endif
#endif

#ifdef QX_NODES_APART

// The sanitizer sees the use of a dead node only when each has memory of its own.
void* allocateNode(std::size_t size) { return ::operator new(size); }
void releaseNode(void* node) noexcept { ::operator delete(node); }

#else

namespace {

constexpr std::size_t blockSize = 64 * 1024 - 64;

// In front of each node stands the address of its block.
struct alignas(void*) Block {
    // Nodes alive; while the block is being cut up, `reserve` minus the nodes that died.
    std::atomic<std::uint32_t> live;
    std::uint32_t used;
    std::uint32_t cut; // how many nodes it was cut into
};
constexpr std::uint32_t reserve = 1U << 30;

void giveUp(Block* block, std::uint32_t count) noexcept {
    if (block->live.fetch_sub(count, std::memory_order_acq_rel) == count)
        ::operator delete(block);
}

// Without a destructor, so that it can be used until the very end of the thread.
thread_local Block* current = nullptr;

void retireCurrent() noexcept {
    if (current != nullptr)
        giveUp(current, reserve - current->cut);
    current = nullptr;
}

struct Retirement {
    ~Retirement() { retireCurrent(); }
};

Block* newBlock() {
    retireCurrent();
    static thread_local const Retirement atThreadsEnd;
    (void)atThreadsEnd;
    current = new (::operator new(blockSize)) Block{reserve, sizeof(Block), 0};
    return current;
}

} // namespace

void* allocateNode(std::size_t size) {
    const std::size_t whole =
        sizeof(Block*) + (size + sizeof(void*) - 1) / sizeof(void*) * sizeof(void*);
    Block* block = current;
    if (block == nullptr || block->used + whole > blockSize)
        block = newBlock();
    char* const place = reinterpret_cast<char*>(block) + block->used;
    block->used += static_cast<std::uint32_t>(whole);
    ++block->cut;
    new (place) Block*(block);
    return place + sizeof(Block*);
}

void releaseNode(void* node) noexcept { giveUp(*(static_cast<Block**>(node) - 1), 1); }

#endif

} // namespace qx
