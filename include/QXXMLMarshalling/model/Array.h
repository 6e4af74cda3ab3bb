#pragma once

// An ordered, mutable list of values, shared by reference. Adding, removing and replacing items
// while it is walked raises NSGenericException at the walk's next step; an index out of bounds
// raises NSRangeException. Items may be assigned where they are, which is none of these:
//
//     (*array)[0] = "Bath";
//     std::ranges::sort(*array);                            // in the order of values (Value.h)
//     std::ranges::sort(*array, {}, &qx::Value::intValue);
//
// Nobody is told of a change of an array: whoever observes a list wants a new one.

#include <QXXMLMarshalling/detail/ObjectMemory.h>
#include <QXXMLMarshalling/model/Value.h>

#include <compare>
#include <cstddef>
#include <initializer_list>
#include <iterator>
#include <type_traits>
#include <utility>
#include <vector>

namespace qx {

class QX_API Array final : public Object {
public:
    Array() = default;
    Array(std::initializer_list<Value> items);
    explicit Array(std::vector<Value> items);
    ~Array() override;
    static void* operator new(std::size_t size);
    static void operator delete(void* memory) noexcept;

    // Walks the items, by random access, and notices changes. Item is `Value` or `const Value`.
    template <class Item>
    class Walk;
    using Iterator = Walk<const Value>;
    Iterator begin() const;
    Iterator end() const;
    Walk<Value> begin();
    Walk<Value> end();

    std::size_t count() const noexcept { return _items.size(); }
    bool isEmpty() const noexcept { return _items.empty(); }
    // References are good until the next change.
    const Value& at(std::size_t index) const;
    Value& at(std::size_t index) { return const_cast<Value&>(std::as_const(*this).at(index)); }
    const Value& operator[](std::size_t index) const { return at(index); }
    Value& operator[](std::size_t index) { return at(index); }
    // The last item, or null.
    Value lastObject() const;
    bool contains(const Value& value) const;

    void add(Value value);
    void insert(std::size_t index, Value value);
    void replace(std::size_t index, Value value);
    void remove(std::size_t index);
    void removeAll();
    void reserve(std::size_t count) { _items.reserve(count); }
    // A new array with the same items.
    [[nodiscard]] Ref<Array> mutableCopy() const;

    String description() const override;
    // "(", one item a line, ")".
    String descriptionWithLocale(const Object* locale, std::size_t indent) const override;
    // Same items in the same order.
    bool isEqual(const Object& other) const override;
    // The values that the items have under the key, the null marker for null; "@count" the count.
    Value valueForKey(Key key) const override;
    // Sets the value on every item that is not null.
    SetOutcome trySetValueForKey(const Value& value, Key key) override;

protected:
    const Class& describedClass() const override;

private:
    void checkUnchanged(std::size_t changes) const;
    void changed() noexcept { ++_changes; }

    std::vector<Value, detail::ObjectAllocator<Value>> _items;
    std::size_t _changes = 0;
};

template <class Item>
class Array::Walk {
public:
    using iterator_category = std::random_access_iterator_tag;
    using value_type = Value;
    using difference_type = std::ptrdiff_t;
    using pointer = Item*;
    using reference = Item&;
    using Owner = std::conditional_t<std::is_const_v<Item>, const Array, Array>;

    Walk() noexcept = default;
    Walk(Owner& array, std::size_t index) noexcept
        : _array(&array), _index(index), _changes(array._changes) {}

    Item& operator*() const { return _array->at(_index); }
    Item* operator->() const { return &**this; }
    Item& operator[](difference_type distance) const { return *(*this + distance); }

    Walk& operator++() {
        check();
        ++_index;
        return *this;
    }
    Walk operator++(int) { return std::exchange(*this, *this + 1); }
    Walk& operator--() { return *this -= 1; }
    Walk operator--(int) { return std::exchange(*this, *this - 1); }
    Walk& operator+=(difference_type distance) {
        check();
        _index += static_cast<std::size_t>(distance);
        return *this;
    }
    Walk& operator-=(difference_type distance) { return *this += -distance; }
    friend Walk operator+(Walk walk, difference_type distance) { return walk += distance; }
    friend Walk operator+(difference_type distance, Walk walk) { return walk += distance; }
    friend Walk operator-(Walk walk, difference_type distance) { return walk -= distance; }
    friend difference_type operator-(const Walk& a, const Walk& b) noexcept {
        return static_cast<difference_type>(a._index) - static_cast<difference_type>(b._index);
    }

    friend bool operator==(const Walk& a, const Walk& b) {
        a.check();
        return a._index == b._index;
    }
    friend std::strong_ordering operator<=>(const Walk& a, const Walk& b) noexcept {
        return a._index <=> b._index;
    }

private:
    void check() const {
        if (_array != nullptr)
            _array->checkUnchanged(_changes);
    }

    Owner* _array = nullptr;
    std::size_t _index = 0;
    std::size_t _changes = 0;
};

inline Array::Iterator Array::begin() const { return {*this, 0}; }
inline Array::Iterator Array::end() const { return {*this, _items.size()}; }
inline Array::Walk<Value> Array::begin() { return {*this, 0}; }
inline Array::Walk<Value> Array::end() { return {*this, _items.size()}; }

} // namespace qx
