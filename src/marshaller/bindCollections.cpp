#include "marshaller/Unmarshalling.h"

#include <QXXMLMarshalling/platform/Array.h>

#include "platform/system/Errors.h"

using qx::Ref;
using qx::XMLElement;
using qx::XMLNode;

// The nodes that a collection's items are made from: all that there are before the first item is.
struct Unmarshalling::Items {
    ElementSource::Nodes nodes;
    bool areCounted = false; // as a whole, by their bind name or their wrapper's
};

// Elements of a bind name that a class maps to are the items; of any other bind name the last
// element is a wrapper around them. Without either, all children of the element are.
bool Unmarshalling::findItems(const FieldPlan& field, const Target& target, Items& items,
                              ErrorSlot error) {
    const auto add = [&](XMLNode& child) { items.nodes.emplace_back(&child); };
    for (const BindingPlan& binding : field.bindings) {
        if (binding.bindTo.isEmpty())
            continue;
        if (binding.classOfBindTo != nullptr) {
            items.nodes = target.source.all(binding.bindTo);
        } else if (const XMLElement* wrapper = target.source.last(binding.bindTo)) {
            if (!_budget.takeVisits(wrapper->childCount(), *wrapper, error))
                return false;
            for (XMLNode& child : wrapper->children())
                add(child);
        }
        if (!items.nodes.empty()) {
            target.bound.fields.add(binding.bindTo);
            items.areCounted = true;
            return true;
        }
    }
    const XMLElement& element = target.source.element();
    if (!_budget.takeVisits(element.childCount(), element, error))
        return false;
    target.source.forEachChild(add);
    return true;
}

// Items are the elements of a bind name, whatever class their own name maps to, in the element or
// in the one wrapper that a location names. A wrapper counts instead of its items, and once found
// it is searched by the later bindings too.
bool Unmarshalling::findItemsByType(const FieldPlan& field, const Target& target, Items& items,
                                    ErrorSlot error) {
    std::unique_ptr<ElementSource> wrapper;
    ElementSource* root = &target.source;
    for (const BindingPlan& binding : field.bindings) {
        if (!binding.location.isEmpty()) {
            const auto found = root->find(binding.location);
            if (found.first == nullptr)
                continue;
            if (!found.several) {
                if (!_budget.takeVisits(found.first->childCount(), *found.first, error))
                    return false;
                wrapper = std::make_unique<ElementSource>(*found.first, target.source.scope(),
                                                          field.bindings.size());
                root = wrapper.get();
                items.areCounted = true;
                target.bound.fields.add(binding.location);
            }
        }
        if (!binding.bindTo.isEmpty())
            items.nodes = root->all(binding.bindTo);
        if (!items.nodes.empty() || wrapper)
            break;
    }
    return true;
}

// Calls make(XMLNode&) for each item, and sets the list of those that were made.
template <class Make>
bool Unmarshalling::bindItems(const FieldPlan& field, const Target& target, const Items& items,
                              ErrorSlot error, Make make) {
    if (items.nodes.empty())
        return true;
    auto array = qx::make<qx::Array>();
    array->reserve(items.nodes.size());
    for (const Ref<XMLNode>& node : items.nodes) {
        const auto item = make(*node);
        if (endsAfter(error))
            return false;
        if (!item)
            continue;
        if (!items.areCounted)
            target.bound.fields.add(node->name());
        if (!adopt(*item, target.object, error))
            return false;
        array->add(item);
    }
    return ObjectDoor::set(target.object, field.key, array, error);
}

bool Unmarshalling::bindCollection(const FieldPlan& field, const Target& target, ErrorSlot error) {
    if (field.collection == CollectionKind::unknown)
        return qx::fail(error, qx::errors::unknownCollectionClass, field.mapping->collection());
    if (field.hasType())
        return bindArrayByType(field, target, error);
    Items items;
    if (!findItems(field, target, items, error))
        return false;
    return bindItems(field, target, items, error, [&](XMLNode& node) {
        return unmarshallNode(&node, target.source.scope(), error);
    });
}

bool Unmarshalling::bindArrayByType(const FieldPlan& field, const Target& target, ErrorSlot error) {
    if (field.typeClass == nullptr)
        return qx::fail(error, qx::errors::noMappingForClass, field.mapping->type());
    Items items;
    if (!findItemsByType(field, target, items, error))
        return false;
    return bindItems(field, target, items, error, [&](XMLNode& node) {
        return build(*field.typeClass, static_cast<XMLElement&>(node), target.source.scope(),
                     error);
    });
}
