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
    if (field.isCollection()) {
        if (readCollection(*this, field, target, error))
            return true;
    } else {
        Ref<Error> problem;
        if (bindingOf(field).read(*this, field, target, &problem) || !problem)
            return true;
        if (error != nullptr)
            *error = std::move(problem);
    }
    return passOverField(field, target, error);
}

bool Unmarshalling::passOverField(const FieldPlan& field, const Target& target, ErrorSlot error) {
    if (error != nullptr && *error && !ErrorDetails::hasContext(**error))
        locate(error, placeOf(field, target, (*error)->code()), &field, currentClass());
    const bool isTooMany =
        error != nullptr && *error && (*error)->code() == errors::tooManyChildren.code;
    if (!passOver(error))
        return false;
    // One error is enough for them.
    if (isTooMany)
        for (const BindingPlan& binding : field.bindings)
            for (std::size_t i = target.source.all(binding.name).size(); i > 0; --i)
                target.bound.fields.add(binding.name);
    return true;
}

// What the field was read from, as far as it can be found again: the attribute or the child, or the
// child that is one too many; else the wrapper around it, or the element.
Unmarshalling::Number Unmarshalling::placeOf(const FieldPlan& field, const Target& target,
                                             int code) const {
    ChildLookup& source = target.source;
    Number nearest = source.element();
    const bool isTooMany =
        code == errors::tooManyChildren.code || code == errors::tooManyElementsForField.code;
    const bool mayBeAttribute =
        field.kind == BindingKind::attribute || field.kind == BindingKind::automatic;
    for (const BindingPlan& binding : field.bindings) {
        const String& around = binding.location;
        const auto holder =
            around.isEmpty() ? ChildLookup::Found{source.element(), false} : source.find(around);
        if (holder.several && isTooMany)
            return source.all(around)[1];
        const Number attribute = mayBeAttribute && !field.isCollection() && holder.first != none
                                     ? _document.attribute(holder.first, binding.name)
                                     : none;
        if (attribute != none)
            return attribute;
        if (!around.isEmpty() && holder.first != none && nearest == source.element())
            nearest = holder.first;
        const auto child = field.kind == BindingKind::attribute && !field.isCollection()
                               ? ChildLookup::Found()
                               : source.find(binding.name);
        if (child.first != none)
            return child.several && isTooMany ? source.all(binding.name)[1] : child.first;
    }
    return nearest;
}

bool Marshalling::writeField(const FieldPlan& field, const WrittenElement& element, Object& object,
                             ErrorSlot error) {
    ValuePlace place{nullptr, object.isa().property(field.key)};
    return writeField(field, element, object, place, error);
}

bool Marshalling::writeField(const FieldPlan& field, const WrittenElement& element, Object& object,
                             ValuePlace& place, ErrorSlot error) {
    ObjectAccess::Held held = place.record != nullptr && place.property == nullptr
                                  ? ObjectAccess::getContent(*place.record, field.key, place.next)
                                  : ObjectAccess::get(object, field.key, place.property);
    if (held.value().isNull() && field.isContainer) {
        if (!field.isRequired)
            return true;
        if (field.valueType == ValueType::other || field.valueType == ValueType::string)
            return failMissing(field, object, error);
        held = {false, held.keepsZero()};
    }
    const Value& value = held.value();
    if (value.isObject()) {
        if (const auto array = value.as<Array>())
            return writeCollection(*this, field, element, *array, error);
        if (value.classNameForMarshalling().isNull())
            return failNameless(object, error);
    } else if (value.isNull()) {
        return failNameless(object, error);
    }
    _omitsZero = _marshaller->omitsZeroAttributes() && !held.keepsZero();
    const bool isWritten = bindingOf(field).write(*this, field, element, value, error);
    if (_trace != nullptr)
        _trace->hold(value);
    return isWritten;
}

bool Marshalling::failMissing(const FieldPlan& field, const Object& object, ErrorSlot error) {
    return fail(error, errors::requiredValueMissing, field.key.string(), &object);
}

bool Marshalling::failNameless(const Object& object, ErrorSlot error) {
    return fail(error, errors::noClassName, object.isa().name());
}

} // namespace qx::detail
