#include "marshaller/FieldValue.h"

#include "base/Scan.h"
#include "base/Unicode.h"
#include "host/Log.h"
#include "marshaller/ObjectAccess.h"
#include "model/Errors.h"

#include <charconv>

namespace qx::detail {

namespace {

Value booleanOf(std::string_view text) {
    return unicode::equalIgnoringCase(text, "true") || unicode::equalIgnoringCase(text, "yes") ||
           text == "1";
}

// Null with -221 where there is no integer.
Value integerOf(const FieldPlan& field, const Value& text, Ref<Error>* error, bool isLogged) {
    if (const auto integer = scanInteger(text.view()))
        return *integer;
    if (isLogged)
        logWarningOrLine(errors::notAnInteger.message, field.xmlName(), text);
    fail(error, errors::notAnInteger, field.xmlName(), text);
    return nullptr;
}

} // namespace

bool convertText(const FieldPlan& field, Value& value, Ref<Error>* error, bool isLogged) {
    if (!value.isString())
        return true;
    if (field.valueType == ValueType::boolean) {
        value = booleanOf(value.view());
    } else if (field.valueType == ValueType::integer) {
        const bool isEmpty = value.view().empty();
        value = isEmpty ? Value() : integerOf(field, value, error, isLogged);
        return isEmpty || !value.isNull();
    }
    return true;
}

bool takeValue(Object& object, const FieldPlan& field, Key key, Value&& value, Ref<Error>* error,
               bool isLogged) {
    return convertText(field, value, error, isLogged) &&
           ObjectAccess::set(object, key, std::move(value), error);
}

Value itemOf(const FieldPlan& field, const Value& text, Ref<Error>* error, bool isLogged) {
    switch (field.valueType) {
    case ValueType::boolean:
        return booleanOf(text.view());
    case ValueType::integer:
        return integerOf(field, text, error, isLogged);
    default:
        return text;
    }
}

void FieldText::describe(ValueType type) {
    if (type == ValueType::boolean) {
        _view = _value.boolValue() ? "true" : "false";
    } else if (_value.kind() == Value::Kind::integer) {
        const auto end =
            std::to_chars(_digits.data(), _digits.data() + _digits.size(), _value.intValue()).ptr;
        _view = {_digits.data(), end};
    } else if (_value.kind() == Value::Kind::real) {
        _view = describeReal(_value.doubleValue(), _digits);
    } else {
        _description = _value.description();
        _view = _description;
    }
}

String FieldText::string() const {
    if (!_description.isNull())
        return _description;
    const std::string_view own = _value.view();
    return own.data() == _view.data() && _value.isString() ? _value.string() : String(_view);
}

} // namespace qx::detail
