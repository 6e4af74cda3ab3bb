#pragma once

// Memory of nodes. A document's nodes are made in one go and mostly die together: they are cut from
// blocks, one after the other, and a block is given back when the last of its nodes is gone. So a
// node that is kept for long keeps its block, a few hundred nodes. Each thread cuts from a block of
// its own; any thread may release any node.

#include <cstddef>

namespace qx {

void* allocateNode(std::size_t size);
void releaseNode(void* node) noexcept;

} // namespace qx
