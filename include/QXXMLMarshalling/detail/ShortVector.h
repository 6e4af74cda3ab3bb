#pragma once

// A vector whose first few elements stand in the vector itself. Further ones move all of them into
// memory of their own. Elements are moved and destroyed without exceptions.

#include <QXXMLMarshalling/detail/ObjectMemory.h>

#include <algorithm>
#include <cstdint>
#include <memory>
#include <stdexcept>
#include <type_traits>
#include <utility>

namespace qx::detail {

template <class T, std::uint32_t Inside>
class ShortVector {
public:
    static_assert(std::is_nothrow_move_constructible_v<T> && std::is_nothrow_move_assignable_v<T>);

    ShortVector() noexcept = default;
    ShortVector(const ShortVector&) = delete;
    ShortVector& operator=(const ShortVector&) = delete;
    ~ShortVector() {
        clear();
        giveBack();
    }

    std::size_t size() const noexcept { return _size; }
    bool empty() const noexcept { return _size == 0; }
    bool isFull() const noexcept { return _size == _capacity; }
    T* begin() noexcept { return _items; }
    T* end() noexcept { return _items + _size; }
    const T* begin() const noexcept { return _items; }
    const T* end() const noexcept { return _items + _size; }
    T& operator[](std::size_t position) noexcept { return _items[position]; }
    const T& operator[](std::size_t position) const noexcept { return _items[position]; }

    template <class... Arguments>
    void emplace_back(Arguments&&... arguments) {
        if (isFull())
            return growWith(std::forward<Arguments>(arguments)...);
        new (_items + _size) T(std::forward<Arguments>(arguments)...);
        ++_size;
    }
    void erase(std::size_t position) noexcept {
        std::move(begin() + position + 1, end(), begin() + position);
        std::destroy_at(_items + --_size);
    }
    template <class Predicate>
    void eraseIf(Predicate predicate) noexcept {
        T* kept = std::remove_if(begin(), end(), predicate);
        while (end() != kept)
            std::destroy_at(_items + --_size);
    }
    // The first one ends first.
    void clear() noexcept { std::destroy_n(_items, std::exchange(_size, 0)); }

private:
    T* inside() noexcept { return reinterpret_cast<T*>(_inside); }
    void giveBack() noexcept {
        if (_items != inside())
            ObjectAllocator<T>().deallocate(_items, _capacity);
    }
    // The new element first: it may be made from one of the others.
    template <class... Arguments>
    void growWith(Arguments&&... arguments) {
        if (_capacity > UINT32_MAX / 2)
            throw std::length_error("too many elements");
        ObjectAllocator<T> allocator;
        const std::size_t capacity = std::size_t{2} * _capacity;
        T* const items = allocator.allocate(capacity);
        try {
            new (items + _size) T(std::forward<Arguments>(arguments)...);
        } catch (...) {
            allocator.deallocate(items, capacity);
            throw;
        }
        std::uninitialized_move(begin(), end(), items);
        std::destroy(begin(), end());
        giveBack();
        _items = items;
        _capacity *= 2;
        ++_size;
    }

    T* _items = inside();
    std::uint32_t _size = 0;
    std::uint32_t _capacity = Inside;
    alignas(T) unsigned char _inside[Inside * sizeof(T)];
};

} // namespace qx::detail
