#include "marshaller/FieldValue.h"

#include "base/Scan.h"
#include "host/Log.h"
#include "marshaller/ObjectAccess.h"
#include "model/Errors.h"

namespace qx::detail {

namespace {

Value booleanOf(const String& text) {
    return text.equalsIgnoringCase("true") || text.equalsIgnoringCase("yes") || text == "1";
}

} // namespace

bool takeValue(Object& object, const FieldPlan& field, Key key, Value value, Ref<Error>* error) {
    if (!value.isString() || !field.hasSimpleType())
        return ObjectAccess::set(object, key, std::move(value), error);
    const String text = value.string();
    if (field.valueType == ValueType::boolean)
        return ObjectAccess::set(object, key, booleanOf(text), error);
    if (text.isEmpty())
        return ObjectAccess::set(object, key, nullptr, error);
    if (const auto integer = scanInteger(text))
        return ObjectAccess::set(object, key, *integer, error);
    logWarningOrLine(errors::notAnInteger.message, field.xmlName(), text);
    return fail(error, errors::notAnInteger, field.xmlName(), text);
}

} // namespace qx::detail
