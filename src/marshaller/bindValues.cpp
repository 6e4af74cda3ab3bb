#include "marshaller/Unmarshalling.h"

#include "base/Scan.h"
#include "host/Log.h"
#include "model/Errors.h"

using qx::String;
using qx::Value;

// The wrapper of a location is not counted as consumed, and the attribute counts for the element
// that is bound even where it stands on the wrapper: what is read so is kept as unknown XML too.
bool Unmarshalling::bindAsAttribute(const FieldPlan& field, const Target& target, ErrorSlot error) {
    String value;
    const BindingPlan* tried = nullptr;
    for (const BindingPlan& binding : field.bindings) {
        tried = &binding;
        const qx::XMLElement* holder = &target.source.element();
        if (!binding.location.isEmpty()) {
            const auto found = target.source.find(binding.location);
            if (found.several)
                return qx::fail(error, qx::errors::tooManyElementsForField, binding.name,
                                &target.source.element());
            holder = found.first;
        }
        if (holder != nullptr)
            value = holder->attributeValue(binding.name);
        if (!value.isNull())
            break;
    }
    if (!value.isNull()) {
        target.bound.attributes.add(tried->name);
        return takeValue(target.object, field, field.key, std::move(value), error);
    }
    if (field.isRequired)
        return qx::fail(error, qx::errors::requiredAttributeMissing,
                        tried != nullptr ? tried->name : String(), &target.source.element());
    return false;
}

// A child of one of the bind names gives its text, the element itself where there is none.
bool Unmarshalling::bindAsText(const FieldPlan& field, const Target& target, ErrorSlot error) {
    const qx::XMLElement* holder = &target.source.element();
    bool isChild = false;
    for (const BindingPlan& binding : field.bindings) {
        if (binding.bindTo.isEmpty())
            continue;
        const auto found = target.source.find(binding.bindTo);
        if (found.several)
            return qx::fail(error, qx::errors::tooManyChildren, binding.bindTo,
                            &target.source.element());
        if (found.first != nullptr) {
            target.bound.fields.add(binding.bindTo);
            holder = found.first;
            isChild = true;
            break;
        }
    }
    if (!_budget.takeText(*holder, error))
        return false;
    const String text = isChild ? holder->stringValue() : target.source.stringValue();
    if (!text.isEmpty())
        return takeValue(target.object, field, field.key, text, error);
    if (field.isRequired)
        return qx::fail(error, qx::errors::requiredTextMissing, field.key.string(),
                        &target.source.element());
    return false;
}

namespace {

Value booleanOf(const String& text) {
    return text.equalsIgnoringCase("true") || text.equalsIgnoringCase("yes") || text == "1";
}

} // namespace

bool Unmarshalling::takeValue(qx::Object& object, const FieldPlan& field, qx::Key key, Value value,
                              ErrorSlot error) {
    if (!value.isString() || !field.hasSimpleType())
        return ObjectDoor::set(object, key, std::move(value), error);
    const String text = value.string();
    if (field.valueType == ValueType::boolean)
        return ObjectDoor::set(object, key, booleanOf(text), error);
    if (text.isEmpty())
        return ObjectDoor::set(object, key, nullptr, error);
    if (const auto integer = qx::scanInteger(text))
        return ObjectDoor::set(object, key, *integer, error);
    qx::logWarningOrLine(qx::errors::notAnInteger.message, field.xmlName, text);
    return qx::fail(error, qx::errors::notAnInteger, field.xmlName, text);
}
