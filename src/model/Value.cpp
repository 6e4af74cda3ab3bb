#include <QXXMLMarshalling/model/Value.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Null.h>

#include "base/Scan.h"
#include "base/WhiteSpace.h"
#include "model/TypeNames.h"

#include <algorithm>
#include <cmath>

namespace qx {

Value::Value(String&& text) noexcept : _cell(std::move(text).detach()) {}

Value::Value(const Object* object) noexcept : _cell(object) {
    if (object != nullptr)
        object->retain();
}

Value::Cell Value::counted(std::string_view text) { return Cell(String(text).detach()); }

// The cell is the other's already.
void Value::share(const Value& other) {
    if (isObject()) {
        _cell.object()->retain();
    } else if (_cell.form() == Form::counted) {
        _cell = Cell(String::shared(_cell.text()).detach());
    } else if (_cell.form() == Form::lent) {
        _cell = Cell();
        *this = Value(other.view());
    }
}

void Value::releaseCounted() noexcept {
    if (isObject())
        _cell.object()->release();
    else
        String::adopt(_cell.text());
}

String Value::string() const {
    if (!isString())
        return {};
    return _cell.form() == Form::counted ? String::shared(_cell.text()) : String(view());
}

bool Value::isNullOrMarker() const noexcept { return isNull() || object() == Null::marker(); }

namespace {

// What a text says as a yes or no: blanks, a sign and zeros are passed over.
bool textIsTrue(std::string_view text) {
    text = withoutLeadingWhite(text);
    if (text.starts_with('+') || text.starts_with('-'))
        text.remove_prefix(1);
    text.remove_prefix(std::min(text.find_first_not_of('0'), text.size()));
    return !text.empty() &&
           (std::string_view("YyTt").find(text.front()) != std::string_view::npos ||
            (text.front() >= '1' && text.front() <= '9'));
}

constexpr double twoTo63 = 9223372036854775808.0;

std::int64_t saturated(double value) {
    if (std::isnan(value))
        return 0;
    if (value >= twoTo63)
        return INT64_MAX;
    if (value < -twoTo63)
        return INT64_MIN;
    return static_cast<std::int64_t>(value);
}

// Exact, where a comparison of doubles would round the integer.
bool equal(std::int64_t integer, double real) {
    return std::trunc(real) == real && real >= -twoTo63 && real < twoTo63 &&
           static_cast<std::int64_t>(real) == integer;
}

} // namespace

bool Value::boolValue() const noexcept {
    switch (kind()) {
    case Kind::null:
        return false;
    case Kind::boolean:
        return _cell.boolean();
    case Kind::integer:
        return _cell.integer() != 0;
    case Kind::real:
        return _cell.real() != 0;
    case Kind::string:
        return textIsTrue(view());
    case Kind::object:
        return _cell.object() != Null::marker();
    }
    return false;
}

std::int64_t Value::intValue() const noexcept {
    switch (kind()) {
    case Kind::boolean:
        return _cell.boolean() ? 1 : 0;
    case Kind::integer:
        return _cell.integer();
    case Kind::real:
        return saturated(_cell.real());
    case Kind::string:
        return scanInteger(view()).value_or(0);
    case Kind::null:
    case Kind::object:
        return 0;
    }
    return 0;
}

double Value::doubleValue() const noexcept {
    switch (kind()) {
    case Kind::boolean:
        return _cell.boolean() ? 1 : 0;
    case Kind::integer:
        return static_cast<double>(_cell.integer());
    case Kind::real:
        return _cell.real();
    case Kind::string:
        return scanReal(view()).value_or(0);
    case Kind::null:
    case Kind::object:
        return 0;
    }
    return 0;
}

String Value::description() const {
    switch (kind()) {
    case Kind::null:
        return "(null)";
    case Kind::boolean:
        return _cell.boolean() ? "1" : "0";
    case Kind::integer:
        return std::to_string(_cell.integer());
    case Kind::real:
        return describeReal(_cell.real());
    case Kind::string:
        return string();
    case Kind::object:
        return _cell.object()->description();
    }
    return {};
}

String Value::descriptionWithLocale(const Object* locale, std::size_t indent) const {
    return isObject() ? _cell.object()->descriptionWithLocale(locale, indent) : description();
}

bool Value::isEqual(const Value& other) const {
    if (isNumber() && other.isNumber()) {
        const bool realHere = kind() == Kind::real;
        const bool realThere = other.kind() == Kind::real;
        if (realHere && realThere)
            return _cell.real() == other._cell.real();
        if (realHere)
            return equal(other.intValue(), _cell.real());
        if (realThere)
            return equal(intValue(), other._cell.real());
        return intValue() == other.intValue();
    }
    if (kind() != other.kind())
        return false;
    if (kind() == Kind::string)
        return view() == other.view();
    if (kind() == Kind::object)
        return _cell.object() == other._cell.object() ||
               _cell.object()->isEqual(*other._cell.object());
    return true;
}

namespace {

std::weak_ordering orderOfReals(double a, double b) {
    if (std::isnan(a) || std::isnan(b))
        return std::isnan(b) <=> std::isnan(a);
    return a < b   ? std::weak_ordering::less
           : b < a ? std::weak_ordering::greater
                   : std::weak_ordering::equivalent;
}

// Exact as above: what is cut off decides only where the whole numbers are the same.
std::weak_ordering order(std::int64_t integer, double real) {
    if (std::isnan(real) || real < -twoTo63)
        return std::weak_ordering::greater;
    if (real >= twoTo63)
        return std::weak_ordering::less;
    const auto whole = static_cast<std::int64_t>(real);
    return integer != whole ? integer <=> whole : orderOfReals(0, real - std::trunc(real));
}

} // namespace

std::weak_ordering Value::compare(const Value& other) const noexcept {
    if (isNumber() && other.isNumber()) {
        if (kind() == Kind::real)
            return other.kind() == Kind::real ? orderOfReals(_cell.real(), other._cell.real())
                                              : 0 <=> order(other.intValue(), _cell.real());
        return other.kind() == Kind::real ? order(intValue(), other._cell.real())
                                          : intValue() <=> other.intValue();
    }
    if (isString() && other.isString())
        return view() <=> other.view();
    // Booleans, integers and doubles have one place among the kinds.
    const auto place = [](const Value& value) {
        return value.isNumber() ? Kind::real : value.kind();
    };
    return place(*this) <=> place(other);
}

bool Value::isSameAs(const Value& other) const noexcept {
    if (kind() != other.kind() || _cell.form() != other._cell.form())
        return false;
    switch (kind()) {
    case Kind::null:
        return true;
    case Kind::boolean:
        return _cell.boolean() == other._cell.boolean();
    case Kind::integer:
        return _cell.integer() == other._cell.integer();
    case Kind::real:
        return _cell.real() == other._cell.real();
    case Kind::string:
        return _cell.form() >= Form::inside ? view() == other.view()
                                            : view().data() == other.view().data();
    case Kind::object:
        return _cell.object() == other._cell.object();
    }
    return false;
}

// The brackets keep these names from meeting a class name: no class of a mapping can be meant.
String Value::classNameForMarshalling() const {
    static const Key number("<number>");
    static const Key text("<string>");
    switch (kind()) {
    case Kind::null:
        return {};
    case Kind::boolean:
    case Kind::integer:
    case Kind::real:
        return number;
    case Kind::string:
        return text;
    case Kind::object:
        return _cell.object()->classNameForMarshalling();
    }
    return {};
}

void detail::raiseNotOfType(const Value& value, const std::type_info& type) {
    throw Exception(Exception::invalidArgument, String::concat({"the value ", value.description(),
                                                                " is no ", readableName(type)}));
}

} // namespace qx
