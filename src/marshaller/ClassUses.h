#pragma once

// How objects of a mapping's classes are made and set, found out when the first one of each is
// read. The marshaller keeps that from one reading to the next, as long as no class is described or
// forgotten. A host may do so in the middle of a reading: what that reading has not used by then is
// found out again.

#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>
#include <QXXMLMarshalling/model/Class.h>

#include "plan/MappingPlan.h"

#include <forward_list>
#include <vector>

namespace qx::detail {

class ClassUses {
public:
    // How the fields of a usual form are set in objects of one class.
    struct Setter {
        const Property* property; // null where the class has none
        const Class* placed;      // of the structs that are made in the property; null where boxed
    };
    struct Setters {
        const Class* type = nullptr;
        bool usesProperties = false; // while nobody observes the object
        bool appends = false;        // to the contents of a record that nobody has heard of
        std::vector<Setter> slots;
    };

    explicit ClassUses(Ref<const QXXMLMarshallingMapping> mapping);

    // Whether that is what would be found out again.
    bool holdFor(const QXXMLMarshallingMapping* mapping) const noexcept;

    void beginReading() noexcept { ++_reading; }

    // The class that objects are made of; null where records stand in for it.
    const Class* classOf(const ClassPlan& plan) {
        Use& use = _uses[plan.index];
        if (use.reading != _reading) [[unlikely]]
            lookUp(use, plan);
        return use.type;
    }
    // It cannot make one. That is found out, and told, in each reading anew.
    void setUnmakeable(const ClassPlan& plan);

    // The class has a usual form.
    const Setters& settersOf(const ClassPlan& plan, const Object& object) {
        const Setters*& latest = _uses[plan.index].latest;
        if (latest == nullptr || latest->type != &object.isa()) [[unlikely]]
            latest = &findSetters(plan, object);
        return *latest;
    }

private:
    struct Use {
        const Class* type = nullptr;
        const Setters* latest = nullptr;
        std::forward_list<Setters> setters; // which stay where they are
        std::uint64_t reading = 0;          // that used it last
    };

    void lookUp(Use& use, const ClassPlan& plan);
    const Setters& findSetters(const ClassPlan& plan, const Object& object);
    const Class* placedClass(const UsualForm::Slot& slot, const Property* property);

    const Ref<const QXXMLMarshallingMapping> _mapping;
    const std::uint64_t _version;
    bool _isSpoilt = false;
    std::uint64_t _reading = 1;
    std::vector<Use> _uses; // by plan index; the last one for a plan that stands in no mapping
    std::forward_list<Setters> _outdated; // objects that are being read may go by them
};

} // namespace qx::detail
