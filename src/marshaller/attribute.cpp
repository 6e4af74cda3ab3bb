// Fields bound to an attribute, of the element or of a wrapper in it.

#include "marshaller/FieldBinding.h"
#include "model/Errors.h"

namespace qx::detail {

namespace {

using Form = ReadingTrace::Form;

// The wrapper of a location is not counted as consumed, and the attribute counts for the element
// that is bound even where it stands on the wrapper: what is read so is kept as unknown XML too.
bool read(Unmarshalling& reading, const FieldPlan& field, const Unmarshalling::Target& target,
          Ref<Error>* error) {
    ChildLookup& source = target.source;
    auto emptyWrapper = Unmarshalling::none;
    for (const BindingPlan& binding : field.bindings) {
        auto holder = source.element();
        if (!binding.location.isEmpty()) {
            const auto found = source.find(binding.location);
            if (found.several)
                return fail(error, errors::tooManyElementsForField, binding.name,
                            reading.quoted(source.element()));
            holder = found.first;
        }
        const auto attribute = holder == source.element() ? source.attribute(binding.name)
                               : holder != Unmarshalling::none
                                   ? reading.document().attribute(holder, binding.name)
                                   : Unmarshalling::none;
        if (attribute == Unmarshalling::none) {
            if (emptyWrapper == Unmarshalling::none && holder != source.element())
                emptyWrapper = holder;
            continue;
        }
        target.bound.attributes.add(binding.name);
        const bool isTaken =
            takeValue(target.object, field, field.key, reading.document().value(attribute), error,
                      !reading.isCollecting());
        if (ReadingTrace* const trace = reading.trace(); trace != nullptr && isTaken) {
            const auto number = static_cast<std::size_t>(&binding - field.bindings.data());
            if (holder != source.element())
                trace->take(Form::wrapper, field, holder, number);
            trace->take(Form::attribute, field, attribute, number);
        }
        return isTaken;
    }
    // What else it holds is kept in it, so that the attribute may come back there.
    if (emptyWrapper != Unmarshalling::none && reading.keepsExactly())
        reading.trace()->take(Form::wrapper, field, emptyWrapper);
    if (field.isRequired)
        return fail(error, errors::requiredAttributeMissing,
                    field.bindings.empty() ? String() : field.bindings.back().name,
                    reading.quoted(source.element()));
    return false;
}

bool write(Marshalling& writing, const FieldPlan& field, const WrittenElement& element,
           const Value& value, Ref<Error>*) {
    const FieldText text(value, field.valueType);
    if (writing.isLeftOut(field, value, text))
        return true;
    if (field.location().isEmpty()) {
        writing.addAttribute(element, field.xmlName(), text);
        return true;
    }
    WrittenElement wrapper = writing.lastChildNamed(element, field.location());
    const Marshalling::Opened opened(writing);
    if (!wrapper) {
        wrapper = writing.newElement(field.location(), 1);
        writing.output().addChild(element, wrapper);
    }
    writing.addAttribute(wrapper, field.xmlName(), text);
    return true;
}

} // namespace

const FieldBinding attributeBinding{&read, &write};

} // namespace qx::detail
