#pragma once

// What key-value access carries: null, a boolean, a 64-bit integer, a double, a string or an
// object. 16 bytes; copying shares strings and objects. A text of at most 14 bytes that comes as a
// view, a C string or a std::string lies in the value itself.
//
// Conversions, and what any other kind answers:
//   boolValue()    numbers: not zero. Strings: after blanks, a sign and zeros, one of Y y T t 1-9.
//                  Objects: true, the null marker false. Null: false.
//   intValue()     numbers: cut towards zero, saturating at 64 bits. Strings: the integer at the
//                  start, else 0. Everything else: 0.
//   doubleValue()  likewise.
//   string()       the text of a string; the null string for every other kind.
//   view()         the same without a String: bytes of the value, as long as it stays and keeps
//                  them.
//   object()       the object; null for every other kind.
//   get<T>()       what qx::ValueTraits<T> makes of it (ValueTraits.h), and nothing else: raises.
//   tryGet<T>()    the same in a std::optional: none.
//
// Values have an order, so that they can be sorted: null, numbers by value, strings by bytes,
// objects. NaN comes before the other numbers, and no object before another.

#include <QXXMLMarshalling/base/String.h>
#include <QXXMLMarshalling/detail/ValueCell.h>
#include <QXXMLMarshalling/model/Object.h>

#include <array>
#include <compare>
#include <concepts>
#include <cstdint>
#include <optional>
#include <string_view>
#include <typeinfo>
#include <utility>

namespace qx {

template <class T>
struct ValueTraits;

namespace detail {
template <class T>
std::optional<T> copiedAs(const Value& value); // ContainerTraits.h
class LentText;
[[noreturn]] QX_API void raiseNotOfType(const Value& value, const std::type_info& type);
} // namespace detail

class QX_API Value {
public:
    using Kind = ValueKind;

    Value() noexcept = default;
    Value(std::nullptr_t) noexcept {}
    Value(std::same_as<bool> auto value) noexcept : _cell(static_cast<bool>(value)) {}
    // Unsigned values above the signed 64-bit range become the nearest double.
    template <std::integral Integer>
    requires(!std::same_as<Integer, bool>) Value(Integer value)
    noexcept : _cell(cellOf(value)) {}
    Value(std::floating_point auto value) noexcept : _cell(static_cast<double>(value)) {}
    // A null string gives a null value.
    Value(const String& text) noexcept : Value(String(text)) {}
    Value(String&& text) noexcept;
    // A null pointer gives a null value.
    Value(const char* text) : Value(text != nullptr ? Value(std::string_view(text)) : Value()) {}
    Value(std::string_view text)
        : _cell(text.size() <= Cell::mostInside ? Cell::inside(text) : counted(text)) {}
    Value(const std::string& text) : Value(std::string_view(text)) {}
    // A null reference gives a null value.
    template <std::derived_from<Object> T>
    Value(const Ref<T>& object) noexcept : Value(object.get()) {}
    template <std::derived_from<Object> T>
    Value(Ref<T>&& object) noexcept : _cell(static_cast<const Object*>(object.detach())) {}
    Value(const Object* object) noexcept;

    Value(const Value& other) : _cell(other._cell) {
        if (other.kind() >= Kind::string)
            share(other);
    }
    Value(Value&& other) noexcept : _cell(std::exchange(other._cell, Cell())) {}
    ~Value() {
        if (kind() >= Kind::string && _cell.form() == Form::counted)
            releaseCounted();
    }
    Value& operator=(Value other) noexcept {
        std::swap(_cell, other._cell);
        return *this;
    }

    Kind kind() const noexcept { return _cell.kind(); }
    bool isNull() const noexcept { return kind() == Kind::null; }
    // True for booleans, integers and doubles.
    bool isNumber() const noexcept { return kind() >= Kind::boolean && kind() <= Kind::real; }
    bool isString() const noexcept { return kind() == Kind::string; }
    bool isObject() const noexcept { return kind() == Kind::object; }
    // True for null and for the null marker (Null.h).
    bool isNullOrMarker() const noexcept;

    bool boolValue() const noexcept;
    std::int64_t intValue() const noexcept;
    double doubleValue() const noexcept;
    String string() const;
    std::string_view view() const noexcept {
        return isString() ? viewOfText() : std::string_view();
    }
    Object* object() const noexcept { return isObject() ? _cell.object() : nullptr; }
    // The object as class T, or null where the value is no object of that class.
    template <class T>
    Ref<T> as() const noexcept {
        return Ref<T>(detail::castTo<T>(object()));
    }
    // The value as a T of its own, structs copied: what a property of type T would hold. None where
    // the property would refuse it.
    template <class T>
    [[nodiscard]] std::optional<T> tryGet() const {
        static_assert(sizeof(ValueTraits<T>) != 0,
                      "include <QXXMLMarshalling/model/ValueTraits.h>");
        return detail::copiedAs<T>(*this);
    }
    // The same; raises NSInvalidArgumentException where tryGet gives none.
    template <class T>
    T get() const {
        if (std::optional<T> taken = tryGet<T>())
            return *std::move(taken);
        detail::raiseNotOfType(*this, typeid(T));
    }

    // The value as text. A boolean gives "1" or "0", an integer its decimal form, a double the
    // shortest text that reads back equal (without an exponent from 1e-5 to below 1e17), an object
    // its description(), null "(null)".
    String description() const;
    // The same inside a printed collection, whose items stand `indent` levels deep.
    String descriptionWithLocale(const Object* locale, std::size_t indent) const;

    // Numbers by value across kinds, strings by text, objects by Object::isEqual.
    bool isEqual(const Value& other) const;
    // The same object, the same text in memory, or equal numbers of one kind; null is null.
    bool isSameAs(const Value& other) const noexcept;
    friend bool operator==(const Value& a, const Value& b) { return a.isEqual(b); }
    // The order described above. Values that are not equal may have the same place in it.
    friend std::weak_ordering operator<=>(const Value& a, const Value& b) noexcept {
        return a.compare(b);
    }

    // The class name under which the value is looked up when it is marshalled: an object's own
    // answer; for strings and numbers a name in angle brackets that no mapping can hold; null for
    // null.
    String classNameForMarshalling() const;

private:
    friend class detail::LentText;

    using Cell = detail::ValueCell;
    using Form = Cell::Form;

    explicit Value(Cell cell) noexcept : _cell(cell) {}
    template <std::integral Integer>
    static Cell cellOf(Integer value) noexcept {
        if constexpr (std::unsigned_integral<Integer> && sizeof(Integer) == 8)
            if (value > static_cast<Integer>(INT64_MAX))
                return Cell(static_cast<double>(value));
        return Cell(static_cast<std::int64_t>(value));
    }
    static Cell counted(std::string_view text);

    std::string_view viewOfText() const noexcept {
        return _cell.form() == Form::counted ? _cell.text()->view() : _cell.view();
    }
    void share(const Value& other);
    void releaseCounted() noexcept;
    std::weak_ordering compare(const Value& other) const noexcept;

    Cell _cell;
};
static_assert(sizeof(Value) == 16);

template <class... Arguments>
Value Object::perform(Selector selector, const Arguments&... arguments) {
    const std::array<Value, sizeof...(Arguments)> values{Value(arguments)...};
    return performWithArguments(selector, values);
}

} // namespace qx
