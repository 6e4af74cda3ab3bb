#include "saving/ShownComparison.h"

#include <algorithm>

namespace qx::detail {

using Kind = WritingTrace::Kind;

ShownComparison::Shown ShownComparison::firstDifference() {
    if (_wanted.size() == 0 || _found.size() == 0)
        return _wanted.size() == _found.size() ? none : 0;
    return compare(0, 0);
}

ShownComparison::Shown ShownComparison::compare(Shown wanted, Shown found) {
    const auto& is = _wanted[wanted];
    const auto& other = _found[found];
    if (is.hash == other.hash && !_comparesDeclarations)
        return none;
    if (is.kind != other.kind)
        return differs(wanted, found);
    if (is.kind == Kind::text)
        return _wanted.text(wanted) == _found.text(found) ? none : differs(wanted, found);
    if (is.kind == Kind::object ? _wanted.plan(wanted) != _found.plan(found)
                                : is.field != other.field)
        return differs(wanted, found);
    if (const Shown different = compareInside(wanted, found); different != none)
        return different;
    const bool isSame =
        is.kind == Kind::field || (keepTheSame(wanted, found) && declareTheSame(wanted, found));
    return isSame ? none : differs(wanted, found);
}

ShownComparison::Shown ShownComparison::compareInside(Shown wanted, Shown found) {
    const auto& is = _wanted[wanted];
    const auto& other = _found[found];
    const bool isOfOtherForm = is.kind == Kind::field && is.isList != other.isList;
    Shown a = wanted + 1, b = found + 1;
    while (true) {
        while (a < is.next && _wanted[a].isHidden)
            a = _wanted[a].next;
        while (b < other.next && _found[b].isHidden)
            b = _found[b].next;
        if (a >= is.next || b >= other.next)
            return a >= is.next && b >= other.next ? none : differs(wanted, found);
        if (isOfOtherForm)
            return differs(wanted, found);
        if (const Shown different = compare(a, b); different != none)
            return different;
        a = _wanted[a].next;
        b = _found[b].next;
    }
}

String ShownComparison::foundInstead() const {
    if (_different == none)
        return "nothing";
    Shown value = _different;
    if (_found[value].kind == Kind::field) {
        const auto values = _found.shownValues(value);
        if (values.empty())
            return "nothing";
        value = values.front();
    }
    if (_found[value].kind == Kind::text)
        return String(_found.text(value));
    return value == _different ? "an object that keeps other unknown XML" : "another object";
}

std::vector<std::string> ShownComparison::kept(const WritingTrace& trace, Shown object,
                                               bool attributes) const {
    std::vector<std::string> texts;
    if (const auto* const list = trace.keptOf(object))
        for (const auto& each : attributes ? list->attributes : list->children)
            if (!_isDouble(trace.plan(object), each.text) &&
                (&trace != &_wanted || !_leftOut.contains({object, each.text})))
                texts.push_back(each.text);
    return texts;
}

// Attributes have no order; children have one among those of a name.
bool ShownComparison::keepTheSame(Shown wanted, Shown found) const {
    for (const bool attributes : {false, true}) {
        auto is = kept(_wanted, wanted, attributes);
        auto other = kept(_found, found, attributes);
        std::sort(is.begin(), is.end());
        std::sort(other.begin(), other.end());
        if (is != other)
            return false;
    }
    return true;
}

bool ShownComparison::declareTheSame(Shown wanted, Shown found) const {
    const auto* const is = _wanted.keptOf(wanted);
    if (!_comparesDeclarations || is == nullptr || is->declarations.empty())
        return true;
    const auto textsOf = [](const WritingTrace::KeptList* list) {
        std::set<std::string> texts;
        for (const auto& each :
             list != nullptr ? list->declarations : std::vector<WritingTrace::Kept>())
            texts.insert(each.text);
        return texts;
    };
    return textsOf(is) == textsOf(_found.keptOf(found));
}

void ShownComparison::forEachUnshown(const std::function<void(Shown)>& visit) const {
    if (!_wanted.hidesSome())
        return;
    // Both show the same, but for hidden values, which stand one in a field.
    Shown b = 0;
    for (Shown a = 0; a < _wanted.size() && b < _found.size(); ++a, ++b) {
        const bool isHidden = _wanted[a].isHidden;
        const bool isOther = _found[b].isHidden;
        if (isHidden && isOther) {
            if (_wanted[a].kind != _found[b].kind || _wanted[a].hash != _found[b].hash)
                visit(a);
            a = _wanted[a].next - 1;
            b = _found[b].next - 1;
        } else if (isHidden) {
            visit(a);
            a = _wanted[a].next - 1;
            --b;
        } else if (isOther) {
            b = _found[b].next - 1;
            --a;
        }
    }
}

} // namespace qx::detail
