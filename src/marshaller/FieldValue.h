#pragma once

// A field's value as text and back, by the field's type.

#include <QXXMLMarshalling/model/Error.h>
#include <QXXMLMarshalling/model/Object.h>

#include "base/Scan.h"
#include "plan/FieldPlan.h"

namespace qx::detail {

// Converts a text by the field's type; any other value stays. Without a text there is no integer,
// but null. False with
//   -221  "<%@>: Unable to convert value to integer: %@"            (logged as a warning, too)
bool convertText(const FieldPlan& field, Value& value, Ref<Error>* error, bool isLogged);
// Whether texts of the field are converted at all.
inline bool convertsText(const FieldPlan& field) noexcept {
    return field.valueType == ValueType::boolean || field.valueType == ValueType::integer;
}

// Converts the value and sets it under the key. False with -221 and
//   -222  "Unable to set value: %@ for key: %@ in class: %@"
bool takeValue(Object& object, const FieldPlan& field, Key key, Value&& value, Ref<Error>* error,
               bool isLogged = true);

// The text as an item of a collection of a simple type; null with -221 as above.
Value itemOf(const FieldPlan& field, const Value& text, Ref<Error>* error, bool isLogged);

// The text under which a value is written: "true" or "false" for a boolean field, else the value's
// description. It needs the value as long as it is used.
class FieldText {
public:
    FieldText(const Value& value, ValueType type) : _value(value) {
        if (value.isString() && type != ValueType::boolean) [[likely]]
            _view = value.view();
        else
            describe(type);
    }
    FieldText(const FieldText&) = delete;
    FieldText& operator=(const FieldText&) = delete;

    std::string_view view() const noexcept { return _view; }
    bool isEmpty() const noexcept { return _view.empty(); }
    // The value's own where it is one.
    String string() const;

private:
    void describe(ValueType type);

    const Value& _value;
    std::string_view _view;
    String _description; // of what is neither text nor number
    RealText _digits;
};

} // namespace qx::detail
