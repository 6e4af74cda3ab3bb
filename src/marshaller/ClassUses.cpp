#include "marshaller/ClassUses.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/detail/StructPlacing.h>

#include "model/ClassVersion.h"

#include <algorithm>

namespace qx::detail {

ClassUses::ClassUses(Ref<const QXXMLMarshallingMapping> mapping)
    : _mapping(std::move(mapping)), _version(classVersion()),
      _uses(MappingPlan::of(_mapping.get()).classCount() + 1) {}

bool ClassUses::holdFor(const QXXMLMarshallingMapping* mapping) const noexcept {
    return !_isSpoilt && _mapping.get() == mapping && _version == classVersion();
}

void ClassUses::lookUp(Use& use, const ClassPlan& plan) {
    if (use.reading == 0 || _version != classVersion()) {
        use.type = Class::named(plan.classNameToInstantiate.view());
        use.latest = nullptr;
        _outdated.splice_after(_outdated.before_begin(), use.setters);
    }
    use.reading = _reading;
}

void ClassUses::setUnmakeable(const ClassPlan& plan) {
    _uses[plan.index].type = nullptr;
    _isSpoilt = true;
}

const ClassUses::Setters& ClassUses::findSetters(const ClassPlan& plan, const Object& object) {
    static const Selector announces("automaticallyNotifiesObserversForKey:");
    const Class& type = object.isa();
    auto& known = _uses[plan.index].setters;
    const auto found = std::ranges::find(known, &type, &Setters::type);
    if (found != known.end())
        return *found;
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
    return known.emplace_front(std::move(setters));
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
