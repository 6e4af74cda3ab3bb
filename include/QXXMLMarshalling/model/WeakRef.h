#pragma once

// A reference that does not keep its object alive and yields null once the last counted reference
// to it is gone: in the object's destructor, too.

#include <QXXMLMarshalling/model/Object.h>

namespace qx {

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
