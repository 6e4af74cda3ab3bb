#pragma once

// How structs that are read are made where they belong, in a data member of another struct, instead
// of in a box that they are moved out of: one, or the items of a vector.

#include <QXXMLMarshalling/detail/ContainerTraits.h>

#include <memory>
#include <optional>

namespace qx::detail {

struct StructPlacing {
    const std::type_info* type; // of the structs
    // The member of the object, whose struct was not moved out: one struct, new, or a vector,
    // emptied, with room for so many.
    void* (*begin)(Object& owner, std::size_t count);
    // Of a vector: the place of a new item behind the others. Null where there is one struct.
    void* (*add)(void* list);
    void (*removeLast)(void* list);

    bool isList() const noexcept { return add != nullptr; }
};

template <class T, auto Member>
auto& memberOf(Object& owner) {
    return static_cast<T*>(static_cast<StructObject&>(owner).as(typeid(T)))->*Member;
}

template <class T>
concept PlacedStruct = Struct<T> && std::default_initializable<T> && std::movable<T>;

// The rules for a type of member; there are none for most.
template <class V>
struct MemberPlacing;

// A new one stands on the stack for a moment: large ones are made in boxes.
template <PlacedStruct V>
requires(sizeof(V) <= 4096) struct MemberPlacing<V> {
    template <class T, auto Member>
    static constexpr StructPlacing of{&typeid(V),
                                      [](Object& owner, std::size_t) -> void* {
                                          return std::addressof(memberOf<T, Member>(owner) = V());
                                      },
                                      nullptr, nullptr};
};

template <PlacedStruct V>
struct MemberPlacing<std::optional<V>> {
    template <class T, auto Member>
    static constexpr StructPlacing of{&typeid(V),
                                      [](Object& owner, std::size_t) -> void* {
                                          return std::addressof(
                                              memberOf<T, Member>(owner).emplace());
                                      },
                                      nullptr, nullptr};
};

template <PlacedStruct V>
struct MemberPlacing<std::vector<V>> {
    using List = std::vector<V>;
    template <class T, auto Member>
    static constexpr StructPlacing of{&typeid(V),
                                      [](Object& owner, std::size_t count) -> void* {
                                          List& list = memberOf<T, Member>(owner);
                                          list.clear();
                                          list.reserve(count);
                                          return &list;
                                      },
                                      [](void* list) -> void* {
                                          return std::addressof(
                                              static_cast<List*>(list)->emplace_back());
                                      },
                                      [](void* list) { static_cast<List*>(list)->pop_back(); }};
};

// Null where the member, or who has it, is of another kind.
template <class T, auto Member>
constexpr const StructPlacing* structPlacing() {
    using V = std::remove_cvref_t<decltype(std::declval<T&>().*Member)>;
    if constexpr (!std::derived_from<T, Object> && requires { sizeof(MemberPlacing<V>); })
        return &MemberPlacing<V>::template of<T, Member>;
    else
        return nullptr;
}

} // namespace qx::detail
