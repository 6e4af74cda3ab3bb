// Fields whose value is an array, each item an element: in the element itself or in a wrapper.

#include <QXXMLMarshalling/model/Array.h>

#include "marshaller/FieldBinding.h"
#include "model/Errors.h"

#include <algorithm>
#include <optional>

namespace qx::detail {

namespace {

using Target = Unmarshalling::Target;
using Form = ReadingTrace::Form;

// What the items are made from: fixed before the first is.
struct Items {
    std::vector<Unmarshalling::Number> nodes;
    bool areCounted = false; // as a whole, by their bind name or their wrapper's
    std::size_t binding = 0; // of the field's
    Unmarshalling::Number wrapper = Unmarshalling::none;
};

// The wrapper's children. False where they are more than may be gone over.
bool takeChildren(Unmarshalling& reading, const FieldPlan& field, Unmarshalling::Number wrapper,
                  Items& items, Ref<Error>* error) {
    reading.document().forEachChild(
        wrapper, [&](Unmarshalling::Number child) { items.nodes.push_back(child); });
    items.wrapper = items.nodes.empty() ? Unmarshalling::none : wrapper;
    if (items.nodes.empty() && reading.keepsExactly())
        reading.trace()->take(Form::wrapper, field, wrapper);
    return reading.budget().takeVisits(items.nodes.size(), wrapper, error);
}

// Elements of a bind name that a class maps to are the items; of any other bind name the last
// element is a wrapper around them. Without either, all children of the element are.
bool findItems(Unmarshalling& reading, const FieldPlan& field, const Target& target, Items& items,
               Ref<Error>* error) {
    ChildLookup& source = target.source;
    for (const BindingPlan& binding : field.bindings) {
        if (binding.bindTo.isEmpty())
            continue;
        if (binding.classOfBindTo != nullptr) {
            items.nodes = source.all(binding.bindTo);
        } else if (const auto wrapper = source.last(binding.bindTo);
                   wrapper != Unmarshalling::none) {
            if (!takeChildren(reading, field, wrapper, items, error))
                return false;
        }
        if (!items.nodes.empty()) {
            target.bound.fields.add(binding.bindTo);
            items.binding = static_cast<std::size_t>(&binding - field.bindings.data());
            items.areCounted = true;
            return true;
        }
    }
    items.nodes = source.all();
    return reading.budget().takeVisits(source.childCount(), source.element(), error);
}

// Texts without a bind name have the field's.
const String& nameOfItems(const FieldPlan& field, const BindingPlan& binding) {
    return field.typeClass != nullptr ? binding.bindTo : binding.name;
}

// Items are the elements of a bind name, whatever class their own name maps to, in the element or
// in the one wrapper that a location names. A wrapper counts instead of its items, and once found
// it is searched by the later bindings too.
bool findItemsByType(Unmarshalling& reading, const FieldPlan& field, const Target& target,
                     Items& items, Ref<Error>* error) {
    std::optional<ChildLookup> wrapper;
    for (const BindingPlan& binding : field.bindings) {
        ChildLookup& root = wrapper ? *wrapper : target.source;
        if (!binding.location.isEmpty()) {
            const auto found = root.find(binding.location);
            if (found.first == Unmarshalling::none)
                continue;
            if (!found.several) {
                wrapper.emplace(reading.document(), found.first, target.source.nodes(),
                                field.bindings.size());
                if (!reading.budget().takeVisits(wrapper->childCount(), found.first, error))
                    return false;
                items.areCounted = true;
                items.wrapper = found.first;
                target.bound.fields.add(binding.location);
            }
        }
        items.binding = static_cast<std::size_t>(&binding - field.bindings.data());
        const String& name = nameOfItems(field, binding);
        if (!name.isEmpty())
            items.nodes = (wrapper ? *wrapper : target.source).all(name);
        if (!items.nodes.empty() || wrapper)
            break;
    }
    return true;
}

void tellSkipped(Unmarshalling& reading, const Target& target, const Items& items,
                 Unmarshalling::Number node) {
    if (reading.reports().isOn() && items.wrapper != Unmarshalling::none &&
        reading.document().isElement(node))
        reading.reports().tell(Reporting::Kind::skippedItem, reading.document(), items.wrapper,
                               node, &target.object);
}

void tellWrapper(Unmarshalling& reading, const FieldPlan& field, const Target& target,
                 const Items& items) {
    const ClassPlan* const plan = reading.currentClass();
    if (reading.reports().isOn() && items.wrapper != Unmarshalling::none && plan != nullptr)
        reading.reports().tellWrapper(reading.document(), items.wrapper, *plan, field,
                                      &target.object);
}

// Calls make(Number) for each item, and sets the list of the values that were made.
template <class Make>
bool readItems(Unmarshalling& reading, const FieldPlan& field, const Target& target,
               const Items& items, Ref<Error>* error, Make make) {
    ReadingTrace* const trace = reading.trace();
    if (trace != nullptr && items.wrapper != Unmarshalling::none)
        trace->take(Form::wrapper, field, items.wrapper, items.binding);
    if (items.nodes.empty())
        return true;
    // Few may be made of very many.
    constexpr std::size_t usualSize = 16;
    auto array = qx::make<Array>();
    array->reserve(std::min(items.nodes.size(), usualSize));
    for (const auto node : items.nodes) {
        reading.setWrapper(items.wrapper);
        const std::size_t uses = trace != nullptr ? trace->uses().size() : 0;
        if (trace != nullptr)
            trace->take(Form::item, field, node, items.binding, array->count());
        const Value item = make(node);
        reading.setWrapper(Unmarshalling::none);
        if ((error != nullptr && *error) || reading.budget().isSpent()) {
            reading.locate(error, node, &field, reading.currentClass());
            if (!reading.passOver(error))
                return false;
            if (!items.areCounted && reading.document().isElement(node))
                target.bound.fields.add(reading.document().name(node));
            continue;
        }
        if (item.isNull()) {
            if (trace != nullptr)
                trace->forget(uses);
            tellSkipped(reading, target, items, node);
            continue;
        }
        if (!items.areCounted)
            target.bound.fields.add(reading.document().name(node));
        if (Object* const object = item.object();
            object != nullptr && !reading.adopt(*object, target.object, error))
            return false;
        array->add(item);
    }
    return ObjectAccess::set(target.object, field.key, array, error);
}

} // namespace

Value itemText(Unmarshalling& reading, const FieldPlan& field, Object& owner,
               Unmarshalling::Number node, Ref<Error>* error) {
    if (reading.reports().isOn())
        reading.reports().tellInside(reading.document(), node, &owner);
    const Value text =
        reading.budget().takeVisits(1, node, error) ? reading.textOf(node, error) : Value();
    return text.isNull() ? Value() : itemOf(field, text, error, !reading.isCollecting());
}

bool readCollection(Unmarshalling& reading, const FieldPlan& field, const Target& target,
                    Ref<Error>* error) {
    if (field.collection == CollectionKind::unknown)
        return fail(error, errors::unknownCollectionClass, field.mapping->collection());
    if (field.hasType())
        return readCollectionByType(reading, field, target, error);
    Items items;
    if (!findItems(reading, field, target, items, error))
        return false;
    tellWrapper(reading, field, target, items);
    return readItems(reading, field, target, items, error, [&](Unmarshalling::Number node) {
        return Value(reading.unmarshallNode(node, target.source.nodes(), error));
    });
}

bool readCollectionByType(Unmarshalling& reading, const FieldPlan& field, const Target& target,
                          Ref<Error>* error) {
    if (!field.hasItemType())
        return fail(error, errors::noMappingForClass, field.mapping->type());
    Items items;
    if (!findItemsByType(reading, field, target, items, error))
        return false;
    tellWrapper(reading, field, target, items);
    return readItems(reading, field, target, items, error, [&](Unmarshalling::Number node) {
        return field.typeClass != nullptr
                   ? Value(reading.build(*field.typeClass, node, target.source.nodes(), error))
                   : itemText(reading, field, target.object, node, error);
    });
}

namespace {

WrittenElement appendNew(Marshalling& writing, const WrittenElement& parent, const String& name) {
    auto child = writing.newElement(name, 0);
    writing.output().addChild(parent, child);
    return child;
}

// Items stand in the wrapper of the location; else, when nothing says what their elements are, in a
// wrapper of the item name; else in the element itself.
WrittenElement elementForItems(Marshalling& writing, const FieldPlan& field,
                               const WrittenElement& element) {
    if (!field.location().isEmpty())
        return appendNew(writing, element, field.location());
    if (!field.hasType() && !field.bindTo().isEmpty() &&
        field.bindings.front().classOfBindTo == nullptr)
        return appendNew(writing, element, field.bindTo());
    return element;
}

} // namespace

bool writeCollection(Marshalling& writing, const FieldPlan& field, const WrittenElement& element,
                     const Array& array, Ref<Error>* error) {
    WritingTrace* const trace = writing.trace();
    if (trace != nullptr)
        trace->markList();
    if (array.isEmpty() && !field.isRequired)
        return true;
    if (field.hasType() && !field.hasItemType())
        return fail(error, errors::noMappingForDeclaredClass, field.mapping->type());
    const Marshalling::Opened opened(writing);
    const WrittenElement target = elementForItems(writing, field, element);
    const bool isWrapped = target.node != element.node || target.drafted != element.drafted;
    const auto placeKept = [&](std::size_t count) {
        if (writing.placing() != nullptr)
            writing.placing()->itemsAre(count, target, isWrapped);
    };
    placeKept(0);
    // An item's own accessors may change the array it stands in.
    for (std::size_t i = 0; i < array.count(); ++i) {
        // NOLINTNEXTLINE(performance-unnecessary-copy-initialization)
        const Value item = array.at(i);
        if (field.typeClass == nullptr && field.hasSimpleType()) {
            if (!item.isNullOrMarker())
                writing.addTextElement(target, field.xmlName(), FieldText(item, field.valueType));
            placeKept(i + 1);
            continue;
        }
        Ref<Error> problem;
        const WritingTrace::Number shown = trace != nullptr ? trace->size() : 0;
        const auto child = field.typeClass != nullptr
                               ? writing.element(*field.typeClass, field.bindTo(), item, &problem)
                               : writing.marshallObject(item, &problem);
        if (child) {
            if (writing.isToBeWritten(item))
                writing.output().addChild(target, child);
            else if (trace != nullptr)
                trace->forget(shown);
        } else if (error != nullptr && problem) {
            return writing.failed(field, i, problem, error);
        }
        placeKept(i + 1);
    }
    return true;
}

} // namespace qx::detail
