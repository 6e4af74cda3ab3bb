#pragma once

// The parts of a class description, as Class hands them out: a program that shows or edits objects
// of any class walks over them. They are made by Class::define.

#include <QXXMLMarshalling/model/Object.h>
#include <QXXMLMarshalling/model/Value.h>

#include <array>
#include <cstddef>
#include <span>

namespace qx {

namespace detail {
class TakeOver;
struct StructPlacing;
struct TakenObjects;
struct TakenTexts;
} // namespace detail

// A property of instances. `get` and `set` are handed the property, for the members it stores.
struct Property {
    static constexpr std::size_t memberSize = 16;
    using Member = std::array<std::byte, memberSize>;

    Key key;
    Value (*get)(const Property&, const Object&) = nullptr;
    // False when the value is refused; null for a read-only property.
    bool (*set)(const Property&, Object&, const Value&) = nullptr;
    // What `get` answers, but that it refers to structs instead of copying them, for as long as
    // nobody changes the object. Null for a property without any.
    Value (*lend)(const Property&, const Object&) = nullptr;
    // Gives an object what another has, moved without a conversion; the objects that it holds stay
    // (TakeOver.h). Null where `set` has to do, with what `get` answers of the other.
    void (*takeOver)(const Property&, Object& held, Object& fresh, detail::TakeOver&) = nullptr;
    // How structs are made in it, where it is a data member that holds them by value.
    const detail::StructPlacing* placing = nullptr;
    // Whether zero, false and empty text are values like any other when the object is written.
    bool keepsZero = false;
    // Of which classes objects have to be; null for a property that takes no objects, or any.
    const detail::TakenObjects* objects = nullptr;
    // The texts that its type takes; null where nothing is known of them.
    detail::TakenTexts (*texts)() = nullptr;
    // Member function pointers that were only known at run time.
    Member getter{};
    Member setter{};
};

// An operation of instances (receiver: the object) or of the class object (receiver: null).
struct Operation {
    Selector selector;
    bool returnsValue = false;
    // Raises NSInvalidArgumentException for arguments that the function does not take.
    Value (*invoke)(Selector, const Class&, Object*, std::span<const Value>) = nullptr;
    // Whether the function takes these arguments: their number, and each as the type it wants.
    bool (*takes)(std::span<const Value>) = nullptr;
};

} // namespace qx
