#include "plan/ClassPlan.h"

#include <algorithm>

namespace qx::detail {

namespace {

bool mayBeAttribute(const FieldPlan& field) {
    return !field.isCollection() && field.location().isEmpty() &&
           (field.kind == BindingKind::attribute || field.kind == BindingKind::automatic);
}

// Adds the names of the child elements that the field may bind. False where that could be any, or
// one of those that are there already.
bool addChildren(const FieldPlan& field, std::vector<String>& names) {
    if (!field.isContainer || (field.isCollection() && !field.hasItemType()))
        return false;
    if (!field.isCollection() && field.kind == BindingKind::attribute)
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

void ClassPlan::summarise() {
    // Larger classes are taken to bind children to several fields, which is always safe.
    constexpr std::size_t mostNames = 64;
    constexpr std::size_t mostLevels = 16;
    std::vector<String> children;
    std::size_t levels = 0;
    bindsChildrenOnce = true;
    ExtendsWalk walk(*this);
    do {
        for (const FieldPlan& field : walk.current().fields) {
            attributeCount += mayBeAttribute(field) ? 1 : 0;
            bindsChildrenOnce =
                bindsChildrenOnce && children.size() < mostNames && addChildren(field, children);
        }
    } while (walk.next() && ++levels < mostLevels);
    bindsChildrenOnce = bindsChildrenOnce && levels < mostLevels;
    usualForm = UsualForm::of(*this);
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

} // namespace qx::detail
