// Fields bound to text: that of a child element, or of the element itself.

#include "marshaller/FieldBinding.h"
#include "model/Errors.h"

namespace qx::detail {

namespace {

// A child of one of the bind names gives its text, the element itself where there is none.
bool read(Unmarshalling& reading, const FieldPlan& field, const Unmarshalling::Target& target,
          Ref<Error>* error) {
    ChildLookup& source = target.source;
    auto holder = source.element();
    std::size_t number = 0;
    for (const BindingPlan& binding : field.bindings) {
        if (binding.bindTo.isEmpty())
            continue;
        const auto found = source.find(binding.bindTo);
        if (found.several)
            return fail(error, errors::tooManyChildren, binding.bindTo,
                        reading.quoted(source.element()));
        if (found.first != Unmarshalling::none) {
            target.bound.fields.add(binding.bindTo);
            holder = found.first;
            number = static_cast<std::size_t>(&binding - field.bindings.data());
            break;
        }
    }
    if (!reading.budget().takeText(holder, error))
        return false;
    const bool isChild = holder != source.element();
    if (isChild && reading.reports().isOn())
        reading.reports().tellInside(reading.document(), holder, &target.object);
    Value text = isChild ? reading.document().text(holder) : source.stringValue();
    if (ReadingTrace* const trace = reading.trace(); trace != nullptr)
        trace->take(isChild ? ReadingTrace::Form::child : ReadingTrace::Form::text, field, holder,
                    number);
    if (!text.view().empty())
        return takeValue(target.object, field, field.key, std::move(text), error,
                         !reading.isCollecting());
    if (field.isRequired)
        return fail(error, errors::requiredTextMissing, field.key.string(),
                    reading.quoted(source.element()));
    return false;
}

// Whatever stood in the element before goes: earlier children too.
bool write(Marshalling& writing, const FieldPlan& field, const WrittenElement& element,
           const Value& value, Ref<Error>*) {
    const FieldText text(value, field.valueType);
    if (WritingTrace* const trace = writing.trace(); trace != nullptr) {
        trace->replaceContent(element.drafted);
        trace->addText(text.view(), text.isEmpty()); // which adds no node
    }
    writing.output().setText(element, text);
    if (writing.placing() != nullptr)
        writing.placing()->replaced(element);
    return true;
}

} // namespace

const FieldBinding textBinding{&read, &write};

} // namespace qx::detail
