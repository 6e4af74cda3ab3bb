// Fields that leave open what they are bound to: an attribute, or else an element.

#include "marshaller/FieldBinding.h"

namespace qx::detail {

namespace {

bool read(Unmarshalling& reading, const FieldPlan& field, const Unmarshalling::Target& target,
          Ref<Error>* error) {
    return attributeBinding.read(reading, field, target, error) ||
           bindingAsElement(field).read(reading, field, target, error);
}

// An object of a class that the mapping has is an element under that class's name. Without a
// container only what is inside of it is written.
bool write(Marshalling& writing, const FieldPlan& field, const WrittenElement& element,
           const Value& value, Ref<Error>* error) {
    const ClassPlan* plan = writing.classOf(value);
    if (plan == nullptr) {
        if (!hasText(value, error))
            return false;
        const FieldText text(value, field.valueType);
        if (!writing.isLeftOut(field, value, text))
            writing.addAttribute(element, field.xmlName(), text);
        return true;
    }
    const auto child = field.isContainer ? writing.element(*plan, plan->elementName, value, error)
                                         : writing.shell(*plan, element, value, error);
    if (!child)
        return false;
    if (field.isContainer)
        writing.output().addChild(element, child);
    else
        writing.output().moveChildren(child, element);
    return true;
}

} // namespace

const FieldBinding automaticBinding{&read, &write};

} // namespace qx::detail
