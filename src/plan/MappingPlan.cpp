#include "plan/MappingPlan.h"

#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>

#include "base/Immortal.h"
#include "plan/IncludeLoader.h"

#include <algorithm>

namespace qx::detail {

const MappingPlan& MappingPlan::of(const QXXMLMarshallingMapping* mapping) {
    if (mapping != nullptr)
        return *mapping->_plan;
    struct None {
        MappingPlan plan{*QXXMLDocumentMapping::initWithXML(nullptr)};
    };
    return immortal<None>().plan;
}

const IncludeLoader& MappingPlan::includesOf(const QXXMLMarshallingMapping& mapping) {
    return *mapping._includes;
}

String MappingPlan::elementNameOf(const QXXMLClassMapping& mapping) {
    return mapping.mapTo().isEmpty() ? Key(mapping.className().lowercased()).string()
                                     : mapping.mapTo();
}

// All classes are listed before any is filled, since fields and `extends` name classes that come
// later.
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
        plan->summarise();
    for (const auto& plan : _classes)
        for (const FieldPlan& field : plan->fields)
            _fields.emplace(field.mapping, &field);
}

void MappingPlan::fill(ClassPlan& plan) const {
    const QXXMLClassMapping& mapping = *plan.mapping;
    plan.className = mapping.className();
    plan.classNameToInstantiate = mapping.classNameToInstantiate();
    plan.elementName = mapping.mapTo();
    plan.namelessName = plan.className;
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

FieldPlan MappingPlan::planFor(const QXXMLFieldMapping& mapping) const {
    FieldPlan plan = FieldPlan::withoutClasses(mapping);
    if (!mapping.type().isEmpty())
        plan.typeClass = classNamed(mapping.type());
    if (plan.valueType == ValueType::string && plan.typeClass != nullptr)
        plan.valueType = ValueType::other;
    for (BindingPlan& binding : plan.bindings) {
        binding.classOfBindTo = classForElement(binding.bindTo);
        binding.classOfName = classForElement(binding.name);
    }
    return plan;
}

std::unique_ptr<FieldPlan> MappingPlan::newPlan(const QXXMLFieldMapping& mapping) const {
    return std::make_unique<FieldPlan>(planFor(mapping));
}

std::unique_ptr<ClassPlan> MappingPlan::newPlan(const QXXMLClassMapping& mapping) const {
    auto plan = std::make_unique<ClassPlan>();
    plan->mapping = &mapping;
    plan->index = _classes.size();
    fill(*plan);
    plan->summarise();
    return plan;
}

const ClassPlan* MappingPlan::planOf(const QXXMLClassMapping& mapping) const {
    const ClassPlan* plan = classNamed(mapping.className());
    return plan != nullptr && plan->mapping == &mapping ? plan : nullptr;
}

const FieldPlan* MappingPlan::planOf(const QXXMLFieldMapping& mapping) const {
    const auto found = _fields.find(&mapping);
    return found != _fields.end() ? found->second : nullptr;
}

} // namespace qx::detail
