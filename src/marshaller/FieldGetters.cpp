#include "marshaller/FieldGetters.h"

namespace qx::detail {

const FieldGetters::Getters& FieldGetters::lookUp(const ClassPlan& plan, const Class& type) {
    if (_known.size() <= plan.index)
        _known.resize(plan.index + 1);
    std::forward_list<Getters>& all = _known[plan.index];
    for (auto before = all.before_begin(), at = all.begin(); at != all.end(); before = at++)
        if (at->plan == &plan && at->type == &type) {
            all.splice_after(all.before_begin(), all, before);
            return all.front();
        }
    Getters& getters = all.emplace_front(Getters{&plan, &type, {}});
    getters.properties.reserve(plan.fields.size());
    for (const FieldPlan& field : plan.fields)
        getters.properties.push_back(type.property(field.key));
    return getters;
}

} // namespace qx::detail
