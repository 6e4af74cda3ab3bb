#pragma once

// How the parts of a class description (Property.h) are made from members: each accessor becomes a
// captureless function pointer. Hosts use them through Class::define (Class.h).

#include <QXXMLMarshalling/detail/StructPlacing.h>
#include <QXXMLMarshalling/detail/TakeOver.h>
#include <QXXMLMarshalling/detail/TakenTexts.h>
#include <QXXMLMarshalling/model/Property.h>
#include <QXXMLMarshalling/model/ValueTraits.h>

#include <cstring>
#include <functional>
#include <tuple>
#include <type_traits>
#include <typeinfo>
#include <utility>
#include <vector>

namespace qx::detail {

// A type of member that stands for several keys, whatever the key is that it is described with:
// `count`, `keys[count]`, and static functions get<I>(const T&), a value, and set<I>(T&, value),
// false where it is refused.
template <class T>
struct MemberKeys;

// A class before it is published.
struct ClassDraft {
    Key name;
    const std::type_info* type = nullptr;
    const std::type_info* superclass = nullptr;
    const StructType* structType = nullptr; // null: of a class that derives from Object
    Ref<Object> (*create)() = nullptr;      // null: not without arguments
    bool setsByProperty = false;            // see Class::setsByProperty
    std::vector<Property> properties{};
    std::vector<Operation> operations{};
    std::vector<Operation> classOperations{};
};

// Whether setting a value by key is what Object makes of it: T overrides nothing of that.
template <class T>
constexpr bool setsByProperty() {
    if constexpr (requires {
                      &T::trySetValueForKey;
                      &T::willChangeValueForKey;
                      &T::didChangeValueForKey;
                  }) {
        using Announce = void (Object::*)(Key);
        using Set = SetOutcome (Object::*)(const Value&, Key);
        return std::is_same_v<decltype(&T::trySetValueForKey), Set> &&
               std::is_same_v<decltype(&T::willChangeValueForKey), Announce> &&
               std::is_same_v<decltype(&T::didChangeValueForKey), Announce>;
    }
    return false;
}

// Publishes the draft, under its name too unless `listed` is false (a class that no mapping may
// name). The class that holds the type afterwards: the first one that was published for it;
// `isTaken` tells whether it is this one.
QX_API const Class& publish(ClassDraft draft, bool listed = true, bool* isTaken = nullptr);

// Raise NSInvalidArgumentException.
[[noreturn]] QX_API void raiseArgumentCount(Selector selector, const Class& receiver,
                                            std::size_t given);
[[noreturn]] QX_API void raiseNoInstance(Selector selector, const Class& receiver);
[[noreturn]] QX_API void raiseArgument(Selector selector, const Class& receiver,
                                       const Value& value);

template <class M>
struct Signature;
template <class R, class C, class... A>
struct Signature<R (C::*)(A...)> {
    using Result = R;
    using Arguments = std::tuple<A...>;
};
template <class R, class C, class... A>
struct Signature<R (C::*)(A...) const> : Signature<R (C::*)(A...)> {};
template <class R, class C, class... A>
struct Signature<R (C::*)(A...) noexcept> : Signature<R (C::*)(A...)> {};
template <class R, class C, class... A>
struct Signature<R (C::*)(A...) const noexcept> : Signature<R (C::*)(A...)> {};
template <class R, class... A>
struct Signature<R (*)(A...)> {
    using Result = R;
    using Arguments = std::tuple<A...>;
};
template <class R, class... A>
struct Signature<R (*)(A...) noexcept> : Signature<R (*)(A...)> {};

template <class T>
using Stored = std::remove_cvref_t<T>;

template <class T>
Value toValue(T&& value) {
    return ValueTraits<Stored<T>>::toValue(std::forward<T>(value));
}

// The object as a T, or the T that it holds; null where the struct was moved out. From a virtual
// base only a dynamic cast leads there.
template <class T>
const T* instanceIn(const Object& object) {
    if constexpr (requires { static_cast<const T*>(&object); })
        return static_cast<const T*>(&object);
    else if constexpr (std::derived_from<T, Object>)
        return dynamic_cast<const T*>(&object);
    else
        return static_cast<const T*>(static_cast<const StructObject&>(object).as(typeid(T)));
}
template <class T>
T* instanceIn(Object& object) {
    return const_cast<T*>(instanceIn<T>(std::as_const(object)));
}

template <class T, auto Member>
using Gotten = decltype(std::invoke(Member, std::declval<const T&>()));

template <class T, auto Member>
Value getMember(const Property&, const Object& object) {
    const T* instance = instanceIn<T>(object);
    return instance != nullptr ? toValue(std::invoke(Member, *instance)) : Value();
}

template <class T, auto Member>
Value lendMember(const Property&, const Object& object) {
    const T* instance = instanceIn<T>(object);
    return instance != nullptr ? lend(std::invoke(Member, *instance)) : Value();
}

template <class T, auto Member>
bool setMember(const Property&, Object& object, const Value& value) {
    using V = Stored<decltype(std::declval<T&>().*Member)>;
    T* instance = instanceIn<T>(object);
    return instance != nullptr && ValueTraits<V>::fromValue(value, instance->*Member);
}

template <class T, auto Member>
void takeOverMember(const Property&, Object& held, Object& fresh, TakeOver& way) {
    using V = Stored<decltype(std::declval<T&>().*Member)>;
    T* instance = instanceIn<T>(held);
    T* other = instanceIn<T>(fresh);
    if (instance != nullptr && other != nullptr)
        MemberTakeOver<V>::apply(instance->*Member, other->*Member, way);
}

// For numbers, enumerations and the like: others, which may hold objects, go as values.
template <class T, auto Getter, auto Setter>
void takeOverAccessors(const Property&, Object& held, Object& fresh, TakeOver&) {
    T* instance = instanceIn<T>(held);
    const T* other = instanceIn<T>(fresh);
    if (instance != nullptr && other != nullptr)
        std::invoke(Setter, *instance, std::invoke(Getter, *other));
}

template <auto Setter>
using SetterValue =
    Stored<std::tuple_element_t<0, typename Signature<decltype(Setter)>::Arguments>>;

template <class T, auto Setter>
bool callSetter(const Property&, Object& object, const Value& value) {
    using V = SetterValue<Setter>;
    T* instance = instanceIn<T>(object);
    return instance != nullptr && convert<V>(value, [&](V&& converted) {
               std::invoke(Setter, *instance, std::move(converted));
           });
}

// What is known of a property by the type that its getter or member has.
template <class T, auto Member>
void describeGetter(Property& property) {
    using V = Stored<Gotten<T, Member>>;
    property.get = &getMember<T, Member>;
    if constexpr (Lendable<V> && std::is_lvalue_reference_v<Gotten<T, Member>>)
        property.lend = &lendMember<T, Member>;
    property.keepsZero = isOptional<V> || !std::derived_from<T, Object>;
    property.objects = takenObjects<V>();
    property.texts = &takenTexts<V>;
}

template <class T, auto Member>
Property memberProperty(std::string_view name) {
    Property property;
    property.key = name;
    describeGetter<T, Member>(property);
    if constexpr (std::is_member_object_pointer_v<decltype(Member)>) {
        using M = std::remove_reference_t<decltype(std::declval<T&>().*Member)>;
        if constexpr (!std::is_const_v<M>) {
            property.set = &setMember<T, Member>;
            property.takeOver = &takeOverMember<T, Member>;
            property.placing = structPlacing<T, Member>();
        }
    }
    return property;
}

// Part of a member that has keys of its own (MemberKeys).
template <class T, auto Member, auto Get, auto Set>
Property partProperty(Key key) {
    Property property;
    property.key = key;
    property.get = [](const Property&, const Object& object) -> Value {
        const T* instance = instanceIn<T>(object);
        return instance != nullptr ? Value(std::invoke(Get, instance->*Member)) : Value();
    };
    property.set = [](const Property&, Object& object, const Value& value) {
        T* instance = instanceIn<T>(object);
        return instance != nullptr && std::invoke(Set, instance->*Member, value);
    };
    return property;
}

template <class T, auto Member>
concept HasKeys = std::is_member_object_pointer_v<decltype(Member)> && requires {
    MemberKeys<Stored<decltype(std::declval<T&>().*Member)>>::count;
};

// The properties of a member with keys of its own.
template <class T, auto Member>
void addParts(std::vector<Property>& properties) {
    using Keys = MemberKeys<Stored<decltype(std::declval<T&>().*Member)>>;
    [&]<std::size_t... I>(std::index_sequence<I...>) {
        (properties.push_back(
             partProperty<T, Member, &Keys::template get<I>, &Keys::template set<I>>(
                 Keys::keys[I])),
         ...);
    }
    (std::make_index_sequence<Keys::count>{});
}

template <class T, auto Getter, auto Setter>
Property accessorProperty(std::string_view name) {
    Property property;
    property.key = name;
    describeGetter<T, Getter>(property);
    property.set = &callSetter<T, Setter>;
    using V = Stored<Gotten<T, Getter>>;
    if constexpr (std::is_arithmetic_v<V> || std::is_enum_v<V>)
        property.takeOver = &takeOverAccessors<T, Getter, Setter>;
    property.objects = takenObjects<SetterValue<Setter>>();
    property.texts = &takenTexts<SetterValue<Setter>>;
    return property;
}

template <class P>
void store(P pointer, Property::Member& member) {
    static_assert(sizeof(P) <= Property::memberSize);
    std::memcpy(member.data(), &pointer, sizeof(P));
}
template <class P>
P load(const Property::Member& member) {
    P pointer;
    std::memcpy(&pointer, member.data(), sizeof(P));
    return pointer;
}

// Accessors that overload resolution chose by the value type V; the setter's parameter is S.
template <class T, class V, class S>
Property boundProperty(std::string_view name, V (T::*getter)() const, void (T::*setter)(S)) {
    using Getter = V (T::*)() const;
    using Setter = void (T::*)(S);
    Property property;
    property.key = name;
    store(getter, property.getter);
    store(setter, property.setter);
    property.get = [](const Property& self, const Object& object) -> Value {
        const T* instance = instanceIn<T>(object);
        return instance != nullptr ? toValue((instance->*load<Getter>(self.getter))()) : Value();
    };
    property.set = [](const Property& self, Object& object, const Value& value) {
        T* instance = instanceIn<T>(object);
        return instance != nullptr && convert<Stored<V>>(value, [&](Stored<V>&& converted) {
                   (instance->*load<Setter>(self.setter))(std::move(converted));
               });
    };
    property.keepsZero = isOptional<Stored<V>> || !std::derived_from<T, Object>;
    property.objects = takenObjects<Stored<V>>();
    property.texts = &takenTexts<Stored<V>>;
    return property;
}

// Calls `function` with `leading` and then the arguments converted to the types from First on.
template <std::size_t First, auto Function, class... Leading>
Value call(Selector selector, const Class& receiver, std::span<const Value> arguments,
           Leading&... leading) {
    using S = Signature<decltype(Function)>;
    constexpr std::size_t count = std::tuple_size_v<typename S::Arguments> - First;
    if (arguments.size() != count)
        raiseArgumentCount(selector, receiver, arguments.size());
    return [&]<std::size_t... I>(std::index_sequence<I...>)->Value {
        std::tuple<Stored<std::tuple_element_t<First + I, typename S::Arguments>>...> converted;
        [[maybe_unused]] const auto convert = [&]<class V>(const Value& value, V& result) {
            if (!ValueTraits<V>::fromValue(value, result))
                raiseArgument(selector, receiver, value);
        };
        (convert(arguments[I], std::get<I>(converted)), ...);
        if constexpr (std::is_void_v<typename S::Result>) {
            std::invoke(Function, leading..., std::move(std::get<I>(converted))...);
            return {};
        } else {
            return toValue(std::invoke(Function, leading..., std::move(std::get<I>(converted))...));
        }
    }
    (std::make_index_sequence<count>{});
}

// Whether the arguments convert to the types from First on.
template <std::size_t First, auto Function>
bool takes(std::span<const Value> arguments) {
    using Types = typename Signature<decltype(Function)>::Arguments;
    constexpr std::size_t count = std::tuple_size_v<Types> - First;
    if (arguments.size() != count)
        return false;
    return [&]<std::size_t... I>(std::index_sequence<I...>) {
        [[maybe_unused]] const auto converts = []<class V>(const Value& value, V result) {
            return ValueTraits<V>::fromValue(value, result);
        };
        return (converts(arguments[I], Stored<std::tuple_element_t<First + I, Types>>{}) && ...);
    }
    (std::make_index_sequence<count>{});
}

template <class F>
constexpr bool returnsValue = !std::is_void_v<typename Signature<F>::Result>;

template <class T, auto Function>
Operation instanceOperation(std::string_view name) {
    Operation operation;
    operation.selector = name;
    operation.returnsValue = returnsValue<decltype(Function)>;
    constexpr std::size_t first = std::is_member_function_pointer_v<decltype(Function)> ? 0 : 1;
    operation.takes = &takes<first, Function>;
    operation.invoke = [](Selector selector, const Class& receiver, Object* object,
                          std::span<const Value> arguments) {
        T* instance = instanceIn<T>(*object);
        if (instance == nullptr)
            raiseNoInstance(selector, receiver);
        return call<first, Function>(selector, receiver, arguments, *instance);
    };
    return operation;
}

template <auto Function>
constexpr bool takesClass() {
    using Arguments = typename Signature<decltype(Function)>::Arguments;
    if constexpr (std::tuple_size_v<Arguments> == 0)
        return false;
    else
        return std::is_same_v<std::tuple_element_t<0, Arguments>, const Class&>;
}

template <auto Function>
Operation classOperation(std::string_view name) {
    Operation operation;
    operation.selector = name;
    operation.returnsValue = returnsValue<decltype(Function)>;
    constexpr std::size_t first = takesClass<Function>() ? 1 : 0;
    operation.takes = &takes<first, Function>;
    operation.invoke = [](Selector selector, const Class& receiver, Object*,
                          std::span<const Value> arguments) {
        if constexpr (first == 1)
            return call<first, Function>(selector, receiver, arguments, receiver);
        else
            return call<first, Function>(selector, receiver, arguments);
    };
    return operation;
}

} // namespace qx::detail
