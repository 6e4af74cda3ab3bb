#include "platform/xml/NodeBlocks.h"

namespace qx {

namespace {

constexpr std::size_t blockSize = 64 * 1024 - 64;

// Without a destructor, so that it can be used until the very end of the thread.
constinit thread_local NodeBlocks blocksOfThread;

} // namespace

NodeBlocks& NodeBlocks::ofThread() noexcept { return blocksOfThread; }

void NodeBlocks::begin() {
    struct Retirement {
        ~Retirement() { blocksOfThread.retire(); }
    };
    static thread_local const Retirement atThreadsEnd;
    (void)atThreadsEnd;
    retire();
    auto* const memory = static_cast<char*>(::operator new(blockSize));
    _block = new (memory) Block{reserve};
    _next = memory + sizeof(Block);
    _left = blockSize - sizeof(Block);
}

void NodeBlocks::retire() noexcept {
    if (_block != nullptr)
        giveUp(_block, reserve - _cut);
    _block = nullptr;
    _left = 0;
    _cut = 0;
}

void NodeBlocks::release(void* node) noexcept {
#ifdef QX_NODES_APART
    ::operator delete(node);
#else
    giveUp(*(static_cast<Block**>(node) - 1), 1);
#endif
}

void NodeBlocks::giveUp(Block* block, std::uint32_t count) noexcept {
    if (block->live.fetch_sub(count, std::memory_order_acq_rel) == count)
        ::operator delete(block);
}

} // namespace qx
