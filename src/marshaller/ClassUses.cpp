#include "marshaller/ClassUses.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/detail/StructPlacing.h>

#include <algorithm>

namespace qx::detail {

ClassUses::ClassUses(Ref<const QXXMLMarshallingMapping> mapping)
    : _mapping(std::move(mapping)), _version(classVersion()) {}

void ClassUses::lookUp(Use& use, const ClassPlan& plan) {
    use.type = Class::named(plan.classNameToInstantiate.view());
    use.isKnown = true;
}

void ClassUses::setUnmakeable(const ClassPlan& plan) {
    useOf(plan).type = nullptr;
    _isSpoilt = true;
}

namespace {

// Those of that class; null where none are.
template <class Found>
const Found* find(const std::forward_list<Found>& all, const Class& type) {
    const auto found = std::ranges::find(all, &type, &Found::type);
    return found != all.end() ? &*found : nullptr;
}

} // namespace

const ClassUses::Getters& ClassUses::findGetters(const ClassPlan& plan, const Class& type) {
    Use& use = useOf(plan);
    use.getters = find(use.allGetters, type);
    if (use.getters != nullptr)
        return *use.getters;
    Getters getters{&type, {}};
    getters.properties.reserve(plan.fields.size());
    for (const FieldPlan& field : plan.fields)
        getters.properties.push_back(type.property(field.key));
    return *(use.getters = &use.allGetters.emplace_front(std::move(getters)));
}

const ClassUses::Setters& ClassUses::findSetters(const ClassPlan& plan, const Object& object) {
    static const Selector announces("automaticallyNotifiesObserversForKey:");
    const Class& type = object.isa();
    if (const Setters* const known = find(useOf(plan).allSetters, type))
        return *(useOf(plan).setters = known);
    Setters setters;
    setters.type = &type;
    setters.appends = &type == &QXGenericRecord::classObject();
    setters.usesProperties =
        type.isStruct() || (type.setsByProperty() && typeid(object) == type.type() &&
                            type.classOperation(announces) == nullptr);
    setters.slots.reserve(plan.usualForm->slots().size());
    for (const UsualForm::Slot& slot : plan.usualForm->slots()) {
        const Key key = slot.field->key;
        const Property* const property = type.property(key);
        setters.slots.push_back({property, placedClass(slot, property)});
        setters.appends = setters.appends && property == nullptr && !key.view().starts_with('@');
    }
    Use& use = useOf(plan);
    return *(use.setters = &use.allSetters.emplace_front(std::move(setters)));
}

const Class* ClassUses::placedClass(const UsualForm::Slot& slot, const Property* property) {
    const StructPlacing* const placing = property != nullptr ? property->placing : nullptr;
    if (placing == nullptr || placing->isList() != slot.isList() || slot.plan == nullptr)
        return nullptr;
    // Whether such objects can be made is found out when the first of them is.
    const Class* const type = classOf(*slot.plan);
    return type != nullptr && type->isStruct() && type->type() == *placing->type ? type : nullptr;
}

} // namespace qx::detail
