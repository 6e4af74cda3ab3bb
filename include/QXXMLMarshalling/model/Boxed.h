#pragma once

// A plain struct in an object of its own: what a document with such a root gives where no type is
// asked for, and how a struct becomes a value of a record or goes through key-value access.
//
//     if (auto order = marshaller->readFile("order.xml").as<qx::Boxed<Order>>())
//         ship(std::move(**order));
//     record->setValueForKey(qx::make<qx::Boxed<Address>>(address), "address");
//
// Its class is the one that was described for T, so it has that class's keys. A box that is set
// for a key of type T gives its struct away when nobody else holds the box, and is empty then: keys
// of an empty box read as null and take nothing.

#include <QXXMLMarshalling/detail/StructObject.h>

namespace qx {

template <class T>
class Boxed final : public detail::StructObject {
public:
    static_assert(!std::derived_from<T, Object>, "such a class needs no box");

    Boxed() : StructObject(typeid(T), &_value, true), _value() {}
    explicit Boxed(T value) : StructObject(typeid(T), &_value, true), _value(std::move(value)) {}

    T& operator*() noexcept { return _value; }
    const T& operator*() const noexcept { return _value; }
    T* operator->() noexcept { return &_value; }
    const T* operator->() const noexcept { return &_value; }

private:
    T _value;
};

} // namespace qx
