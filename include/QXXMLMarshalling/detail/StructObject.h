#pragma once

// A plain struct as an object, for as long as key-value access and the marshaller handle it. The
// struct itself lies somewhere else: in a box (model/Boxed.h), in shared ownership, or in the
// member of its owner, to which a lent object refers while a document is written.
//
// Types have no descriptions here, only their type_info: what a class knows of its struct stands in
// its StructType.

#include <QXXMLMarshalling/model/Object.h>
#include <QXXMLMarshalling/model/Value.h>

#include <concepts>
#include <memory>
#include <new>
#include <type_traits>
#include <typeinfo>
#include <utility>

namespace qx {

namespace detail {

// What a class knows of the type of its structs: how one is moved into memory of its own, null
// where it cannot be moved, and how a pointer to one becomes a pointer to its base.
struct StructType {
    void* (*onHeap)(void* place); // the caller's to delete, as the type itself
    std::shared_ptr<void> (*shared)(void* place);
    void* (*toBase)(void* place); // null for a class without a base
};

class QX_API StructObject : public Object {
public:
    // Refers to the struct, which lives on somewhere else.
    StructObject(const std::type_info& type, const void* place) noexcept
        : StructObject(type, const_cast<void*>(place), false) {}
    // The same, of that class.
    StructObject(const Class& known, void* place) noexcept;
    static void* operator new(std::size_t size);
    static void* operator new(std::size_t size, std::align_val_t alignment);
    static void operator delete(void* memory) noexcept;
    static void operator delete(void* memory, std::align_val_t alignment) noexcept;

    const std::type_info& type() const noexcept { return *_type; }
    // The struct as that type: its own, or one that its class was derived from when it was
    // described. Null for any other, and for a struct that was moved out.
    void* as(const std::type_info& type) const {
        return type == *_type ? _place : upcast(_place, type);
    }
    // A pointer to a struct of this type as a pointer to that base.
    void* upcast(void* place, const std::type_info& type) const;

    // Whether the struct may be moved out, which nobody would notice.
    bool isMovable() const noexcept { return _isOwned && !isShared(); }
    // After it was moved out: the object is of no use any more.
    void clear() noexcept { _place = nullptr; }
    // The owner of a struct that lies in shared ownership; null for any other.
    virtual std::shared_ptr<void> sharedOwner() const { return nullptr; }

protected:
    StructObject(const std::type_info& type, void* place, bool isOwned) noexcept
        : _type(&type), _place(place), _isOwned(isOwned) {}

private:
    const std::type_info* _type;
    void* _place;
    const bool _isOwned;
};

class QX_API SharedStruct final : public StructObject {
public:
    SharedStruct(const std::type_info& type, std::shared_ptr<void> owner) noexcept
        : StructObject(type, owner.get(), false), _owner(std::move(owner)) {}
    std::shared_ptr<void> sharedOwner() const override { return _owner; }

private:
    std::shared_ptr<void> _owner;
};

// The struct that the value is; null where it is none, or one that was moved out.
QX_API StructObject* structIn(const Value& value);
// The same where it can be had as the type.
QX_API StructObject* structIn(const Value& value, const std::type_info& type);

// The struct in memory of its own, moved there or copied; not cast to a base. Null where it can be
// neither moved nor copied.
QX_API void* takeOnHeap(StructObject& held);
QX_API std::shared_ptr<void> takeShared(StructObject& held);

// A box with a copy of the struct. What is described is copied, member by member: whether the type
// has a copy constructor that compiles cannot be told. Null where the class cannot be created or a
// member not be copied.
QX_API Ref<StructObject> copyOf(const StructObject& held);
// The same of the struct at that place; raises NSInvalidArgumentException instead of null.
QX_API Value copyInBox(const std::type_info& type, const void* place);

// The whole object behind a reference, which may be one to a base.
struct StructPlace {
    const std::type_info* type;
    const void* place;
};
template <class T>
StructPlace wholeOf(const T& held) {
    if constexpr (std::is_polymorphic_v<T>)
        return {&typeid(held), dynamic_cast<const void*>(&held)};
    else
        return {&typeid(T), &held};
}
// A value that refers to the struct as a whole where its own type is described, else to the base.
// `known` is the class of the struct before, null at first.
QX_API Value lentStruct(StructPlace whole, StructPlace base, const Class*& known);
// The same, which shares the struct with the owner.
QX_API Value sharedStruct(StructPlace whole, StructPlace base,
                          const std::shared_ptr<const void>& owner);

// Hands a struct of that very type to `take`, which is called with a T&&; false for anything else,
// and for one that can be neither moved nor copied. What `take` throws passes through.
template <class T, class Take>
bool takeStruct(const Value& value, Take take) {
    StructObject* held = structIn(value);
    if (held == nullptr || held->type() != typeid(T))
        return false;
    Ref<StructObject> copy;
    if (!held->isMovable()) {
        copy = copyOf(*held);
        held = copy.get();
        if (held == nullptr)
            return false;
    }
    take(std::move(*static_cast<T*>(held->as(typeid(T)))));
    held->clear();
    return true;
}

// Calls with the object, with that of a Ref, which may be null, or with the struct as an object.
template <class T, class Call>
auto withObject(T& held, Call call) {
    if constexpr (std::derived_from<T, Object>) {
        return call(&held);
    } else if constexpr (requires {
                             { held.get() } -> std::convertible_to<Object*>;
                         }) {
        return call(held.get());
    } else {
        const StructPlace whole = wholeOf(held);
        StructObject object(*whole.type, whole.place);
        return call(&object);
    }
}

template <class T, class Base>
constexpr StructType structType() {
    StructType type{};
    if constexpr (std::move_constructible<T>) {
        type.onHeap = [](void* place) -> void* {
            return new T(std::move(*static_cast<T*>(place)));
        };
        type.shared = [](void* place) -> std::shared_ptr<void> {
            return std::make_shared<T>(std::move(*static_cast<T*>(place)));
        };
    }
    if constexpr (!std::is_void_v<Base>)
        type.toBase = [](void* place) -> void* {
            return static_cast<Base*>(static_cast<T*>(place));
        };
    return type;
}
template <class T, class Base>
inline constexpr StructType structTypeOf = structType<T, Base>();

} // namespace detail
} // namespace qx
