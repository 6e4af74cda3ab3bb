#pragma once

// Whether two writings show the same: object by object and text by text, with what is kept. Kept
// nodes that a field takes, too, count for nothing.

#include "marshaller/WritingTrace.h"

#include <functional>
#include <set>

namespace qx::detail {

class ShownComparison {
public:
    using Shown = WritingTrace::Number;
    using IsDouble = std::function<bool(const ClassPlan*, const std::string&)>;
    using LeftOut = std::vector<std::pair<Shown, std::string>>;
    static constexpr Shown none = WritingTrace::none;

    ShownComparison(const WritingTrace& wanted, const WritingTrace& found,
                    IsDouble isDouble = nullptr, const LeftOut& leftOut = {})
        : _wanted(wanted), _found(found), _isDouble(std::move(isDouble)),
          _comparesDeclarations(wanted.declaresOtherThan(found)),
          _leftOut(leftOut.begin(), leftOut.end()) {}

    // The first object or field of the wanted ones that is another in the found ones; none where
    // all are the same.
    Shown firstDifference();
    // What is found there, in words: a text, "nothing", or what object.
    String foundInstead() const;
    // Calls visit(value) for each value of the wanted ones that is hidden, and another there.
    void forEachUnshown(const std::function<void(Shown)>& visit) const;

private:
    Shown compare(Shown wanted, Shown found);
    Shown compareInside(Shown wanted, Shown found);
    Shown differs(Shown wanted, Shown found) {
        _different = found;
        return wanted;
    }
    bool keepTheSame(Shown wanted, Shown found) const;
    bool declareTheSame(Shown wanted, Shown found) const;
    std::vector<std::string> kept(const WritingTrace& trace, Shown object, bool attributes) const;

    const WritingTrace& _wanted;
    const WritingTrace& _found;
    const IsDouble _isDouble;
    // Whether objects have to keep the same declarations, too: those that keep any.
    const bool _comparesDeclarations;
    // What the wanted ones keep and count as nothing: objects and texts.
    const std::set<std::pair<Shown, std::string>> _leftOut;
    Shown _different = none; // of the found ones
};

} // namespace qx::detail
