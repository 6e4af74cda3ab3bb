#pragma once

// Whether two writings show the same: object by object and text by text, with what is kept. Kept
// nodes that a field takes, too, count for nothing.

#include "marshaller/WritingTrace.h"

#include <functional>

namespace qx::detail {

class ShownComparison {
public:
    using Shown = WritingTrace::Number;
    using IsDouble = std::function<bool(const ClassPlan*, const std::string&)>;
    static constexpr Shown none = WritingTrace::none;

    ShownComparison(const WritingTrace& wanted, const WritingTrace& found,
                    IsDouble isDouble = nullptr)
        : _wanted(wanted), _found(found), _isDouble(std::move(isDouble)) {}

    // The first object or field of the wanted ones that is another in the found ones; none where
    // all are the same.
    Shown firstDifference();
    // Calls visit(value) for each value of the wanted ones that is hidden, and another there.
    void forEachUnshown(const std::function<void(Shown)>& visit) const;

private:
    Shown compare(Shown wanted, Shown found);
    bool keepTheSame(Shown wanted, Shown found) const;
    std::vector<std::string> kept(const WritingTrace& trace, Shown object, bool attributes) const;

    const WritingTrace& _wanted;
    const WritingTrace& _found;
    const IsDouble _isDouble;
};

} // namespace qx::detail
