#pragma once

// Memory of the objects that reading a document makes by the thousand. While the thread reads one,
// they come out of shared blocks, which is fast and keeps them together; a block goes back when the
// last object in it ends. At any other time each has memory of its own.

#include <QXXMLMarshalling/base/Export.h>

#include <cstddef>
#include <new>

namespace qx {

struct QX_API ObjectMemory {
    static void* allocate(std::size_t size);
    static void release(void* memory) noexcept;

    // While one lives, the objects of its thread come out of blocks.
    class QX_API Bulk {
    public:
        Bulk() noexcept;
        ~Bulk();
        Bulk(const Bulk&) = delete;
        Bulk& operator=(const Bulk&) = delete;
    };
};

// For the buffers that such objects hold.
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

} // namespace qx
