#pragma once

// Memory of the objects that reading and writing a document makes by the thousand, and of the
// buffers that they hold. While the thread does so (base/BulkObjects.h), it is cut from shared
// blocks; at any other time each piece is allocated on its own. Any thread may release either.

#include <QXXMLMarshalling/base/Export.h>

#include <cstddef>
#include <new>

namespace qx::detail {

struct QX_API ObjectMemory {
    // Aligned for any scalar. Throws std::bad_alloc.
    static void* allocate(std::size_t size);
    // What allocate returned, or null.
    static void release(void* memory) noexcept;
};

template <class T>
struct ObjectAllocator {
    using value_type = T;
    ObjectAllocator() noexcept = default;
    template <class U>
    ObjectAllocator(const ObjectAllocator<U>&) noexcept {}
    T* allocate(std::size_t count) {
        if (count > static_cast<std::size_t>(-1) / sizeof(T))
            throw std::bad_array_new_length();
        return static_cast<T*>(ObjectMemory::allocate(count * sizeof(T)));
    }
    void deallocate(T* memory, std::size_t) noexcept { ObjectMemory::release(memory); }
    template <class U>
    bool operator==(const ObjectAllocator<U>&) const noexcept {
        return true;
    }
};

} // namespace qx::detail
