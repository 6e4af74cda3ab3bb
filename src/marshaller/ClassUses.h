#pragma once

// How objects of a mapping's classes are made, and their fields read and set: found out when the
// first one of each is read or written. The marshaller keeps that from one call to the next, as
// long as no class is described or forgotten.
//
// Without the properties at hand, writing structs takes 3 % more instructions, and records 18 %
// where a class was described with properties of their keys (bench/orders_bench.cpp, write).

#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>
#include <QXXMLMarshalling/model/Class.h>

#include "model/ClassVersion.h"
#include "plan/ClassPlan.h"

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
    // Where objects of one class have the values of the plan's fields, in the order of these; null
    // where the class has no such property.
    struct Getters {
        const Class* type = nullptr;
        std::vector<const Property*> properties;
    };

    explicit ClassUses(Ref<const QXXMLMarshallingMapping> mapping);

    // Whether that is what would be found out again; for a reading that holds them, and for
    // another.
    bool areCurrent() const noexcept { return _version == classVersion(); }
    bool holdFor(const QXXMLMarshallingMapping* mapping) const noexcept {
        return !_isSpoilt && _mapping.get() == mapping && areCurrent();
    }

    // The class that objects are made of; null where records stand in for it.
    const Class* classOf(const ClassPlan& plan) {
        Use& use = useOf(plan);
        if (!use.isKnown) [[unlikely]]
            lookUp(use, plan);
        return use.type;
    }
    // It cannot make one. That is found out, and told, in each reading anew.
    void setUnmakeable(const ClassPlan& plan);

    // Both are good as long as this. The first is for classes with a usual form.
    const Setters& settersOf(const ClassPlan& plan, const Object& object) {
        const Setters* const latest = useOf(plan).setters;
        return latest != nullptr && latest->type == &object.isa() ? *latest
                                                                  : findSetters(plan, object);
    }
    const Getters& gettersOf(const ClassPlan& plan, const Object& object) {
        const Getters* const latest = useOf(plan).getters;
        return latest != nullptr && latest->type == &object.isa() ? *latest
                                                                  : findGetters(plan, object.isa());
    }

private:
    struct Use {
        const Class* type = nullptr;
        bool isKnown = false;
        // The latest.
        const Setters* setters = nullptr;
        const Getters* getters = nullptr;
        // All of them, which stay where they are.
        std::forward_list<Setters> allSetters;
        std::forward_list<Getters> allGetters;
    };

    // Good until that of another plan is asked for.
    Use& useOf(const ClassPlan& plan) {
        if (_uses.size() <= plan.index) [[unlikely]]
            _uses.resize(plan.index + 1);
        return _uses[plan.index];
    }
    static void lookUp(Use& use, const ClassPlan& plan);
    const Setters& findSetters(const ClassPlan& plan, const Object& object);
    const Getters& findGetters(const ClassPlan& plan, const Class& type);
    const Class* placedClass(const UsualForm::Slot& slot, const Property* property);

    const Ref<const QXXMLMarshallingMapping> _mapping;
    const std::uint64_t _version;
    bool _isSpoilt = false;
    std::vector<Use> _uses; // by plan index
};

} // namespace qx::detail
