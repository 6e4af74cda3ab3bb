#pragma once

// Counted references to objects. An object is born with a count of one, which make() hands to the
// Ref it returns; every further Ref adds one. Counts are atomic, everything else about an object
// belongs to one thread at a time.
//
//     auto invoice = qx::make<Invoice>();     // Ref<Invoice>, never null
//     qx::WeakRef<Invoice> watched(invoice);  // yields null once the invoice is gone

#include <concepts>
#include <cstddef>
#include <type_traits>
#include <typeinfo>
#include <utility>

namespace qx {

class Object;

namespace detail {

// A dynamic_cast; most objects are of the very class that is asked for, and need no search.
template <class To, class From>
To* castTo(From* object) noexcept {
    if constexpr (requires { static_cast<To*>(object); } && std::is_polymorphic_v<From>)
        if (object != nullptr && typeid(*object).name() == typeid(To).name())
            return static_cast<To*>(object);
    return dynamic_cast<To*>(object);
}

} // namespace detail

// Holds an object of class T, or null. Copying shares the object.
template <class T>
class Ref {
public:
    Ref() noexcept = default;
    Ref(std::nullptr_t) noexcept {}
    // Shares an object that is already alive.
    explicit Ref(T* object) noexcept : _object(object) { retainIfAny(); }
    Ref(const Ref& other) noexcept : _object(other._object) { retainIfAny(); }
    Ref(Ref&& other) noexcept : _object(std::exchange(other._object, nullptr)) {}
    template <class U>
    requires std::convertible_to<U*, T*> Ref(const Ref<U>& other)
    noexcept : _object(other.get()) { retainIfAny(); }
    template <class U>
    requires std::convertible_to<U*, T*> Ref(Ref<U>&& other)
    noexcept : _object(other.detach()) {}
    ~Ref() {
        if (_object != nullptr)
            _object->release();
    }

    Ref& operator=(Ref other) noexcept {
        std::swap(_object, other._object);
        return *this;
    }

    // Takes over a count that the caller owns.
    static Ref adopt(T* object) noexcept {
        Ref result;
        result._object = object;
        return result;
    }
    // Gives the count away; this reference is null afterwards.
    [[nodiscard]] T* detach() noexcept { return std::exchange(_object, nullptr); }
    void reset() noexcept { *this = Ref(); }

    T* get() const noexcept { return _object; }
    T* operator->() const noexcept { return _object; }
    T& operator*() const noexcept { return *_object; }
    explicit operator bool() const noexcept { return _object != nullptr; }
    // The object's own operator: array[0], record["city"].
    decltype(auto) operator[](std::size_t index) const requires requires(T& object) {
        object[index];
    }
    { return (*_object)[index]; }
    template <class K>
    requires(!std::integral<K>) decltype(auto) operator[](const K& key) const {
        return (*_object)[key];
    }

    // The same object as another class, or null where it is of no such class.
    template <class U>
    Ref<U> as() const noexcept {
        return Ref<U>(detail::castTo<U>(_object));
    }

private:
    void retainIfAny() const noexcept {
        if (_object != nullptr)
            _object->retain();
    }

    T* _object = nullptr;
};

template <class T, class U>
bool operator==(const Ref<T>& a, const Ref<U>& b) noexcept {
    return a.get() == b.get();
}
template <class T>
bool operator==(const Ref<T>& a, std::nullptr_t) noexcept {
    return a.get() == nullptr;
}

// Creates an object; the result is never null.
template <class T, class... Arguments>
Ref<T> make(Arguments&&... arguments) {
    return Ref<T>::adopt(new T(std::forward<Arguments>(arguments)...));
}

} // namespace qx
