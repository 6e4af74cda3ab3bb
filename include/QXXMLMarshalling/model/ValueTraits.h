#pragma once

// How a C++ type becomes a Value and back: the one place for such rules. Specialise it for types of
// your own:
//
//     template <> struct qx::ValueTraits<Colour> {
//         static qx::Value toValue(const Colour& colour) { return colour.name(); }
//         static bool fromValue(const qx::Value& value, Colour& colour);  // false: refused
//     };
//
// What the types here take, beside their own kind (anything else is refused):
//   bool                numbers; the texts true, yes, 1, false, no and 0 in any case
//   integers            numbers with an integral value in range; a text that is such a number
//   floating point      numbers; a text that is a number
//   std::string         text; numbers as their text
//   qx::String          the same, and null
//   qx::Key             text
//   enums               as their underlying integer
//   std::optional<T>    null for none, else as T
//   Ref<T>, T*          null and objects of class T; a T* is not kept alive
//   std::vector<T>      arrays whose items T takes; null is refused
//   Value               everything

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Value.h>

#include <concepts>
#include <limits>
#include <optional>
#include <string>
#include <type_traits>
#include <vector>

namespace qx {

template <class T>
struct ValueTraits;

// Strict readings of a value, false where it is none: no blanks are skipped but around a number.
QX_API bool readBoolean(const Value& value, bool& result);
QX_API bool readInteger(const Value& value, std::int64_t& result);
QX_API bool readUnsigned(const Value& value, std::uint64_t& result);
QX_API bool readReal(const Value& value, double& result);
QX_API bool readText(const Value& value, String& result);

template <>
struct ValueTraits<Value> {
    static Value toValue(const Value& value) { return value; }
    static bool fromValue(const Value& value, Value& result) {
        result = value;
        return true;
    }
};

template <>
struct ValueTraits<bool> {
    static Value toValue(bool value) { return value; }
    static bool fromValue(const Value& value, bool& result) { return readBoolean(value, result); }
};

template <std::signed_integral T>
struct ValueTraits<T> {
    static Value toValue(T value) { return value; }
    static bool fromValue(const Value& value, T& result) {
        std::int64_t read = 0;
        if (!readInteger(value, read) || !std::in_range<T>(read))
            return false;
        result = static_cast<T>(read);
        return true;
    }
};

// Beyond the signed 64-bit range the number goes as its decimal text, so that nothing is lost.
template <std::unsigned_integral T>
requires(!std::same_as<T, bool>) struct ValueTraits<T> {
    static Value toValue(T value) {
        if (!std::in_range<std::int64_t>(value))
            return std::to_string(value);
        return static_cast<std::int64_t>(value);
    }
    static bool fromValue(const Value& value, T& result) {
        std::uint64_t read = 0;
        if (!readUnsigned(value, read) || !std::in_range<T>(read))
            return false;
        result = static_cast<T>(read);
        return true;
    }
};

template <std::floating_point T>
struct ValueTraits<T> {
    static Value toValue(T value) { return value; }
    static bool fromValue(const Value& value, T& result) {
        double read = 0;
        if (!readReal(value, read))
            return false;
        result = static_cast<T>(read);
        return true;
    }
};

template <class T>
requires std::is_enum_v<T>
struct ValueTraits<T> {
    using Underlying = std::underlying_type_t<T>;
    static Value toValue(T value) {
        return ValueTraits<Underlying>::toValue(static_cast<Underlying>(value));
    }
    static bool fromValue(const Value& value, T& result) {
        Underlying read{};
        if (!ValueTraits<Underlying>::fromValue(value, read))
            return false;
        result = static_cast<T>(read);
        return true;
    }
};

template <>
struct ValueTraits<String> {
    static Value toValue(const String& value) { return value; }
    static bool fromValue(const Value& value, String& result) {
        if (value.isNull()) {
            result = String();
            return true;
        }
        return readText(value, result);
    }
};

template <>
struct ValueTraits<Key> {
    static Value toValue(Key value) { return value.string(); }
    static bool fromValue(const Value& value, Key& result) {
        if (!value.isString())
            return false;
        result = value.string();
        return true;
    }
};

template <>
struct ValueTraits<std::string> {
    static Value toValue(const std::string& value) { return value; }
    static bool fromValue(const Value& value, std::string& result) {
        String read;
        if (!readText(value, read))
            return false;
        result = read.str();
        return true;
    }
};

// For results only: a view has nowhere to keep what it is given.
template <>
struct ValueTraits<std::string_view> {
    static Value toValue(std::string_view value) { return value; }
};
template <>
struct ValueTraits<const char*> {
    static Value toValue(const char* value) { return value; }
};

template <std::derived_from<Object> T>
struct ValueTraits<Ref<T>> {
    static Value toValue(const Ref<T>& value) { return value; }
    static bool fromValue(const Value& value, Ref<T>& result) {
        Ref<T> object = value.as<T>();
        if (!object && !value.isNull())
            return false;
        result = std::move(object);
        return true;
    }
};

template <std::derived_from<Object> T>
struct ValueTraits<T*> {
    static Value toValue(const T* value) { return value; }
    static bool fromValue(const Value& value, T*& result) {
        T* object = dynamic_cast<T*>(value.object());
        if (object == nullptr && !value.isNull())
            return false;
        result = object;
        return true;
    }
};

template <class T>
struct ValueTraits<std::optional<T>> {
    static Value toValue(const std::optional<T>& value) {
        return value ? ValueTraits<T>::toValue(*value) : Value();
    }
    static bool fromValue(const Value& value, std::optional<T>& result) {
        if (value.isNull()) {
            result.reset();
            return true;
        }
        T read{};
        if (!ValueTraits<T>::fromValue(value, read))
            return false;
        result = std::move(read);
        return true;
    }
};

template <class T>
struct ValueTraits<std::vector<T>> {
    static Value toValue(const std::vector<T>& values) {
        auto array = make<Array>();
        array->reserve(values.size());
        for (const auto& value : values)
            array->add(ValueTraits<T>::toValue(value));
        return array;
    }
    static bool fromValue(const Value& value, std::vector<T>& result) {
        const auto array = value.as<Array>();
        if (!array)
            return false;
        std::vector<T> read;
        read.reserve(array->count());
        for (const Value& item : *array) {
            T element{};
            if (!ValueTraits<T>::fromValue(item, element))
                return false;
            read.push_back(std::move(element));
        }
        result = std::move(read);
        return true;
    }
};

} // namespace qx
