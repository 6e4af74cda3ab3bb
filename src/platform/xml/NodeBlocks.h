#pragma once

// Memory of nodes. A document's nodes are made in one go and mostly die together: they are cut from
// blocks, one after the other, and a block is given back when the last of its nodes is gone. So a
// node that is kept for long keeps its block, a few hundred nodes. Each thread cuts from blocks of
// its own; any thread may release any node.

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <new>

// The address sanitizer sees the use of a dead node only when each has memory of its own.
#if defined(__SANITIZE_ADDRESS__)
#define QX_NODES_APART 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define QX_NODES_APART 1
#endif
#endif

namespace qx {

class NodeBlocks {
public:
    constexpr NodeBlocks() noexcept = default;
    NodeBlocks(const NodeBlocks&) = delete;
    NodeBlocks& operator=(const NodeBlocks&) = delete;

    // The calling thread's, good until the thread ends.
    static NodeBlocks& ofThread() noexcept;

    void* allocate(std::size_t size) {
#ifdef QX_NODES_APART
        return ::operator new(size);
#else
        const std::size_t whole =
            sizeof(Block*) + (size + sizeof(Block*) - 1) / sizeof(Block*) * sizeof(Block*);
        if (_left < whole)
            begin();
        char* const place = _next;
        _next += whole;
        _left -= whole;
        ++_cut;
        new (place) Block*(_block);
        return place + sizeof(Block*);
#endif
    }
    static void release(void* node) noexcept;

private:
    // In front of each node stands the address of its block.
    struct alignas(void*) Block {
        // Nodes alive; while the block is being cut up, `reserve` minus the nodes that died.
        std::atomic<std::uint32_t> live;
    };
    static constexpr std::uint32_t reserve = 1U << 30;

    void begin();
    void retire() noexcept;
    static void giveUp(Block* block, std::uint32_t count) noexcept;

    Block* _block = nullptr;
    char* _next = nullptr;
    std::size_t _left = 0;
    std::uint32_t _cut = 0; // how many nodes the block was cut into
};

} // namespace qx
