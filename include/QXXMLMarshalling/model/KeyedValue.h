#pragma once

// The value that an object, or a dictionary, has under a key, to be read and assigned:
//
//     order["city"] = "Bath";                            // order: a Ref, or an object itself
//     auto city = order["city"].get<std::string>();      // raises where it is none
//     auto count = order["count"].tryGet<int>();         // std::optional
//
// Of an object it is read and set by key-value access, as valueForKey and setValueForKey do, and
// raises what these raise; of a dictionary by get and set. It refers to the object without keeping
// it alive: use it in the expression that makes it.

#include <QXXMLMarshalling/model/Dictionary.h>
#include <QXXMLMarshalling/model/ValueTraits.h>

namespace qx {

namespace detail {
template <class T>
inline constexpr bool isKeyedValue = false;
template <class Owner, class K>
inline constexpr bool isKeyedValue<KeyedValue<Owner, K>> = true;
} // namespace detail

template <class Owner, class K>
class KeyedValue {
public:
    KeyedValue(Owner& owner, K key) noexcept : _owner(owner), _key(std::move(key)) {}
    KeyedValue(const KeyedValue&) = default;

    // Sets what ValueTraits make of it: a number, text, an enumeration's name, a struct in a box;
    // null for nullptr; of another KeyedValue its value.
    template <class T>
    requires(!std::is_const_v<Owner>) const KeyedValue& operator=(T&& value) const {
        using V = std::decay_t<T>;
        if constexpr (std::same_as<V, std::nullptr_t>) {
            return set(Value());
        } else if constexpr (detail::isKeyedValue<V>) {
            return set(value.value());
        } else {
            static_assert(sizeof(ValueTraits<V>) != 0); // so that Clang says nothing beyond theirs
            return set(ValueTraits<V>::toValue(std::forward<T>(value)));
        }
    }
    const KeyedValue& operator=(const KeyedValue& other) const { return set(other.value()); }

    // Null where there is none; raises what reading the key raises.
    Value value() const {
        if constexpr (isOfDictionary)
            return _owner.get(_key);
        else
            return _owner.valueForKey(_key);
    }
    operator Value() const { return value(); }
    // As of a Value, after reading it.
    template <class T>
    T get() const {
        return value().template get<T>();
    }
    template <class T>
    [[nodiscard]] std::optional<T> tryGet() const {
        return value().template tryGet<T>();
    }
    friend bool operator==(const KeyedValue& a, const Value& b) { return a.value() == b; }

private:
    static constexpr bool isOfDictionary = std::same_as<std::remove_const_t<Owner>, Dictionary>;

    const KeyedValue& set(const Value& value) const {
        if constexpr (!isOfDictionary)
            _owner.setValueForKey(value, _key);
        else if (value.isNull())
            _owner.remove(_key);
        else
            _owner.set(_key, value);
        return *this;
    }

    Owner& _owner;
    K _key;
};

inline KeyedValue<Object, Key> Object::operator[](Key key) { return {*this, key}; }
inline KeyedValue<const Object, Key> Object::operator[](Key key) const { return {*this, key}; }
inline KeyedValue<Dictionary, String> Dictionary::operator[](String key) {
    return {*this, std::move(key)};
}
inline KeyedValue<const Dictionary, String> Dictionary::operator[](String key) const {
    return {*this, std::move(key)};
}

} // namespace qx
