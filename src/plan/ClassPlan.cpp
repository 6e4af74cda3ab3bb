#include "plan/ClassPlan.h"

#include <algorithm>

namespace qx::detail {

namespace {

bool mayBeAttribute(const FieldPlan& field) {
    return !field.isCollection() && field.location().isEmpty() &&
           (field.kind == BindingKind::attribute || field.kind == BindingKind::automatic);
}

} // namespace

void ClassPlan::summarise() {
    constexpr std::size_t mostLevels = 16;
    std::size_t levels = 0;
    ExtendsWalk walk(*this);
    do {
        attributeCount +=
            static_cast<std::size_t>(std::ranges::count_if(walk.current().fields, mayBeAttribute));
    } while (walk.next() && ++levels < mostLevels);
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
