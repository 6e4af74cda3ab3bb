#pragma once

// An ordered, mutable list of values, shared by reference. Changing it while it is walked raises
// NSGenericException at the walk's next step; an index out of bounds raises NSRangeException.

#include <QXXMLMarshalling/detail/ObjectMemory.h>
#include <QXXMLMarshalling/model/Value.h>

#include <initializer_list>
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

    // Walks the items and notices changes.
    class Iterator {
    public:
        Iterator(const Array& array, std::size_t index) noexcept
            : _array(&array), _index(index), _changes(array._changes) {}
        const Value& operator*() const { return _array->at(_index); }
        Iterator& operator++() {
            _array->checkUnchanged(_changes);
            ++_index;
            return *this;
        }
        bool operator!=(const Iterator& end) const {
            _array->checkUnchanged(_changes);
            return _index < end._index;
        }

    private:
        const Array* _array;
        std::size_t _index;
        std::size_t _changes;
    };
    Iterator begin() const { return {*this, 0}; }
    Iterator end() const { return {*this, _items.size()}; }

    std::size_t count() const noexcept { return _items.size(); }
    bool isEmpty() const noexcept { return _items.empty(); }
    const Value& at(std::size_t index) const;
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
    Ref<Array> mutableCopy() const;

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

} // namespace qx
