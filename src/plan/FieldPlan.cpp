#include "plan/FieldPlan.h"

#include <algorithm>

namespace qx::detail {

namespace {

ValueType valueTypeOf(const String& type) {
    if (type.isEmpty())
        return ValueType::none;
    if (type.equalsIgnoringCase("boolean"))
        return ValueType::boolean;
    if (type.equalsIgnoringCase("string"))
        return ValueType::string;
    const bool integer = type.equalsIgnoringCase("integer") || type.equalsIgnoringCase("int");
    return integer ? ValueType::integer : ValueType::other;
}

CollectionKind collectionKindOf(const String& collection) {
    if (collection.isEmpty())
        return CollectionKind::none;
    constexpr const char* kinds[] = {"array", "vector", "collection", "set"};
    const bool known = std::any_of(std::begin(kinds), std::end(kinds), [&](const char* kind) {
        return collection.equalsIgnoringCase(kind);
    });
    return known ? CollectionKind::array : CollectionKind::unknown;
}

BindingKind bindingKindOf(const QXXMLFieldMapping& mapping) {
    switch (mapping.nodeType()) {
    case QXXMLNodeTypeAttribute:
        return BindingKind::attribute;
    case QXXMLNodeTypeText:
        return BindingKind::text;
    case QXXMLNodeTypeElement:
        return mapping.isContainer() ? BindingKind::element : BindingKind::flattened;
    case QXXMLNodeTypeUnknown:
        break;
    }
    return BindingKind::automatic;
}

// Names of documents that a mapping knows are interned: two that are equal are one.
String interned(const String& name) { return Key(name).string(); }

} // namespace

const BindingPlan FieldPlan::noBinding;

FieldPlan FieldPlan::withoutClasses(const QXXMLFieldMapping& mapping) {
    FieldPlan plan;
    plan.mapping = &mapping;
    plan.key = mapping.name();
    plan.kind = bindingKindOf(mapping);
    plan.collection = collectionKindOf(mapping.collection());
    plan.valueType = valueTypeOf(mapping.type());
    plan.isRequired = mapping.isRequired();
    plan.isContainer = mapping.isContainer();
    for (const auto& binding : mapping.bindToMappings()) {
        const String bindTo = interned(binding->bindTo());
        plan.bindings.push_back({.bindTo = bindTo,
                                 .name = bindTo.isEmpty() ? plan.key.string() : bindTo,
                                 .location = interned(binding->location())});
    }
    return plan;
}

} // namespace qx::detail
