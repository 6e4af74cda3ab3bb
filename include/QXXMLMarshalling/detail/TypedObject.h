#pragma once

// What a call that asks for a C++ type makes of the object that was read.

#include <QXXMLMarshalling/model/Boxed.h>
#include <QXXMLMarshalling/model/Result.h>

#include <concepts>
#include <typeinfo>
#include <utility>

namespace qx::detail {

// -211 for an object that is not of that type.
QX_API Ref<Error> wrongClass(const Object& object, const std::type_info& type);

// A struct is moved out of its box.
template <class T>
ResultOf<T> typedObject(const Ref<Object>& object) {
    if constexpr (std::derived_from<T, Object>) {
        if (auto cast = object.template as<T>())
            return cast;
    } else if (auto box = object.template as<Boxed<T>>()) {
        return std::move(**box);
    }
    return wrongClass(*object, typeid(T));
}

// Of what read(&error) answers.
template <class T, std::invocable<Ref<Error>*> Read>
ResultOf<T> typedResult(Read read) {
    Ref<Error> error;
    const Ref<Object> object = read(&error);
    if (!object)
        return error;
    return typedObject<T>(object);
}

// What became of an object that was handed over: an error ends the reading.
struct Visited {
    bool goesOn;
    Ref<Error> error;
};

// Calls the visitor, which may answer whether it wants more.
template <class T, class Visit>
Visited visited(Visit& visit, const Ref<Object>& object) {
    auto result = typedObject<T>(object);
    if (!result)
        return {false, result.error()};
    if constexpr (std::is_void_v<decltype(visit(*std::move(result)))>) {
        visit(*std::move(result));
        return {true, nullptr};
    } else {
        return {static_cast<bool>(visit(*std::move(result))), nullptr};
    }
}

} // namespace qx::detail
