#pragma once

// An arena for what is made in one go and mostly dies together: the nodes of a document, its texts,
// the objects that are read from it.
//
//              +-------+-------+---------+-------+---------+- - - - - - - - - - - - +
//     a block  | live  | owner | thing 1 | owner | thing 2 |  not cut yet           |
//              +-------+-------+---------+-------+---------+- - - - - - - - - - - - +
//                          |                 |              ^ _next     _left bytes
//                          +-----------------+---> the block; null: no block, memory of its own
//
// 1. Each thread cuts from blocks of its own, without a lock or an atomic operation. Any thread may
//    release any thing.
// 2. While a block is being cut, `live` is `reserve` minus the things that have died, so it cannot
//    come to zero. Once the block is full, or its thread ends, the thread takes back what the
//    reserve is more than the things that were cut: from then on `live` counts those alive.
// 3. Whoever brings `live` to zero frees the block, be it a release or the retirement itself.
// 4. One live thing keeps its whole block allocated. So what lives differently long does not share
//    blocks, and those of objects and nodes are small at first: in a run of things that are made
//    together a new one has at most a 64th of what the run took before. From 64 MB on those of
//    objects have 4 MB.
// 5. What is made while a thread ends, after its blocks were retired, gets a block for itself.
// 6. Under the address sanitizer each thing has memory of its own, without an owner in front: only
//    then does it see the use of what is dead.
//
// Without blocks, reading orders takes 21 % more instructions: 8 % for the objects, 13 % for the
// texts (bench/orders_bench.cpp, read).

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <new>

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

    constexpr MemoryBlocks(std::size_t smallest, std::size_t largest,
                           std::size_t largestOfLargeRun) noexcept
        : _smallest(smallest), _largest(largest), _largestOfLargeRun(largestOfLargeRun) {}
    MemoryBlocks(const MemoryBlocks&) = delete;
    MemoryBlocks& operator=(const MemoryBlocks&) = delete;

    // The calling thread's, good until the thread ends.
    static MemoryBlocks& ofNodes() noexcept;
    static MemoryBlocks& ofTexts() noexcept;
    static MemoryBlocks& ofObjects() noexcept;

    // A large block is not gone on with: what is made now may be little, and would keep it all.
    void beginRun() noexcept {
        if (_left > _largest)
            retire();
        _sizeOfRun = 0;
    }

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
    struct alignas(void*) Block {
        std::atomic<std::uint32_t> live;
    };
    static constexpr std::uint32_t reserve = 1U << 30;
    static constexpr std::size_t header = sizeof(void*);

    void begin(std::size_t whole);
    void retire() noexcept;
    static void giveUp(Block* block, std::uint32_t things) noexcept;

    const std::size_t _smallest;
    const std::size_t _largest;
    const std::size_t _largestOfLargeRun;
    std::size_t _sizeOfRun = 0; // of its blocks together
    Block* _block = nullptr;
    bool _isReserved = false; // whether more than what is alive is counted for the block
    char* _next = nullptr;
    std::size_t _left = 0;
    std::uint32_t _cut = 0; // how many things the block was cut into
};

} // namespace qx
