#pragma once

// Which objects a type of member takes, and which it refuses: a list is checked before the first of
// its structs is moved, and an error can name the classes.

#include <QXXMLMarshalling/detail/StructObject.h>

#include <array>
#include <optional>
#include <set>
#include <span>
#include <unordered_set>
#include <variant>
#include <vector>

namespace qx::detail {

template <class T>
concept Struct = requires {
    typename ValueTraits<T>::IsStruct;
};

// A C++ type whose objects are taken; those of the types that derive from it only as it says.
struct TakenType {
    const std::type_info* type;
    bool orDerived;
};

// The names of the classes that were described for the types, sorted, with commas between them; of
// a type without any its C++ name.
QX_API String namesOfTypes(std::span<const TakenType> types);

// The rule of a type that takes objects; not defined for any other.
template <class T>
struct Takes;
template <class T>
concept TakesObjects = requires(const Value& value) {
    Takes<T>::takes(value);
};

template <Struct T>
struct Takes<T> {
    static void addTypes(std::vector<TakenType>& types) { types.push_back({&typeid(T), false}); }
    static bool takes(const Value& value) {
        const StructObject* held = structIn(value);
        return held != nullptr && held->type() == typeid(T);
    }
};

// By pointer structs of derived classes are taken, too, if they can be deleted and written as
// such.
template <class T, bool OrDerived>
struct TakesOwned {
    static void addTypes(std::vector<TakenType>& types) {
        types.push_back({&typeid(T), OrDerived});
    }
    static StructObject* taken(const Value& value) {
        StructObject* const held = structIn(value, typeid(T));
        return held != nullptr && (OrDerived || held->type() == typeid(T)) ? held : nullptr;
    }
    static bool takes(const Value& value) { return taken(value) != nullptr; }
};
template <Struct T>
struct Takes<std::unique_ptr<T>> : TakesOwned<T, std::has_virtual_destructor_v<T>> {};
template <Struct T>
struct Takes<std::shared_ptr<T>> : TakesOwned<T, std::is_polymorphic_v<T>> {};

template <std::derived_from<Object> T>
struct Takes<T*> {
    static void addTypes(std::vector<TakenType>& types) { types.push_back({&typeid(T), true}); }
    static bool takes(const Value& value) {
        return dynamic_cast<const T*>(value.object()) != nullptr;
    }
};
template <std::derived_from<Object> T>
struct Takes<Ref<T>> : Takes<T*> {};

template <TakesObjects T>
struct Takes<std::optional<T>> : Takes<T> {};

template <class... T>
requires(TakesObjects<T> || ...) struct Takes<std::variant<T...>> {
    static void addTypes(std::vector<TakenType>& types) {
        const auto addOne = [&]<class One>(std::type_identity<One>) {
            if constexpr (TakesObjects<One>)
                Takes<One>::addTypes(types);
        };
        (addOne(std::type_identity<T>()), ...);
    }
    static bool takes(const Value& value) {
        const auto takesIt = [&]<class One>(std::type_identity<One>) {
            if constexpr (TakesObjects<One>)
                return Takes<One>::takes(value);
            else
                return false;
        };
        return (takesIt(std::type_identity<T>()) || ...);
    }
};

// What a property knows of its type: whether it refuses the value as an object of a wrong class,
// and which classes it takes.
struct TakenObjects {
    // The object: the value, or the first such item of it. Null where there is none.
    Value (*firstRefused)(const Value& value);
    String (*names)();
};

template <class T>
inline constexpr bool isList = false;
template <class T>
inline constexpr bool isList<std::vector<T>> = true;
template <class T, std::size_t N>
inline constexpr bool isList<std::array<T, N>> = true;
template <class... T>
inline constexpr bool isList<std::set<T...>> = true;
template <class... T>
inline constexpr bool isList<std::unordered_set<T...>> = true;

// Of the items of an array; what is none is refused as a whole.
QX_API Value firstRefusedItem(const Value& list, Value (*firstRefused)(const Value& item));

template <class T>
struct RuleOf {
    static Value firstRefused(const Value& value) {
        if constexpr (isList<T>)
            return firstRefusedItem(value, &RuleOf<typename T::value_type>::firstRefused);
        else
            return value.isNullOrMarker() || !value.isObject() || Takes<T>::takes(value) ? Value()
                                                                                         : value;
    }
    static String names() {
        if constexpr (isList<T>) {
            return RuleOf<typename T::value_type>::names();
        } else {
            std::vector<TakenType> types;
            Takes<T>::addTypes(types);
            return namesOfTypes(types);
        }
    }
    static constexpr TakenObjects rule{&firstRefused, &names};
};

template <class T>
constexpr bool hasRule() {
    if constexpr (isList<T>)
        return hasRule<typename T::value_type>();
    else
        return TakesObjects<T>;
}
// Null for a type that takes no objects.
template <class T>
constexpr const TakenObjects* takenObjects() {
    if constexpr (hasRule<T>())
        return &RuleOf<T>::rule;
    else
        return nullptr;
}

} // namespace qx::detail
