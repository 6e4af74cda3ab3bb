#pragma once

// What an operation gives, or the error that it ended with.
//
//     auto order = marshaller->readFile<Order>("order.xml");
//     if (!order)
//         return report(*order.error());
//     ship(order->lines);

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Error.h>

#include <optional>
#include <type_traits>
#include <utility>

namespace qx {

template <class T>
class [[nodiscard]] Result {
public:
    Result(T value) : _value(std::move(value)) {}
    // An error, never null.
    Result(Ref<Error> error) : _error(std::move(error)) {}

    bool hasValue() const noexcept { return _value.has_value(); }
    explicit operator bool() const noexcept { return hasValue(); }
    // Null where there is a value.
    const Ref<Error>& error() const noexcept { return _error; }

    // The value; without one it raises NSInternalInconsistencyException with the error's text.
    T& value() & { return checked(); }
    const T& value() const& { return const_cast<Result&>(*this).checked(); }
    T&& value() && { return std::move(checked()); }
    T& operator*() & { return checked(); }
    const T& operator*() const& { return const_cast<Result&>(*this).checked(); }
    T&& operator*() && { return std::move(checked()); }
    T* operator->() { return &checked(); }
    const T* operator->() const { return &const_cast<Result&>(*this).checked(); }
    template <class Other>
    T valueOr(Other&& other) && {
        return _value ? std::move(*_value) : static_cast<T>(std::forward<Other>(other));
    }

private:
    T& checked() {
        if (!_value)
            throw Exception(Exception::internalInconsistency, _error->description());
        return *_value;
    }

    std::optional<T> _value;
    Ref<Error> _error;
};

// What is given of a T: an object of a class that derives from Object in a Ref, a struct itself.
template <class T>
using ResultOf = Result<std::conditional_t<std::is_base_of_v<Object, T>, Ref<T>, T>>;

} // namespace qx
