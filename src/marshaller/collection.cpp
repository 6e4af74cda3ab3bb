// Fields whose value is an array, each item an element: in the element itself or in a wrapper.

#include <QXXMLMarshalling/model/Array.h>

#include "marshaller/CollectionItems.h"
#include "marshaller/FieldBinding.h"
#include "model/Errors.h"

#include <algorithm>

namespace qx::detail {

namespace {

using Target = Unmarshalling::Target;

// Elements of a bind name that a class maps to are the items; of any other bind name the last
// element is a wrapper around them. Without either, all children of the element are.
bool findItems(Unmarshalling& reading, const FieldPlan& field, const Target& target,
               CollectionItems& items, Ref<Error>* error) {
    for (const BindingPlan& binding : field.bindings) {
        if (binding.bindTo.isEmpty())
            continue;
        if (binding.classOfBindTo != nullptr) {
            items.setNamed(target.source, binding.bindTo);
        } else if (const XMLElement* wrapper = target.source.last(binding.bindTo)) {
            if (!reading.budget().takeVisits(wrapper->childCount(), *wrapper, error))
                return false;
            items.setChildren(*wrapper);
        }
        if (!items.isEmpty()) {
            target.bound.fields.add(binding.bindTo);
            items.areCounted = true;
            return true;
        }
    }
    const XMLElement& element = target.source.element();
    if (!reading.budget().takeVisits(element.childCount(), element, error))
        return false;
    items.setChildren(target.source);
    return true;
}

// Items are the elements of a bind name, whatever class their own name maps to, in the element or
// in the one wrapper that a location names. A wrapper counts instead of its items, and once found
// it is searched by the later bindings too.
bool findItemsByType(Unmarshalling& reading, const FieldPlan& field, const Target& target,
                     CollectionItems& items, Ref<Error>* error) {
    std::unique_ptr<ChildLookup> wrapper;
    ChildLookup* root = &target.source;
    for (const BindingPlan& binding : field.bindings) {
        if (!binding.location.isEmpty()) {
            const auto found = root->find(binding.location);
            if (found.first == nullptr)
                continue;
            if (!found.several) {
                if (!reading.budget().takeVisits(found.first->childCount(), *found.first, error))
                    return false;
                wrapper = std::make_unique<ChildLookup>(*found.first, target.source.copies(),
                                                        field.bindings.size());
                root = wrapper.get();
                items.areCounted = true;
                target.bound.fields.add(binding.location);
            }
        }
        if (!binding.bindTo.isEmpty())
            items.setNamed(*root, binding.bindTo);
        if (!items.isEmpty() || wrapper)
            break;
    }
    return true;
}

// Calls make(XMLNode&) for each item, and sets the list of those that were made.
template <class Make>
bool readItems(Unmarshalling& reading, const FieldPlan& field, const Target& target,
               CollectionItems& items, Ref<Error>* error, Make make) {
    if (items.isEmpty())
        return true;
    // Most collections are short, and alone in their element.
    constexpr std::size_t usualSize = 16;
    auto array = qx::make<Array>();
    array->reserve(std::min(target.source.element().childCount(), usualSize));
    while (XMLNode* node = items.next()) {
        const auto item = make(*node);
        if ((error != nullptr && *error) || reading.budget().isSpent())
            return false;
        if (!item)
            continue;
        if (!items.areCounted)
            target.bound.fields.add(node->name());
        if (!reading.adopt(*item, target.object, error))
            return false;
        array->add(item);
    }
    return ObjectAccess::set(target.object, field.key, array, error);
}

} // namespace

bool readCollection(Unmarshalling& reading, const FieldPlan& field, const Target& target,
                    Ref<Error>* error) {
    if (field.collection == CollectionKind::unknown)
        return fail(error, errors::unknownCollectionClass, field.mapping->collection());
    if (field.hasType())
        return readCollectionByType(reading, field, target, error);
    CollectionItems items(reading.openCollections());
    if (!findItems(reading, field, target, items, error))
        return false;
    return readItems(reading, field, target, items, error, [&](XMLNode& node) {
        return reading.unmarshallNode(&node, target.source.copies(), error);
    });
}

bool readCollectionByType(Unmarshalling& reading, const FieldPlan& field, const Target& target,
                          Ref<Error>* error) {
    if (field.typeClass == nullptr)
        return fail(error, errors::noMappingForClass, field.mapping->type());
    CollectionItems items(reading.openCollections());
    if (!findItemsByType(reading, field, target, items, error))
        return false;
    return readItems(reading, field, target, items, error, [&](XMLNode& node) {
        return reading.build(*field.typeClass, static_cast<XMLElement&>(node),
                             target.source.copies(), error);
    });
}

namespace {

XMLElement& appendNew(XMLElement& parent, const String& name) {
    auto child = XMLElement::initWithName(name);
    XMLElement& appended = *child;
    parent.addChild(std::move(child));
    return appended;
}

// Items stand in the wrapper of the location; else, when nothing says what their elements are, in a
// wrapper of the item name; else in the element itself.
XMLElement& elementForItems(const FieldPlan& field, XMLElement& element) {
    if (!field.location().isEmpty())
        return appendNew(element, field.location());
    if (field.typeClass == nullptr && !field.bindTo().isEmpty() &&
        field.bindings.front().classOfBindTo == nullptr)
        return appendNew(element, field.bindTo());
    return element;
}

} // namespace

bool writeCollection(Marshalling& writing, const FieldPlan& field, XMLElement& element,
                     const Array& array, Ref<Error>* error) {
    if (array.isEmpty() && !field.isRequired)
        return true;
    if (field.hasType() && field.typeClass == nullptr)
        return fail(error, errors::noMappingForDeclaredClass, field.mapping->type());
    XMLElement& target = elementForItems(field, element);
    // An item's own accessors may change the array it stands in.
    for (std::size_t i = 0; i < array.count(); ++i) {
        // NOLINTNEXTLINE(performance-unnecessary-copy-initialization)
        const Value item = array.at(i);
        Ref<Error> problem;
        auto child = field.typeClass != nullptr
                         ? writing.element(*field.typeClass, field.bindTo(), item, &problem)
                         : writing.marshallObject(item, &problem);
        if (child) {
            if (writing.isToBeWritten(item))
                target.addChild(std::move(child));
        } else if (error != nullptr && problem) {
            *error = std::move(problem);
            return false;
        }
    }
    return true;
}

} // namespace qx::detail
