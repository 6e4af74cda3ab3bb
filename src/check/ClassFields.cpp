#include "check/ClassFields.h"

#include <algorithm>

namespace qx::detail {

namespace {

constexpr std::size_t mostLevels = 32;

std::vector<const ClassPlan*> levelsOf(const ClassPlan& type) {
    std::vector<const ClassPlan*> levels;
    ExtendsWalk walk(type);
    do {
        levels.push_back(&walk.current());
    } while (levels.size() < mostLevels && walk.next());
    return levels;
}

void append(const ClassPlan& level, std::vector<ClassField>& fields) {
    for (const FieldPlan& field : level.fields)
        fields.push_back({&level, &field});
}

bool holdsChildren(const ClassPlan& type) {
    const auto fields = fieldsAsRead(type);
    return std::any_of(fields.begin(), fields.end(), [](const ClassField& inner) {
        return inner.field->kind == BindingKind::flattened || writesChildren(*inner.field);
    });
}

} // namespace

std::vector<ClassField> fieldsAsRead(const ClassPlan& type) {
    std::vector<ClassField> fields;
    for (const ClassPlan* level : levelsOf(type))
        append(*level, fields);
    return fields;
}

std::vector<ClassField> fieldsAsWritten(const ClassPlan& type) {
    std::vector<ClassField> fields;
    const auto levels = levelsOf(type);
    for (const ClassPlan* level : levels)
        if (level->mapping->isSelfFirst())
            append(*level, fields);
    for (auto level = levels.rbegin(); level != levels.rend(); ++level)
        if (!(*level)->mapping->isSelfFirst())
            append(**level, fields);
    return fields;
}

bool takesChildren(const FieldPlan& field) {
    if (field.isCollection())
        return true;
    switch (field.kind) {
    case BindingKind::attribute:
        return false;
    case BindingKind::text:
        return !field.bindTo().isEmpty();
    default:
        return true;
    }
}

bool writesChildren(const FieldPlan& field) {
    if (field.isCollection())
        return true;
    switch (field.kind) {
    case BindingKind::attribute:
        return !field.location().isEmpty();
    case BindingKind::element:
        return true;
    case BindingKind::flattened:
        return field.typeClass != nullptr && holdsChildren(*field.typeClass);
    case BindingKind::automatic:
        return field.typeClass != nullptr;
    case BindingKind::text:
        break;
    }
    return false;
}

// Objects that are flattened into a flattened one are left alone.
bool addTakenChildren(const std::vector<ClassField>& fields, std::unordered_set<String>& names) {
    for (const auto& [owner, field] : fields) {
        if (field->kind == BindingKind::flattened && !field->isCollection()) {
            if (field->typeClass == nullptr)
                continue;
            for (const auto& [inner, taken] : fieldsAsRead(*field->typeClass))
                if (taken->kind != BindingKind::flattened && takesChildren(*taken))
                    for (const BindingPlan& binding : taken->bindings)
                        names.insert(binding.name);
            continue;
        }
        if (!takesChildren(*field))
            continue;
        if (field->bindings.empty())
            return false;
        for (const BindingPlan& binding : field->bindings) {
            if (field->isCollection() && !field->hasType() && binding.bindTo.isEmpty())
                return false;
            names.insert(binding.name);
            if (field->isCollection())
                names.insert(binding.location);
        }
    }
    return true;
}

bool takesMappedChildren(const FieldPlan& field) {
    const bool isSingle =
        field.kind == BindingKind::element || field.kind == BindingKind::automatic;
    if (!field.isCollection() && !isSingle)
        return false;
    return std::any_of(field.bindings.begin(), field.bindings.end(), [&](const auto& binding) {
        if (field.isCollection() && field.hasType() && !binding.location.isEmpty())
            return false;
        return (field.isCollection() && field.typeClass != nullptr
                    ? binding.classOfBindTo
                    : binding.classOfName) != nullptr;
    });
}

} // namespace qx::detail
