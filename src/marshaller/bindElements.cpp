#include "marshaller/Unmarshalling.h"

#include "model/Errors.h"

using qx::Error;
using qx::Ref;
using qx::String;
using qx::Value;
using qx::XMLElement;

// The child that the field takes, null where there is none; `binding` is the last one tried. An
// object that is flattened takes the first of several, out of the copy it is bound from, so that
// the next one finds the next.
bool Unmarshalling::findElement(const FieldPlan& field, const Target& target, XMLElement*& child,
                                const BindingPlan*& binding, ErrorSlot error) {
    for (const BindingPlan& candidate : field.bindings) {
        binding = &candidate;
        const auto found = target.source.find(candidate.name);
        if (found.several && !target.isFlattened)
            return qx::fail(error, qx::errors::tooManyChildElements, candidate.name,
                            &target.source.element());
        if (found.first == nullptr)
            continue;
        child = found.first;
        target.bound.fields.add(candidate.name);
        return true;
    }
    if (field.isRequired && error != nullptr)
        return qx::fail(error, qx::errors::requiredElementMissing,
                        binding != nullptr ? binding->name : String(), &target.source.element());
    return true;
}

// An object where a class is known for the field or for the child's name, else the child's text.
Value Unmarshalling::elementValue(const FieldPlan& field, const Target& target, XMLElement& child,
                                  const ClassPlan* classOfElement, ErrorSlot error) {
    const ClassPlan* plan = field.typeClass != nullptr ? field.typeClass : classOfElement;
    if (plan != nullptr) {
        const Ref<XMLElement> held(&child);
        return build(*plan, child, target.source.scope(), error);
    }
    return _budget.takeText(child, error) ? Value(child.stringValue()) : Value();
}

Value Unmarshalling::flattenedValue(const FieldPlan& field, const Target& target, ErrorSlot error) {
    if (field.typeClass != nullptr)
        return build(*field.typeClass, target.source, true, error);
    const ClassPlan* plan = _plan.classForElement(target.source.element().name());
    if (plan != nullptr)
        return build(*plan, target.source, false, error);
    return _budget.takeText(target.source.element(), error) ? Value(target.source.stringValue())
                                                            : Value();
}

bool Unmarshalling::bindAsElement(const FieldPlan& field, const Target& target, ErrorSlot error) {
    Value value;
    Ref<Error> problem;
    const BindingPlan* binding = nullptr;
    if (field.isContainer) {
        XMLElement* child = nullptr;
        if (!findElement(field, target, child, binding, error))
            return false;
        if (child != nullptr) {
            Ref<XMLElement> taken;
            if (target.isFlattened) {
                taken = Ref<XMLElement>(child);
                target.source.take(*child);
            }
            value = elementValue(field, target, *child, binding->classOfName, &problem);
        }
    } else {
        value = flattenedValue(field, target, &problem);
    }
    if (!value.isNull()) {
        if (qx::Object* object = value.object(); object && !adopt(*object, target.object, error))
            return false;
        return takeValue(target.object, field, field.key, std::move(value), error);
    }
    if (error == nullptr || (!problem && !field.isRequired))
        return true;
    if (!problem)
        return qx::fail(error, qx::errors::requiredElementMissing,
                        binding != nullptr ? binding->name : String(), &target.source.element());
    *error = std::move(problem);
    return false;
}
