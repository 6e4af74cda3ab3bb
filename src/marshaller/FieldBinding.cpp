#include "marshaller/FieldBinding.h"

#include <QXXMLMarshalling/model/Array.h>

#include "model/Errors.h"

namespace qx::detail {

namespace {

// In the order of BindingKind.
constexpr const FieldBinding* bindings[] = {&attributeBinding, &textBinding, &elementBinding,
                                            &flattenedBinding, &automaticBinding};

const FieldBinding& bindingOf(const FieldPlan& field) {
    return *bindings[static_cast<std::size_t>(field.kind)];
}

} // namespace

const FieldBinding& bindingAsElement(const FieldPlan& field) noexcept {
    return field.isContainer ? elementBinding : flattenedBinding;
}

// A kind that found nothing and complains of nothing does not fail the object.
bool Unmarshalling::readField(const FieldPlan& field, const Target& target, ErrorSlot error) {
    if (field.isCollection())
        return readCollection(*this, field, target, error);
    Ref<Error> problem;
    if (bindingOf(field).read(*this, field, target, &problem) || !problem)
        return true;
    if (error != nullptr)
        *error = std::move(problem);
    return false;
}

bool Marshalling::writeField(const FieldPlan& field, const WrittenElement& element, Object& object,
                             ErrorSlot error) {
    ObjectAccess::Held held = ObjectAccess::get(object, field.key);
    if (held.value().isNull() && field.isContainer) {
        if (!field.isRequired)
            return true;
        if (field.valueType == ValueType::other || field.valueType == ValueType::string)
            return fail(error, errors::requiredValueMissing, field.key.string(), &object);
        held = {false, held.keepsZero()};
    }
    const Value& value = held.value();
    if (const auto array = value.as<Array>())
        return writeCollection(*this, field, element, *array, error);
    if (value.isNull() || (value.isObject() && value.classNameForMarshalling().isNull()))
        return fail(error, errors::noClassName, object.isa().name());
    _omitsZero = _marshaller->omitsZeroAttributes() && !held.keepsZero();
    const bool isWritten = bindingOf(field).write(*this, field, element, value, error);
    if (_trace != nullptr)
        _trace->hold(value);
    return isWritten;
}

} // namespace qx::detail
