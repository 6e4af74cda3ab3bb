// Fields whose object has no element of its own: its fields stand in that of the object around it.

#include "marshaller/FieldBinding.h"

namespace qx::detail {

namespace {

Value valueOf(Unmarshalling& reading, const FieldPlan& field, ChildLookup& source,
              Ref<Error>* error) {
    if (field.typeClass != nullptr)
        return reading.build(*field.typeClass, source, true, error);
    const ClassPlan* plan = reading.classForElement(source.element());
    if (plan != nullptr)
        return reading.build(*plan, source, false, error);
    return reading.budget().takeText(source.element(), error) ? source.stringValue() : Value();
}

bool read(Unmarshalling& reading, const FieldPlan& field, const Unmarshalling::Target& target,
          Ref<Error>* error) {
    Ref<Error> problem;
    if (ReadingTrace* const trace = reading.trace(); trace != nullptr)
        trace->take(ReadingTrace::Form::flattened, field, target.source.element());
    Value value = valueOf(reading, field, target.source, &problem);
    return setElementValue(reading, field, target, std::move(value), std::move(problem), {}, error);
}

// What is no object has an element of its own all the same.
bool write(Marshalling& writing, const FieldPlan& field, const WrittenElement& element,
           const Value& value, Ref<Error>* error) {
    const ClassPlan* plan = nullptr;
    if (!findClassToWrite(writing, field, value, plan, error))
        return false;
    if (plan == nullptr || !value.isObject())
        return elementBinding.write(writing, field, element, value, error);
    return writing.writeFields(*plan, element, *value.object(), error);
}

} // namespace

const FieldBinding flattenedBinding{&read, &write};

} // namespace qx::detail
