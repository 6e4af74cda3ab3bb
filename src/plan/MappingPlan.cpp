#include "plan/MappingPlan.h"

#include <algorithm>
#include <vector>

using qx::Key;
using qx::String;

namespace {

ValueType valueTypeOf(const String& type) {
    if (type.isEmpty())
        return ValueType::none;
    if (type.equalsIgnoringCase("boolean"))
        return ValueType::boolean;
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

} // namespace

String MappingPlan::elementNameOf(const QXXMLClassMapping& mapping) {
    return mapping.mapTo().isEmpty() ? Key(mapping.className().lowercased()).string()
                                     : mapping.mapTo();
}

// All classes are listed before any is filled, since fields and `extends` name classes that come
// later. Of two definitions of one name the first counts; the mapping reports the second.
MappingPlan::MappingPlan(const QXXMLDocumentMapping& document) {
    for (const auto& mapping : document.classMappings()) {
        auto plan = std::make_unique<ClassPlan>();
        plan->mapping = mapping.get();
        plan->index = _classes.size();
        _byClassName.emplace(mapping->className(), plan.get());
        _byElementName.emplace(elementNameOf(*mapping), plan.get());
        _classes.push_back(std::move(plan));
    }
    for (const auto& plan : _classes)
        fill(*plan);
    markCycles();
    for (const auto& plan : _classes)
        summarise(*plan);
    for (const auto& plan : _classes)
        for (const FieldPlan& field : plan->fields)
            _fields.emplace(field.mapping, &field);
}

void MappingPlan::fill(ClassPlan& plan) const {
    const QXXMLClassMapping& mapping = *plan.mapping;
    plan.className = mapping.className();
    plan.classNameToInstantiate = mapping.classNameToInstantiate();
    plan.elementName = mapping.mapTo().isEmpty() ? mapping.className() : mapping.mapTo();
    plan.fields.reserve(mapping.fields().size());
    for (const auto& field : mapping.fields()) {
        plan.fields.push_back(planFor(*field));
        plan.bindingCount += std::max<std::size_t>(field->bindToMappings().size(), 1);
    }
    if (!mapping.extends().isEmpty())
        plan.parent = classNamed(mapping.extends());
}

// Each walk along `extends` numbers the classes that it is the first to meet; one that comes back
// to a class of its own number has closed a cycle.
void MappingPlan::markCycles() {
    std::vector<std::size_t> walks(_classes.size(), 0);
    for (std::size_t i = 0; i < _classes.size(); ++i) {
        const ClassPlan* link = _classes[i].get();
        while (link != nullptr && walks[link->index] == 0) {
            walks[link->index] = i + 1;
            link = link->parent;
        }
        if (link == nullptr || walks[link->index] != i + 1)
            continue;
        for (ClassPlan* member = _classes[link->index].get(); !member->isOnCycle;
             member = _classes[member->parent->index].get())
            member->isOnCycle = true;
    }
}

namespace {

bool mayBeAttribute(const FieldPlan& field) {
    return field.collection == CollectionKind::none && field.location.isEmpty() &&
           (field.nodeType == QXXMLNodeTypeAttribute || field.nodeType == QXXMLNodeTypeUnknown);
}

// Adds the names of the child elements that the field may bind. False where that could be any, or
// one of those that are there already.
bool addChildren(const FieldPlan& field, std::vector<String>& names) {
    const bool isArray = field.collection != CollectionKind::none;
    if (!field.isContainer || (isArray && field.typeClass == nullptr))
        return false;
    if (!isArray && field.nodeType == QXXMLNodeTypeAttribute)
        return true;
    const auto earlier = static_cast<std::ptrdiff_t>(names.size());
    for (const BindingPlan& binding : field.bindings)
        for (const String& name : {binding.name, binding.location}) {
            const auto last = names.begin() + earlier;
            if (std::find(names.begin(), last, name) != last)
                return false;
            if (!name.isEmpty())
                names.push_back(name);
        }
    return true;
}

} // namespace

void MappingPlan::summarise(ClassPlan& plan) {
    // Of larger classes less is worked out.
    constexpr std::size_t mostNames = 64;
    constexpr std::size_t mostLevels = 16;
    std::vector<String> children;
    std::size_t levels = 0;
    plan.bindsChildrenOnce = true;
    ExtendsWalk walk(plan);
    do {
        for (const FieldPlan& field : walk.current().fields) {
            plan.attributeCount += mayBeAttribute(field) ? 1 : 0;
            plan.bindsChildrenOnce = plan.bindsChildrenOnce && children.size() < mostNames &&
                                     addChildren(field, children);
        }
    } while (walk.next() && ++levels < mostLevels);
    plan.bindsChildrenOnce = plan.bindsChildrenOnce && levels < mostLevels;
}

bool ExtendsWalk::next() {
    if (_current->isOnCycle && _entry == nullptr)
        _entry = _current;
    const ClassPlan* parent = _current->parent;
    const bool closed = parent != nullptr && parent == _entry;
    if (closed || (parent == nullptr && !_current->mapping->extends().isEmpty()))
        _broken = _current->mapping->extends();
    if (closed || parent == nullptr)
        return false;
    _current = parent;
    return true;
}

FieldPlan MappingPlan::simplePlanFor(const QXXMLFieldMapping& mapping) {
    FieldPlan plan;
    plan.mapping = &mapping;
    plan.key = mapping.name();
    plan.nodeType = mapping.nodeType();
    plan.collection = collectionKindOf(mapping.collection());
    plan.valueType = valueTypeOf(mapping.type());
    plan.isRequired = mapping.isRequired();
    plan.isContainer = mapping.isContainer();
    plan.bindTo = mapping.bindTo();
    plan.location = mapping.location();
    plan.xmlName = plan.bindTo.isEmpty() ? mapping.name() : plan.bindTo;
    for (const auto& binding : mapping.bindToMappings()) {
        const String& bindTo = binding->bindTo();
        plan.bindings.push_back({.bindTo = bindTo,
                                 .name = bindTo.isEmpty() ? mapping.name() : bindTo,
                                 .location = binding->location()});
    }
    return plan;
}

FieldPlan MappingPlan::planFor(const QXXMLFieldMapping& mapping) const {
    FieldPlan plan = simplePlanFor(mapping);
    if (!mapping.type().isEmpty())
        plan.typeClass = classNamed(mapping.type());
    for (BindingPlan& binding : plan.bindings) {
        binding.classOfBindTo = classForElement(binding.bindTo);
        binding.classOfName = classForElement(binding.name);
    }
    return plan;
}

std::unique_ptr<ClassPlan> MappingPlan::planFor(const QXXMLClassMapping& mapping) const {
    auto plan = std::make_unique<ClassPlan>();
    plan->mapping = &mapping;
    plan->index = _classes.size();
    fill(*plan);
    summarise(*plan);
    return plan;
}

const ClassPlan* MappingPlan::classOf(const QXXMLClassMapping& mapping) const {
    const ClassPlan* plan = classNamed(mapping.className());
    return plan != nullptr && plan->mapping == &mapping ? plan : nullptr;
}

const FieldPlan* MappingPlan::fieldOf(const QXXMLFieldMapping& mapping) const {
    const auto found = _fields.find(&mapping);
    return found != _fields.end() ? found->second : nullptr;
}
