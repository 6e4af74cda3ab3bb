#pragma once

// Memory for things that are made in one go and mostly die together: the nodes of a document, its
// texts, the objects that are read from it. They are cut from blocks, one after the other, and a
// block is given back when the last thing in it is gone. So what is kept for long keeps its block:
// some hundred nodes, some dozen objects, a kilobyte of texts. Each thread cuts from blocks of its
// own; any thread may release anything.

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <new>

// The address sanitizer sees the use of what is dead only when each thing has memory of its own.
#if defined(__SANITIZE_ADDRESS__)
#define QX_MEMORY_APART 1
#elif defined(__has_feature)
#if __has_feature(address_sanitizer)
#define QX_MEMORY_APART 1
#endif
#endif

namespace qx {

class MemoryBlocks {
public:
    static constexpr std::size_t anyScalar = __STDCPP_DEFAULT_NEW_ALIGNMENT__;

    constexpr explicit MemoryBlocks(std::size_t blockSize) noexcept : _blockSize(blockSize) {}
    MemoryBlocks(const MemoryBlocks&) = delete;
    MemoryBlocks& operator=(const MemoryBlocks&) = delete;

    // The calling thread's, good until the thread ends. What lives differently long does not share
    // blocks.
    static MemoryBlocks& ofNodes() noexcept;
    static MemoryBlocks& ofTexts() noexcept;
    static MemoryBlocks& ofObjects() noexcept;

    // Aligned like pointers, or for any scalar with a Unit of that size. Only small sizes are worth
    // a block: at most 4 KiB.
    template <std::size_t Unit = sizeof(void*)>
    void* allocate(std::size_t size) {
#ifdef QX_MEMORY_APART
        return ::operator new(size);
#else
        const std::size_t whole = (header + size + Unit - 1) / Unit * Unit;
        if (_left < whole)
            begin(whole);
        char* const place = _next;
        _next += whole;
        _left -= whole;
        ++_cut;
        new (place) Block*(_block);
        return place + header;
#endif
    }
    // The same for something that is made on its own, aligned for any scalar.
    static void* allocateAlone(std::size_t size);
    static void release(void* memory) noexcept;

private:
    // In front of each thing stands the address of its block, null for one that has none.
    struct alignas(void*) Block {
        // Things alive; while the block is being cut up, `reserve` minus those that died.
        std::atomic<std::uint32_t> live;
    };
    static constexpr std::uint32_t reserve = 1U << 30;
    static constexpr std::size_t header = sizeof(void*);

    void begin(std::size_t whole);
    void retire() noexcept;
    static void giveUp(Block* block, std::uint32_t things) noexcept;

    const std::size_t _blockSize;
    Block* _block = nullptr;
    bool _isReserved = false; // whether more than what is alive is counted for the block
    char* _next = nullptr;
    std::size_t _left = 0;
    std::uint32_t _cut = 0; // how many things the block was cut into
};

} // namespace qx
