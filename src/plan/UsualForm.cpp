#include "plan/UsualForm.h"

#include "plan/ClassPlan.h"

#include <algorithm>

namespace qx::detail {

namespace {

using Place = UsualForm::Place;
using Slot = UsualForm::Slot;

// Items whose class or type is declared: others are found by rules of their own.
std::optional<Slot> slotOfItems(const FieldPlan& field) {
    const BindingPlan& binding = field.bindings.front();
    const bool isWrapped = !binding.location.isEmpty();
    const String& itemName = field.typeClass != nullptr ? binding.bindTo : binding.name;
    if (field.collection != CollectionKind::array || !field.hasItemType() || itemName.isEmpty())
        return std::nullopt;
    return Slot{&field, isWrapped ? binding.location : itemName, itemName, field.typeClass,
                isWrapped ? Place::wrapped : Place::items};
}

std::optional<Slot> slotOfValue(const FieldPlan& field) {
    const BindingPlan& binding = field.bindings.front();
    const bool hasOwnClass = field.typeClass != nullptr || field.valueType == ValueType::string;
    const ClassPlan* const plan = hasOwnClass ? field.typeClass : binding.classOfName;
    switch (field.kind) {
    case BindingKind::attribute:
        return Slot{&field, binding.name, {}, nullptr, Place::attribute};
    case BindingKind::element:
        return Slot{&field, binding.name, {}, plan, Place::child};
    case BindingKind::automatic:
        // What is missing of a required one is told by both of its bindings.
        if (field.isRequired)
            return std::nullopt;
        return Slot{&field, binding.name, {}, plan, Place::either};
    case BindingKind::text:
        if (field.isRequired || !binding.bindTo.isEmpty())
            return std::nullopt;
        return Slot{&field, {}, {}, nullptr, Place::text};
    case BindingKind::flattened:
        break;
    }
    return std::nullopt;
}

std::optional<Slot> slotOf(const FieldPlan& field) {
    if (!field.isContainer || field.bindings.size() != 1)
        return std::nullopt;
    if (field.isCollection())
        return slotOfItems(field);
    return field.bindings.front().location.isEmpty() ? slotOfValue(field) : std::nullopt;
}

// Whether an attribute or a child could go to either.
bool sharesName(const Slot& one, const Slot& other) {
    const bool isOfOneKind = (one.mayBeAttribute() && other.mayBeAttribute()) ||
                             (one.mayBeChild() && other.mayBeChild()) || one.place == other.place;
    return isOfOneKind && one.name == other.name;
}

} // namespace

std::optional<UsualForm> UsualForm::of(const ClassPlan& plan) {
    constexpr std::size_t mostLevels = 16;
    UsualForm form;
    ExtendsWalk walk(plan);
    std::size_t levels = 0;
    do {
        for (const FieldPlan& field : walk.current().fields)
            if (!form.add(field))
                return std::nullopt;
    } while (walk.next() && ++levels < mostLevels);
    const bool isWhole = levels < mostLevels && walk.broken().isNull();
    return isWhole ? std::optional(std::move(form)) : std::nullopt;
}

bool UsualForm::add(const FieldPlan& field) {
    const auto slot = slotOf(field);
    if (!slot || _slots.size() == mostSlots || std::ranges::any_of(_slots, [&](const Slot& other) {
            return other.field->key == field.key || sharesName(other, *slot);
        }))
        return false;
    if (slot->place == Place::text)
        _textSlot = _slots.size();
    _hasItems = _hasItems || slot->place == Place::items;
    if (field.isRequired && !field.isCollection())
        _required |= 1U << _slots.size();
    _slots.push_back(*slot);
    return true;
}

} // namespace qx::detail
