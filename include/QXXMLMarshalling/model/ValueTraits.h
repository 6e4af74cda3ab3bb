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
//   char                a text of one byte, or none for the zero character
//   other integers      numbers with an integral value in range; a text that is such a number
//   floating point      numbers; a text that is a number, NaN, INF or -INF
//   std::string         text; numbers as their text
//   qx::String          the same, and null
//   qx::Key             text
//   std::vector<std::byte>   base64 text
//   enums               as their underlying integer; with EnumNames (below) by name
//   std::optional<T>    null for none, else as T
//   Ref<T>, T*          null and objects of class T; a T* is not kept alive
//   std::vector<T>, std::set<T>, std::unordered_set<T>
//                       arrays whose items T takes; null is refused
//   std::array<T, N>    arrays of N such items
//   std::unique_ptr<T>, std::shared_ptr<T>
//                       null, and what T takes
//   std::variant<T...>  what one of the types takes, which are tried in order; null makes it
//                       std::monostate
//   plain structs       structs of that class (Boxed.h); by pointer, of derived classes too
//   Value               everything
//
// A type that has no traits and is a class counts as a plain struct: Class::define describes it.
//
// Dates, times and durations: DateTime.h.

#include <QXXMLMarshalling/detail/EnumNameTable.h>
#include <QXXMLMarshalling/detail/MemberName.h>
#include <QXXMLMarshalling/detail/ValueReading.h>
#include <QXXMLMarshalling/model/Boxed.h>
#include <QXXMLMarshalling/model/Value.h>

#include <concepts>
#include <cstddef>
#include <string>
#include <type_traits>
#include <vector>

namespace qx {

namespace detail {
template <class T>
inline constexpr bool mayBeStruct =
    std::is_class_v<T> && !std::derived_from<T, Object> && !isOfStandardLibrary<T>();
} // namespace detail

// A plain struct, in place of traits of its own.
template <class T>
struct ValueTraits {
    static_assert(
        detail::mayBeStruct<T>,
        "this type has no qx::ValueTraits and is no plain struct (those of dates and times "
        "stand in model/DateTime.h)");

    // A box with a copy; see detail::copyOf.
    static Value toValue(const T& value) { return detail::copyInBox(typeid(T), &value); }
    static Value toValue(T&& value) { return make<Boxed<T>>(std::move(value)); }
    // Refers to the struct, for as long as it lies there.
    static Value lend(const T& value) {
        const Class* known = nullptr;
        return detail::lentStruct(detail::wholeOf(value), {&typeid(T), &value}, known);
    }
    static bool fromValue(const Value& value, T& result) {
        return detail::takeStruct<T>(value, [&](T&& read) { result = std::move(read); });
    }
    struct IsStruct;
};

// The names of an enumeration's values, for those that documents hold by name. Specialise it:
//
//     template <> struct qx::EnumNames<Fix> {
//         static constexpr auto table =
//             std::to_array<qx::EnumName<Fix>>({{Fix::none, "none"}, {Fix::d2, "2d"}});
//     };
//
// Texts are compared exactly, the first of several names of one value is the one that is written;
// text that is no name, and numbers of no named value, are refused. A value without a name is
// written as its number.
template <class E>
struct EnumName {
    E value;
    std::string_view name;
};
template <class E>
struct EnumNames;

template <class T>
concept Enumeration = std::is_enum_v<T>;
template <class T>
concept NamedEnumeration = Enumeration<T> && requires {
    EnumNames<T>::table;
};

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
    static bool fromValue(const Value& value, bool& result) {
        return detail::readBoolean(value, result);
    }
};

template <>
struct ValueTraits<char> {
    static Value toValue(char value) { return std::string_view(&value, value != '\0' ? 1 : 0); }
    static bool fromValue(const Value& value, char& result) {
        String read;
        if (!detail::readText(value, read) || read.size() > 1)
            return false;
        result = *read.c_str();
        return true;
    }
};

template <std::signed_integral T>
struct ValueTraits<T> {
    static Value toValue(T value) { return value; }
    static bool fromValue(const Value& value, T& result) {
        std::int64_t read = 0;
        if (!detail::readInteger(value, read) || !std::in_range<T>(read))
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
        if (!detail::readUnsigned(value, read) || !std::in_range<T>(read))
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
        if (!detail::readReal(value, read))
            return false;
        result = static_cast<T>(read);
        return true;
    }
};

// By name where the class that has it was given names (ClassBuilder::names), else by number.
template <Enumeration T>
struct ValueTraits<T> {
    using Underlying = std::underlying_type_t<T>;
    static Value toValue(T value) {
        const auto* names = detail::namesOf<T>.load(std::memory_order_acquire);
        if (const Key name = detail::nameOf(names, toNumber(value)); !name.isNull())
            return name.string();
        return ValueTraits<Underlying>::toValue(static_cast<Underlying>(value));
    }
    static bool fromValue(const Value& value, T& result) {
        if (const auto* names = detail::namesOf<T>.load(std::memory_order_acquire)) {
            std::int64_t number = 0;
            if (!detail::findNumber(*names, value, number))
                return false;
            result = static_cast<T>(number);
            return true;
        }
        Underlying read{};
        if (!ValueTraits<Underlying>::fromValue(value, read))
            return false;
        result = static_cast<T>(read);
        return true;
    }

private:
    static std::int64_t toNumber(T value) { return static_cast<std::int64_t>(value); }
};

template <NamedEnumeration T>
struct ValueTraits<T> {
    using Underlying = std::underlying_type_t<T>;
    static Value toValue(T value) {
        for (const EnumName<T>& known : EnumNames<T>::table)
            if (known.value == value)
                return known.name;
        return ValueTraits<Underlying>::toValue(static_cast<Underlying>(value));
    }
    static bool fromValue(const Value& value, T& result) {
        for (const EnumName<T>& known : EnumNames<T>::table) {
            if (value.isString() ? value.view() == known.name : value == toNumber(known.value)) {
                result = known.value;
                return true;
            }
        }
        return false;
    }

private:
    static Value toNumber(T value) {
        return ValueTraits<Underlying>::toValue(static_cast<Underlying>(value));
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
        return detail::readText(value, result);
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
        if (value.isString()) {
            result.assign(value.view());
            return true;
        }
        String read;
        if (!detail::readText(value, read))
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
        T* object = detail::castTo<T>(value.object());
        if (object == nullptr && !value.isNull())
            return false;
        result = object;
        return true;
    }
};

template <>
struct ValueTraits<std::vector<std::byte>> {
    static Value toValue(const std::vector<std::byte>& bytes) { return detail::textOfBytes(bytes); }
    static bool fromValue(const Value& value, std::vector<std::byte>& result) {
        return detail::readBytes(value, result);
    }
};

} // namespace qx

// Types that are made of others, and where the traits are used next.
#include <QXXMLMarshalling/detail/ContainerTraits.h>
#include <QXXMLMarshalling/model/KeyedValue.h>
