// Fields bound to a child element: an object of its own, or the text in it.

#include "marshaller/FieldBinding.h"
#include "model/Errors.h"

namespace qx::detail {

namespace {

// The child that the field takes, null where there is none; `binding` is the last one tried. An
// object that is flattened takes the first of several, out of the copy it is bound from, so that
// the next one finds the next.
bool findElement(Unmarshalling& reading, const FieldPlan& field,
                 const Unmarshalling::Target& target, Unmarshalling::Number& child,
                 const BindingPlan*& binding, Ref<Error>* error) {
    for (const BindingPlan& candidate : field.bindings) {
        binding = &candidate;
        const auto found = target.source.find(candidate.name);
        if (found.several && !target.isFlattened)
            return fail(error, errors::tooManyChildElements, candidate.name,
                        reading.quoted(target.source.element()));
        if (found.first == Unmarshalling::none)
            continue;
        child = found.first;
        target.bound.fields.add(candidate.name);
        return true;
    }
    return true;
}

// An object where a class is known for the field or for the child's name, else the child's text.
Value valueOf(Unmarshalling& reading, const FieldPlan& field, const Unmarshalling::Target& target,
              Unmarshalling::Number child, const ClassPlan* classOfElement, Ref<Error>* error) {
    const bool isText = field.valueType == ValueType::string;
    const ClassPlan* plan = field.typeClass != nullptr || isText ? field.typeClass : classOfElement;
    if (plan != nullptr)
        return reading.build(*plan, child, target.source.nodes(), error);
    if (reading.reports().isOn())
        reading.reports().tellInside(reading.document(), child, &target.object);
    return reading.textOf(child, error);
}

bool read(Unmarshalling& reading, const FieldPlan& field, const Unmarshalling::Target& target,
          Ref<Error>* error) {
    auto child = Unmarshalling::none;
    const BindingPlan* binding = nullptr;
    if (!findElement(reading, field, target, child, binding, error))
        return false;
    Value value;
    Ref<Error> problem;
    if (child != Unmarshalling::none) {
        if (target.isFlattened)
            target.source.take(child);
        if (ReadingTrace* const trace = reading.trace(); trace != nullptr)
            trace->take(ReadingTrace::Form::child, field, child,
                        static_cast<std::size_t>(binding - field.bindings.data()));
        value = valueOf(reading, field, target, child, binding->classOfName, &problem);
    }
    return setElementValue(reading, field, target, std::move(value), std::move(problem),
                           binding != nullptr ? binding->name : String(), error);
}

// It stands apart, so that a level of nested objects takes less of the stack.
[[gnu::noinline]] void writeText(Marshalling& writing, const FieldPlan& field,
                                 const WrittenElement& element, const Value& value) {
    writing.addTextElement(element, field.xmlName(), FieldText(value, field.valueType));
}

// A declared class gives the element the field's name, a class found by the value its own.
bool write(Marshalling& writing, const FieldPlan& field, const WrittenElement& element,
           const Value& value, Ref<Error>* error) {
    const ClassPlan* plan = nullptr;
    const bool isText = !value.isObject() && field.valueType != ValueType::other;
    if (!isText && !findClassToWrite(writing, field, value, plan, error))
        return false;
    if (plan != nullptr) {
        const bool isDeclared = field.valueType == ValueType::other;
        const auto child =
            writing.element(*plan, isDeclared ? field.xmlName() : plan->elementName, value, error);
        if (child)
            writing.output().addChild(element, child);
        return static_cast<bool>(child);
    }
    if (field.isRequired || !value.isNullOrMarker())
        writeText(writing, field, element, value);
    return true;
}

} // namespace

const FieldBinding elementBinding{&read, &write};

bool setElementValue(Unmarshalling& reading, const FieldPlan& field,
                     const Unmarshalling::Target& target, Value value, Ref<Error> problem,
                     const String& name, Ref<Error>* error) {
    if (!value.isNull()) {
        if (Object* object = value.object();
            object != nullptr && !reading.adopt(*object, target.object, error))
            return false;
        return takeValue(target.object, field, field.key, std::move(value), error,
                         !reading.isCollecting());
    }
    if (error == nullptr || (!problem && !field.isRequired))
        return true;
    if (!problem)
        return fail(error, errors::requiredElementMissing, name,
                    reading.quoted(target.source.element()));
    *error = std::move(problem);
    return false;
}

bool hasText(const Value& value, Ref<Error>* error) {
    return dynamic_cast<const StructObject*>(value.object()) == nullptr ||
           fail(error, errors::noMappingDefinition, value.classNameForMarshalling());
}

bool findClassToWrite(const Marshalling& writing, const FieldPlan& field, const Value& value,
                      const ClassPlan*& plan, Ref<Error>* error) {
    const bool isDeclared = field.valueType == ValueType::other;
    const bool isText = field.valueType == ValueType::string;
    plan = isDeclared || isText ? field.typeClass : writing.classOf(value);
    if (isDeclared && plan == nullptr)
        return fail(error, errors::noMappingForClass, field.mapping->type());
    return plan != nullptr || hasText(value, error);
}

} // namespace qx::detail
