#pragma once

// Values by string key, shared by reference, in the order in which keys were first set: output is
// the same on every run. A key that was removed comes back to its place when it is set again,
// unless the dictionary has lost 1,000 keys more than it holds and then gained others. Changing it
// while it is walked raises NSGenericException at the walk's next step. Small dictionaries are
// scanned, larger ones carry an index.
//
//     for (const auto& [key, value] : *dictionary) …

#include <QXXMLMarshalling/detail/ObjectMemory.h>
#include <QXXMLMarshalling/model/Value.h>

#include <cstddef>
#include <iterator>
#include <memory>
#include <vector>

namespace qx {

class Array;

namespace detail {
struct DictionaryFilling;
}

class QX_API Dictionary final : public Object {
public:
    struct Entry {
        String key;
        Value value; // null: removed, the key keeps its place
        Entry() noexcept = default;
        Entry(const String& aKey, Value&& aValue) noexcept : key(aKey), value(std::move(aValue)) {}
    };

    Dictionary() noexcept = default;
    ~Dictionary() override;
    static void* operator new(std::size_t size);
    static void operator delete(void* memory) noexcept;

    // Walks the entries forwards and notices changes.
    class Iterator {
    public:
        using iterator_category = std::forward_iterator_tag;
        using value_type = Entry;
        using difference_type = std::ptrdiff_t;
        using pointer = const Entry*;
        using reference = const Entry&;

        Iterator() noexcept = default;
        Iterator(const Dictionary& dictionary, std::size_t index) noexcept
            : _dictionary(&dictionary), _index(index), _changes(dictionary._changes) {
            skipRemoved();
        }
        const Entry& operator*() const { return _dictionary->_entries[_index]; }
        const Entry* operator->() const { return &**this; }
        Iterator& operator++() {
            check();
            ++_index;
            skipRemoved();
            return *this;
        }
        Iterator operator++(int) {
            const Iterator before = *this;
            ++*this;
            return before;
        }
        friend bool operator==(const Iterator& a, const Iterator& b) {
            a.check();
            return a._index == b._index;
        }

    private:
        void check() const {
            if (_dictionary != nullptr)
                _dictionary->checkUnchanged(_changes);
        }
        void skipRemoved() noexcept {
            while (_index < _dictionary->_entries.size() &&
                   _dictionary->_entries[_index].value.isNull())
                ++_index;
        }

        const Dictionary* _dictionary = nullptr;
        std::size_t _index = 0;
        std::size_t _changes = 0;
    };
    Iterator begin() const { return {*this, _firstLive}; }
    Iterator end() const { return {*this, _entries.size()}; }

    std::size_t count() const noexcept { return _count; }
    bool isEmpty() const noexcept { return _count == 0; }

    // Null when absent.
    Value get(const String& key) const;
    // Raises NSUndefinedKeyException when absent. Good until the next change.
    const Value& at(const String& key) const;
    // Reads like get, sets like set; null removes the key: dictionary["city"] = "Bath". See
    // KeyedValue.h.
    KeyedValue<Dictionary, String> operator[](String key);
    KeyedValue<const Dictionary, String> operator[](String key) const;
    bool contains(const String& key) const { return find(key) != nullptr; }
    // The stored value without a copy; null pointer when absent. Good until the next change.
    const Value* find(const String& key) const noexcept;
    // A null key or a null value raises NSInvalidArgumentException.
    void set(const String& key, Value value);
    // Adds the value unless the key is there; false when it is, and then the value is left alone.
    // Neither may be null.
    bool add(const String& key, Value&& value);
    // Nothing happens when the key is absent.
    void remove(const String& key);
    void removeAll();
    // A new array of the keys, in order.
    Ref<Array> allKeys() const;
    Ref<Array> allValues() const;
    // A new dictionary with the same keys and the very same values.
    [[nodiscard]] Ref<Dictionary> mutableCopy() const;
    // How a dictionary is copied with the values inside it: null until the host installs a way.
    using DeepCopyFunction = Ref<Dictionary> (*)(const Dictionary&);
    static DeepCopyFunction deepCopyFunction() noexcept;
    static void setDeepCopyFunction(DeepCopyFunction function) noexcept;

    String description() const override;
    // "{", one "key = value;" a line, "}".
    String descriptionWithLocale(const Object* locale, std::size_t indent) const override;
    // Same keys with equal values, in any order.
    bool isEqual(const Object& other) const override;
    // The value under the key; a key that begins with "@" is one of the dictionary's own
    // properties: "@count", "@allKeys", "@allValues".
    Value valueForKey(Key key) const override;
    // Stores the value; null removes the key.
    SetOutcome trySetValueForKey(const Value& value, Key key) override;

protected:
    const Class& describedClass() const override;

private:
    friend struct detail::DictionaryFilling;

    std::size_t positionOf(const String& key) const noexcept;
    void checkUnchanged(std::size_t changes) const;
    // Under a key that is not there; neither may be null.
    void append(const String& key, Value&& value) {
        if (_entries.size() >= fewEntries) [[unlikely]]
            return appendToMany(key, std::move(value));
        if (_entries.capacity() == 0)
            _entries.reserve(usualSize);
        _entries.emplace_back(key, std::move(value));
        ++_count;
    }
    void appendToMany(const String& key, Value&& value);
    void makeRoom();
    void passRemoved() noexcept;
    void changed() noexcept { ++_changes; }

    static constexpr std::size_t usualSize = 4;  // most records hold no more
    static constexpr std::size_t fewEntries = 8; // up to so many there is no index

    using Entries = std::vector<Entry, detail::ObjectAllocator<Entry>>;
    using Index = std::vector<std::uint32_t>; // see NameIndex.h

    std::uint32_t _firstLive = 0; // the entries before it are removed ones
    Entries _entries;
    std::unique_ptr<Index> _index; // null while there are few entries
    std::uint32_t _count = 0;
    std::uint32_t _changes = 0;
};

} // namespace qx
