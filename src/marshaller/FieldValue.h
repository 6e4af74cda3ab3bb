#pragma once

// A field's value as text and back, by the field's type.

#include <QXXMLMarshalling/model/Error.h>
#include <QXXMLMarshalling/model/Object.h>

#include "plan/FieldPlan.h"

namespace qx::detail {

// Converts a text by the field's type and sets it under the key; any other value is set as it is.
// False with
//   -221  "<%@>: Unable to convert value to integer: %@"            (logged as a warning, too)
//   -222  "Unable to set value: %@ for key: %@ in class: %@"
bool takeValue(Object& object, const FieldPlan& field, Key key, Value value, Ref<Error>* error);

// The text as an item of a collection of a simple type; null with -221 as above.
Value itemOf(const FieldPlan& field, const String& text, Ref<Error>* error);

inline String textOf(const Value& value, ValueType type) {
    if (type == ValueType::boolean)
        return value.boolValue() ? "true" : "false";
    return value.description();
}

} // namespace qx::detail
