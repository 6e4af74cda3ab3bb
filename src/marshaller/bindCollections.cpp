#include "marshaller/Unmarshalling.h"

#include <QXXMLMarshalling/platform/Array.h>

#include "platform/system/Errors.h"

#include <algorithm>
#include <optional>

using qx::XMLElement;
using qx::XMLNode;

// The nodes that an untyped collection's items are made from.
struct Unmarshalling::Items {
    std::vector<XMLNode*> nodes;
    bool areNamed = false; // found under a bind name, which is then counted as a whole
};

// Elements of a bind name that a class maps to are the items; of any other bind name the last
// element is a wrapper around them. Without either, all children of the element are.
Unmarshalling::Items Unmarshalling::findItems(const FieldPlan& field, const Target& target) {
    Items items;
    for (const BindingPlan& binding : field.bindings) {
        if (binding.bindTo.isEmpty())
            continue;
        if (binding.classOfBindTo != nullptr) {
            ElementSource::Walk walk(target.source, binding.bindTo);
            while (XMLElement* element = walk.next())
                items.nodes.push_back(element);
        } else if (const XMLElement* wrapper = target.source.last(binding.bindTo)) {
            for (XMLNode& child : wrapper->children())
                items.nodes.push_back(&child);
        }
        if (!items.nodes.empty()) {
            countField(target, binding.bindTo);
            items.areNamed = true;
            return items;
        }
    }
    target.source.forEachChild([&](XMLNode& child) { items.nodes.push_back(&child); });
    return items;
}

bool Unmarshalling::bindCollection(const FieldPlan& field, const Target& target, ErrorSlot error) {
    if (field.collection == CollectionKind::unknown)
        return qx::fail(error, qx::errors::unknownCollectionClass, field.mapping->collection());
    if (field.hasType())
        return bindArrayByType(field, target, error);
    const Items items = findItems(field, target);
    if (items.nodes.empty())
        return true;
    auto array = qx::make<qx::Array>();
    for (XMLNode* node : items.nodes) {
        const auto item = unmarshallNode(node, target.source.scope(), error);
        if (error != nullptr && *error)
            return false;
        if (!item)
            continue;
        if (!items.areNamed)
            countField(target, node->name());
        if (!adopt(*item, target.object, error))
            return false;
        array->add(item);
    }
    return ObjectDoor::set(target.object, field.key, array, error);
}

// Items are the elements of a bind name, whatever class their own name maps to, in the element or
// in the one wrapper that a location names. A wrapper counts instead of its items, and once found
// it is searched by the later bindings too.
bool Unmarshalling::bindArrayByType(const FieldPlan& field, const Target& target, ErrorSlot error) {
    if (field.typeClass == nullptr)
        return qx::fail(error, qx::errors::noMappingForClass, field.mapping->type());
    std::unique_ptr<ElementSource> wrapper;
    ElementSource* root = &target.source;
    std::optional<ElementSource::Walk> elements;
    XMLElement* element = nullptr;
    for (const BindingPlan& binding : field.bindings) {
        if (!binding.location.isEmpty()) {
            const auto found = root->find(binding.location);
            if (found.first == nullptr)
                continue;
            if (!found.several) {
                wrapper = std::make_unique<ElementSource>(*found.first, target.source.scope(),
                                                          field.bindings.size());
                root = wrapper.get();
                countField(target, binding.location);
            }
        }
        if (!binding.bindTo.isEmpty()) {
            elements.emplace(*root, binding.bindTo);
            element = elements->next();
        }
        if (element != nullptr || wrapper)
            break;
    }
    if (element == nullptr)
        return true;
    // Most collections are short, and alone in their element.
    constexpr std::size_t usualSize = 16;
    auto array = qx::make<qx::Array>();
    array->reserve(std::min(root->element().childCount(), usualSize));
    for (; element != nullptr; element = elements->next()) {
        const auto item = build(*field.typeClass, *element, target.source.scope(), error);
        if (error != nullptr && *error)
            return false;
        if (!item)
            continue;
        array->add(item);
        if (!adopt(*item, target.object, error))
            return false;
        if (!wrapper)
            countField(target, element->name());
    }
    return ObjectDoor::set(target.object, field.key, array, error);
}
