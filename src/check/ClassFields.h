#pragma once

// The fields of a class with those of its ancestors, for rules that look at several at once.

#include "plan/ClassPlan.h"

#include <unordered_set>

namespace qx::detail {

struct ClassField {
    const ClassPlan* owner; // the class itself, or an ancestor
    const FieldPlan* field;
};

// As they are read: the class's own first. Of hostile mappings, which chain ever more classes, only
// the nearest levels are looked at.
std::vector<ClassField> fieldsAsRead(const ClassPlan& type);
// As they are written: by self-first.
std::vector<ClassField> fieldsAsWritten(const ClassPlan& type);

// Whether the field may take child elements, but for those around an attribute.
bool takesChildren(const FieldPlan& field);
// Whether it may write some.
bool writesChildren(const FieldPlan& field);
// The names of child elements that some of the fields take, or open; false where that may be any.
bool addTakenChildren(const std::vector<ClassField>& fields, std::unordered_set<String>& names);
// Whether it takes children that a class maps to by their name.
bool takesMappedChildren(const FieldPlan& field);

} // namespace qx::detail
