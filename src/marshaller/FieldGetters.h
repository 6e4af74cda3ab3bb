#pragma once

// Where the fields of a mapped class have their values in objects of one class: the properties,
// looked up once in a writing. Without them structs take 3 % more instructions, and records 18 %
// where a class was described with properties of their keys (bench/orders_bench.cpp, write).

#include "marshaller/ObjectAccess.h"
#include "plan/ClassPlan.h"

#include <forward_list>
#include <vector>

namespace qx::detail {

class FieldGetters {
public:
    // In the order of the plan's fields; null where the class has no such property. Good as long as
    // this object.
    struct Getters {
        const ClassPlan* plan;
        const Class* type;
        std::vector<const Property*> properties;
    };

    const Getters& of(const ClassPlan& plan, const Object& object) {
        const Class& type = object.isa();
        if (_known.size() > plan.index && !_known[plan.index].empty()) [[likely]] {
            const Getters& latest = _known[plan.index].front();
            if (latest.plan == &plan && latest.type == &type) [[likely]]
                return latest;
        }
        return lookUp(plan, type);
    }

private:
    const Getters& lookUp(const ClassPlan& plan, const Class& type);

    // By the plan's index, the latest first. Plans that are made for a single step share one.
    std::vector<std::forward_list<Getters>> _known;
};

} // namespace qx::detail
