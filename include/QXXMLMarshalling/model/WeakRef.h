#pragma once

// A reference that does not keep its object alive and yields null once the last counted reference
// to it is gone: in the object's destructor, too.

#include <QXXMLMarshalling/model/Object.h>

#include <atomic>
#include <cstddef>
#include <cstdint>

namespace qx {

// What weak references hold on to: it outlives its object and then yields null.
class QX_API WeakAnchor {
public:
    explicit WeakAnchor(Object* target) noexcept : _target(target) {}
    Object* target() const noexcept { return _target.load(std::memory_order_acquire); }
    void clear() noexcept { _target.store(nullptr, std::memory_order_release); }

    void retain() const noexcept { _count.fetch_add(1, std::memory_order_relaxed); }
    void release() const noexcept {
        if (_count.fetch_sub(1, std::memory_order_acq_rel) == 1)
            delete this;
    }

private:
    mutable std::atomic<std::uint32_t> _count{1};
    std::atomic<Object*> _target;
};

template <class T>
class WeakRef {
public:
    WeakRef() noexcept = default;
    WeakRef(std::nullptr_t) noexcept {}
    WeakRef(T* object) : _anchor(object != nullptr ? object->weakAnchor() : nullptr) {}
    WeakRef(const Ref<T>& object) : WeakRef(object.get()) {}

    // The object, kept alive by the result; null when there is none (any more).
    Ref<T> lock() const noexcept { return Ref<T>(get()); }
    // The object without keeping it: for a caller that knows that it lives.
    T* get() const noexcept { return _anchor ? static_cast<T*>(_anchor->target()) : nullptr; }
    explicit operator bool() const noexcept { return get() != nullptr; }

private:
    Ref<WeakAnchor> _anchor;
};

} // namespace qx
