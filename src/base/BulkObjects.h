#pragma once

// While one lives, the objects of its thread are cut from shared blocks (detail/ObjectMemory.h):
// that is faster and keeps them together. A block is freed with the last object in it, so what is
// made meanwhile and kept for long keeps its block.

namespace qx {

class BulkObjects {
public:
    BulkObjects() noexcept;
    ~BulkObjects();
    BulkObjects(const BulkObjects&) = delete;
    BulkObjects& operator=(const BulkObjects&) = delete;
};

} // namespace qx
