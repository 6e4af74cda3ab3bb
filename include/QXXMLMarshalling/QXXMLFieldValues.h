#pragma once

// A field's value as text and back, as the marshaller does it: for hosts that bind by themselves.

#include <QXXMLMarshalling/QXXMLFieldMapping.h>
#include <QXXMLMarshalling/model/Error.h>

// Converts the value by the field's type and sets it under the key. False with
//   -221  "<%@>: Unable to convert value to integer: %@"            (logged as a warning, too)
//   -222  "Unable to set value: %@ for key: %@ in class: %@"
QX_API bool TakeValueForKey(qx::Object& object, qx::Key key, const qx::Value& value,
                            const QXXMLFieldMapping& field, qx::Ref<qx::Error>* error = nullptr);

// The text under which a value is written: "true" or "false" for a field of type "boolean", else
// the value's description.
QX_API qx::String StringValueOfObjectWithMapping(const qx::Value& value,
                                                 const QXXMLFieldMapping& field);
