#pragma once

// ValueTraits of types that are made of others: std::optional, pointers that own, variants and
// containers. Included by ValueTraits.h. Each may have two ways to a value: `toValue`, which copies
// structs, and `lend`, which refers to those that lie in it; `lend` is there where it differs.

#include <QXXMLMarshalling/detail/TakenObjects.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/ValueTraits.h>

#include <memory>

namespace qx {

namespace detail {

template <class T>
concept Lendable = requires(const T& value) {
    ValueTraits<T>::lend(value);
};

// What `lend` of the traits gives, else what `toValue` does.
template <class T>
Value lend(const T& value) {
    if constexpr (Lendable<T>)
        return ValueTraits<T>::lend(value);
    else
        return ValueTraits<T>::toValue(value);
}

template <class T>
inline constexpr bool isOptional = false;
template <class T>
inline constexpr bool isOptional<std::optional<T>> = true;

// Hands the value as a T&& to `take`; false where it is refused. A struct is moved only once.
template <class T, class Take>
bool convert(const Value& value, Take take) {
    if constexpr (Struct<T>) {
        return takeStruct<T>(value, take);
    } else {
        T converted{};
        if (!ValueTraits<T>::fromValue(value, converted))
            return false;
        take(std::move(converted));
        return true;
    }
}

// The value and the items of its arrays, at any depth: a box that is held twice keeps its struct.
QX_API std::vector<Value> heldIn(const Value& value);

// What Value::tryGet gives.
template <class T>
std::optional<T> copiedAs(const Value& value) {
    [[maybe_unused]] std::vector<Value> held;
    if constexpr (Lendable<T>)
        held = heldIn(value);
    std::optional<T> result;
    convert<T>(value, [&](T&& read) { result.emplace(std::move(read)); });
    return result;
}

} // namespace detail

template <class T>
struct ValueTraits<std::optional<T>> {
    static Value toValue(const std::optional<T>& value) {
        return value ? ValueTraits<T>::toValue(*value) : Value();
    }
    static Value toValue(std::optional<T>&& value) {
        return value ? ValueTraits<T>::toValue(std::move(*value)) : Value();
    }
    static Value lend(const std::optional<T>& value) requires detail::Lendable<T> {
        return value ? detail::lend(*value) : Value();
    }
    static bool fromValue(const Value& value, std::optional<T>& result) {
        if (value.isNull()) {
            result.reset();
            return true;
        }
        return detail::convert<T>(value, [&](T&& read) { result = std::move(read); });
    }
};

namespace detail {

template <class Pointer>
struct OwnerTraits {
    using T = typename Pointer::element_type;
    static Value lend(const Pointer& owner) requires Lendable<T> {
        return owner ? detail::lend(*owner) : Value();
    }
};

} // namespace detail

template <class T>
struct ValueTraits<std::unique_ptr<T>> : detail::OwnerTraits<std::unique_ptr<T>> {
    static Value toValue(const std::unique_ptr<T>& owner) {
        if (!owner)
            return {};
        if constexpr (detail::Struct<T>) {
            const detail::StructPlace whole = detail::wholeOf(*owner);
            return detail::copyInBox(*whole.type, whole.place);
        } else {
            return ValueTraits<T>::toValue(*owner);
        }
    }
    static bool fromValue(const Value& value, std::unique_ptr<T>& result) {
        if (value.isNull()) {
            result.reset();
            return true;
        }
        if constexpr (detail::Struct<T>) {
            auto* held = detail::Takes<std::unique_ptr<T>>::taken(value);
            void* whole = held != nullptr ? detail::takeOnHeap(*held) : nullptr;
            if (whole == nullptr)
                return false;
            result.reset(static_cast<T*>(held->upcast(whole, typeid(T))));
            return true;
        } else {
            return detail::convert<T>(
                value, [&](T&& read) { result = std::make_unique<T>(std::move(read)); });
        }
    }
};

template <class T>
struct ValueTraits<std::shared_ptr<T>> : detail::OwnerTraits<std::shared_ptr<T>> {
    // A struct is shared by the value.
    static Value toValue(const std::shared_ptr<T>& owner) {
        if (!owner)
            return {};
        if constexpr (detail::Struct<T>)
            return detail::sharedStruct(detail::wholeOf(*owner), {&typeid(T), owner.get()}, owner);
        else
            return ValueTraits<T>::toValue(*owner);
    }
    static bool fromValue(const Value& value, std::shared_ptr<T>& result) {
        if (value.isNull()) {
            result.reset();
            return true;
        }
        if constexpr (detail::Struct<T>) {
            auto* held = detail::Takes<std::shared_ptr<T>>::taken(value);
            auto owner = held != nullptr ? detail::takeShared(*held) : nullptr;
            if (!owner)
                return false;
            auto* const whole = static_cast<T*>(held->upcast(owner.get(), typeid(T)));
            result = std::shared_ptr<T>(std::move(owner), whole);
            return true;
        } else {
            return detail::convert<T>(
                value, [&](T&& read) { result = std::make_shared<T>(std::move(read)); });
        }
    }
};

template <>
struct ValueTraits<std::monostate> {
    static Value toValue(std::monostate) { return {}; }
    static bool fromValue(const Value& value, std::monostate&) { return value.isNull(); }
};

template <class... T>
struct ValueTraits<std::variant<T...>> {
    using Variant = std::variant<T...>;
    static Value toValue(const Variant& value) {
        return std::visit([](const auto& held) { return valueOf(held); }, value);
    }
    static Value toValue(Variant&& value) {
        return std::visit([](auto&& held) { return valueOf(std::move(held)); }, std::move(value));
    }
    static Value lend(const Variant& value) requires(detail::Lendable<T> || ...) {
        return std::visit([](const auto& held) { return detail::lend(held); }, value);
    }
    static bool fromValue(const Value& value, Variant& result) {
        const auto tryOne = [&]<class One>(std::type_identity<One>) {
            return detail::convert<One>(
                value, [&](One&& read) { result.template emplace<One>(std::move(read)); });
        };
        return (tryOne(std::type_identity<T>()) || ...);
    }

private:
    template <class Held>
    static Value valueOf(Held&& held) {
        return ValueTraits<std::remove_cvref_t<Held>>::toValue(std::forward<Held>(held));
    }
};

namespace detail {

template <class Container>
using ItemOf = typename std::remove_cvref_t<Container>::value_type;

// Each item as ValueTraits give it; moved out of a container that is no longer needed.
template <class Container>
Value arrayOf(Container&& values) {
    using T = ItemOf<Container>;
    auto array = make<Array>();
    array->reserve(values.size());
    for (auto&& value : values) {
        if constexpr (std::is_lvalue_reference_v<Container>)
            array->add(ValueTraits<T>::toValue(value));
        else
            array->add(ValueTraits<T>::toValue(std::move(value)));
    }
    return array;
}

// Structs of one type look their class up together.
template <class Container>
Value lentArray(const Container& values) {
    using T = ItemOf<Container>;
    auto array = make<Array>();
    array->reserve(values.size());
    [[maybe_unused]] const Class* known = nullptr;
    for (const T& value : values) {
        if constexpr (Struct<T>)
            array->add(lentStruct(wholeOf(value), {&typeid(T), &value}, known));
        else
            array->add(lend(value));
    }
    return array;
}

// Hands each item to `take`; false where one is refused. No struct is moved before it is sure that
// all are of a class that is taken.
template <class T, class Take>
bool readItems(const Array& array, Take take) {
    if constexpr (Lendable<T> && TakesObjects<T>) {
        for (const Value& item : array)
            if ((Struct<T> || item.isObject()) && !Takes<T>::takes(item))
                return false;
    }
    for (const Value& item : array)
        if (!convert<T>(item, take))
            return false;
    return true;
}

template <class Set>
struct SetTraits {
    static Value toValue(const Set& values) { return arrayOf(values); }
    static bool fromValue(const Value& value, Set& result) {
        const auto array = value.as<Array>();
        Set read;
        if (!array || !readItems<typename Set::value_type>(
                          *array, [&](auto&& element) { read.insert(std::move(element)); }))
            return false;
        result = std::move(read);
        return true;
    }
};

} // namespace detail

template <class T>
struct ValueTraits<std::vector<T>> {
    static Value toValue(const std::vector<T>& values) { return detail::arrayOf(values); }
    static Value toValue(std::vector<T>&& values) { return detail::arrayOf(std::move(values)); }
    static Value lend(const std::vector<T>& values) requires detail::Lendable<T> {
        return detail::lentArray(values);
    }
    static bool fromValue(const Value& value, std::vector<T>& result) {
        const auto array = value.as<Array>();
        if (!array)
            return false;
        std::vector<T> read;
        read.reserve(array->count());
        if (!detail::readItems<T>(*array, [&](T&& element) { read.push_back(std::move(element)); }))
            return false;
        result = std::move(read);
        return true;
    }
};

template <class T, std::size_t N>
struct ValueTraits<std::array<T, N>> {
    static Value toValue(const std::array<T, N>& values) { return detail::arrayOf(values); }
    static Value toValue(std::array<T, N>&& values) { return detail::arrayOf(std::move(values)); }
    static Value lend(const std::array<T, N>& values) requires detail::Lendable<T> {
        return detail::lentArray(values);
    }
    static bool fromValue(const Value& value, std::array<T, N>& result) {
        const auto array = value.as<Array>();
        std::array<T, N> read{};
        std::size_t count = 0;
        if (!array || array->count() != N ||
            !detail::readItems<T>(*array, [&](T&& element) { read[count++] = std::move(element); }))
            return false;
        result = std::move(read);
        return true;
    }
};

template <class T, class Less>
struct ValueTraits<std::set<T, Less>> : detail::SetTraits<std::set<T, Less>> {};
template <class T, class Hash, class Equal>
struct ValueTraits<std::unordered_set<T, Hash, Equal>>
    : detail::SetTraits<std::unordered_set<T, Hash, Equal>> {};

// What a marshaller writes as it writes a plain struct: one, or what holds one.
template <class T>
concept WritableStruct =
    std::is_class_v<T> && !std::convertible_to<const T&, Value> && detail::Lendable<T>;

// What a marshaller can read into: an object, a Ref to one, or a plain struct that can be changed.
template <class T>
concept Reloadable = std::convertible_to<T&, Object&> || requires(T& reference) {
    { reference.get() } -> std::convertible_to<Object*>;
} ||(std::is_lvalue_reference_v<T> && !std::is_const_v<std::remove_reference_t<T>> &&
     detail::Struct<std::remove_cvref_t<T>>);

} // namespace qx
