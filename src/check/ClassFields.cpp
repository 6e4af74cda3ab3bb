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

// Objects that are flattened into a flattened one are left alone.
bool flattenedTakesChild(const FieldPlan& field, const String& name) {
    if (field.typeClass == nullptr)
        return false;
    const auto fields = fieldsAsRead(*field.typeClass);
    return std::any_of(fields.begin(), fields.end(), [&](const ClassField& inner) {
        return inner.field->kind != BindingKind::flattened && takesChild(*inner.field, name);
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

bool takesChild(const FieldPlan& field, const String& name) {
    if (!takesChildren(field))
        return false;
    if (field.kind == BindingKind::flattened && !field.isCollection())
        return flattenedTakesChild(field, name);
    if (field.bindings.empty())
        return true;
    return std::any_of(field.bindings.begin(), field.bindings.end(), [&](const auto& binding) {
        const bool isAny = field.isCollection() && !field.hasType() && binding.bindTo.isEmpty();
        return isAny || binding.name == name || (field.isCollection() && binding.location == name);
    });
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
