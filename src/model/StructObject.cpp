#include <QXXMLMarshalling/detail/StructObject.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/detail/ObjectMemory.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>

#include "model/ClassVersion.h"
#include "model/TypeNames.h"

#include <array>
#include <unordered_set>

namespace qx::detail {

// What only the objects of structs ask of a class.
struct StructInternals {
    static const StructType& typeOf(const Class& described) { return *described._structType; }
    // The type to which StructType::toBase leads.
    static const std::type_info& baseOf(const Class& described) {
        return *described._superclassType;
    }
    static void assign(const Class& known, const StructObject& object) { known.assignTo(object); }
    static Value withClass(const Ref<StructObject>& object, const Class* known) {
        if (known != nullptr)
            known->assignTo(*object);
        return object;
    }
};

StructObject::StructObject(const Class& known, void* place) noexcept
    : StructObject(known.type(), place, false) {
    StructInternals::assign(known, *this);
}

// A reading makes a box for each struct: cut from blocks, they halve what it allocates.
void* StructObject::operator new(std::size_t size) { return ObjectMemory::allocate(size); }

void* StructObject::operator new(std::size_t size, std::align_val_t alignment) {
    return ::operator new(size, alignment);
}

void StructObject::operator delete(void* memory) noexcept { ObjectMemory::release(memory); }

void StructObject::operator delete(void* memory, std::align_val_t alignment) noexcept {
    ::operator delete(memory, alignment);
}

void* StructObject::upcast(void* place, const std::type_info& type) const {
    const Class* from = &isa();
    while (place != nullptr && from != nullptr && from->isStruct()) {
        if (from->type() == type)
            return place;
        const auto toBase = StructInternals::typeOf(*from).toBase;
        place = toBase != nullptr ? toBase(place) : nullptr;
        if (place != nullptr && StructInternals::baseOf(*from) == type)
            return place; // nobody has to describe it
        from = from->superclass();
    }
    return nullptr;
}

StructObject* structIn(const Value& value) {
    Object* const object = value.object();
    if (object == nullptr || !object->isa().isStruct())
        return nullptr;
    auto* const held = static_cast<StructObject*>(object);
    return held->as(held->type()) != nullptr ? held : nullptr;
}

StructObject* structIn(const Value& value, const std::type_info& type) {
    StructObject* const held = structIn(value);
    return held != nullptr && held->as(type) != nullptr ? held : nullptr;
}

namespace {

template <class Taken>
Taken takeWhole(StructObject& held, Taken (*StructType::*function)(void*)) {
    const auto move = StructInternals::typeOf(held.isa()).*function;
    if (move == nullptr)
        return nullptr;
    const auto source = held.isMovable() ? Ref<StructObject>(&held) : copyOf(held);
    if (!source)
        return nullptr;
    Taken taken = move(source->as(source->type()));
    source->clear();
    return taken;
}

bool copyMembers(const StructObject& from, StructObject& to) {
    for (const Class* type = &from.isa(); type->isStruct(); type = type->superclass())
        for (const Property& property : type->ownProperties())
            if (property.set != nullptr &&
                !property.set(property, to, property.get(property, from)))
                return false;
    return true;
}

[[noreturn]] void raiseNoCopy(const std::type_info& type) {
    throw Exception(Exception::invalidArgument,
                    String::concat({"a value of type ", readableName(type),
                                    " cannot be copied: it is not described in full"}));
}

} // namespace

void* takeOnHeap(StructObject& held) { return takeWhole(held, &StructType::onHeap); }

std::shared_ptr<void> takeShared(StructObject& held) {
    auto owner = held.sharedOwner();
    return owner ? owner : takeWhole(held, &StructType::shared);
}

Ref<StructObject> copyOf(const StructObject& held) {
    auto copy = held.isa().create().as<StructObject>();
    return copy && copyMembers(held, *copy) ? copy : nullptr;
}

Value copyInBox(const std::type_info& type, const void* place) {
    const StructObject lent(type, place);
    if (lent.isa().isStruct())
        if (auto copy = copyOf(lent))
            return copy;
    raiseNoCopy(type);
}

std::vector<Value> heldIn(const Value& value) {
    std::vector<Value> held{value};
    std::unordered_set<const Object*> seen; // an array may stand in itself
    for (std::size_t i = 0; i < held.size(); ++i)
        if (const auto array = held[i].as<Array>(); array && seen.insert(array.get()).second)
            held.insert(held.end(), array->begin(), array->end());
    return held;
}

namespace {

// As Class::described, which takes a lock: what this thread has found lately holds as long as no
// class is described or forgotten.
const Class* describedLately(const std::type_info& type) {
    struct Found {
        const std::type_info* type = nullptr;
        std::uint64_t version = 0;
        const Class* described = nullptr;
    };
    constexpr std::size_t count = 16;
    thread_local std::array<Found, count> latest;
    Found& found = latest[reinterpret_cast<std::uintptr_t>(&type) / sizeof(type) % count];
    const std::uint64_t version = classVersion();
    if (found.type != &type || found.version != version)
        found = {&type, version, Class::described(type)};
    return found.described;
}

// The class of the place that can be handled as an object: the whole struct, or else its base.
StructPlace describedPlace(StructPlace whole, StructPlace base, const Class*& known) {
    if (known != nullptr && known->type() == *whole.type)
        return whole;
    known = describedLately(*whole.type);
    if (known != nullptr || *whole.type == *base.type)
        return whole;
    known = describedLately(*base.type);
    return base;
}

} // namespace

Value lentStruct(StructPlace whole, StructPlace base, const Class*& known) {
    const StructPlace lent = describedPlace(whole, base, known);
    return StructInternals::withClass(make<StructObject>(*lent.type, lent.place), known);
}

Value sharedStruct(StructPlace whole, StructPlace base, const std::shared_ptr<const void>& owner) {
    const Class* known = nullptr;
    const StructPlace shared = describedPlace(whole, base, known);
    std::shared_ptr<void> place(std::const_pointer_cast<void>(owner),
                                const_cast<void*>(shared.place));
    return StructInternals::withClass(make<SharedStruct>(*shared.type, std::move(place)), known);
}

bool TakeOver::mergeStructs(StructPlace held, StructPlace fresh, bool isShared) {
    if (*held.type != *fresh.type)
        return false;
    StructObject taking(*held.type, held.place);
    StructObject taken(*fresh.type, fresh.place);
    return mergeStructs(taking, taken, isShared);
}

} // namespace qx::detail
