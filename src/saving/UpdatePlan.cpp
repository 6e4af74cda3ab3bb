#include "saving/UpdatePlan.h"

#include <algorithm>

namespace qx::detail {

using Form = ReadingTrace::Form;

UpdatePlan::UpdatePlan(const UpdateSource& source, const std::set<Shown>& anew, Ways ways)
    : _source(source), _anew(anew), _ways(ways),
      _comparesAll(source.after.declaresOtherThan(source.before)) {}

void UpdatePlan::run() {
    compareObject(0, 0, 0, nullptr, 0);
    if (findMoves()) {
        startAgain();
        compareObject(0, 0, 0, nullptr, 0);
    }
    finishOpenings();
}

// Those of the objects inside stand among its own.
std::span<const std::uint32_t> UpdatePlan::usesOf(std::uint32_t owner) const {
    const auto [known, isNew] = _uses.try_emplace(owner);
    std::vector<std::uint32_t>& own = known->second;
    if (!isNew)
        return own;
    const auto& owners = _source.read.owners();
    const auto forEachOwn = [&](auto visit) {
        for (std::uint32_t at = owners[owner].firstUse; at < owners[owner].usesEnd;) {
            if (use(at).owner == owner)
                visit(at);
            at = use(at).made != none ? owners[use(at).made].usesEnd : at + 1;
        }
    };
    std::size_t count = 0;
    forEachOwn([&](std::uint32_t) { ++count; });
    own.reserve(count);
    forEachOwn([&](std::uint32_t number) { own.push_back(number); });
    const auto fieldOf = [&](std::uint32_t number) { return use(number).field; };
    if (!std::ranges::is_sorted(own, {}, fieldOf))
        std::ranges::stable_sort(own, {}, fieldOf);
    return own;
}

std::span<const std::uint32_t> UpdatePlan::usesOf(std::uint32_t owner,
                                                  const FieldPlan* field) const {
    const auto found = std::ranges::equal_range(
        usesOf(owner), field, {}, [&](std::uint32_t number) { return use(number).field; });
    return {found.begin(), found.end()};
}

UpdatePlan::Shown UpdatePlan::objectAround(Shown shown) const {
    const auto& after = _source.after;
    for (Shown at = shown; at != WritingTrace::none; at = after[at].around) {
        const auto owner = _owners.find(at);
        if (after[at].kind != WritingTrace::Kind::object || owner == _owners.end() ||
            _anew.contains(at))
            continue;
        const std::uint32_t made = _source.read.owners()[owner->second].use;
        if (made == ReadingTrace::none)
            return WritingTrace::none;
        if (use(made).form != Form::flattened)
            return at;
    }
    return WritingTrace::none;
}

void UpdatePlan::compareObject(Shown before, Shown after, std::uint32_t owner,
                               const Context* parent, std::size_t ordinal) {
    _owners[after] = owner;
    const Entry element = _source.read.owners()[owner].element;
    if (_anew.contains(after)) {
        const String name = _source.document.name(element);
        return replaceElement(element, after, &name);
    }
    if (!_comparesAll && areSame(before, after))
        return;
    const Context context{before, after, owner, parent, ordinal, element};
    std::size_t field = 0;
    Shown was = before + 1;
    for (Shown is = after + 1; is < _source.after[after].next; is = _source.after[is].next) {
        compareField(context, was, is, field++);
        was = _source.before[was].next;
    }
    compareKept(context);
}

void UpdatePlan::compareField(const Context& context, Shown before, Shown after,
                              std::size_t ordinal) {
    if (areSame(before, after))
        return _comparesAll ? compareInside(context, before, after, ordinal) : void();
    if (_source.before[before].isList || _source.after[after].isList)
        return compareList(context, before, after, ordinal);
    const auto was = _source.before.shownValues(before);
    const auto is = _source.after.shownValues(after);
    compareSingle(context, was.empty() ? none : was.front(), is.empty() ? none : is.front(), after,
                  ordinal);
}

// Of a field that says the same, the objects. Where it does not show what they were read from,
// nothing is changed in them.
void UpdatePlan::compareInside(const Context& context, Shown before, Shown after,
                               std::size_t ordinal) {
    List list;
    list.was = _source.before.shownValues(before);
    list.is = _source.after.shownValues(after);
    list.plan = _source.after[after].field;
    if (_source.after[after].isList && !findEntries(context, list))
        return;
    if (!_source.after[after].isList)
        for (const std::uint32_t number : usesOf(context.owner, list.plan))
            if (use(number).form != Form::wrapper)
                list.uses = {number};
    for (std::size_t i = 0; i < list.is.size() && i < list.uses.size(); ++i)
        if (!isText(list.is[i]) && use(list.uses[i]).made != none)
            compareObject(list.was[i], list.is[i], use(list.uses[i]).made, &context, ordinal);
}

void UpdatePlan::compareSingle(const Context& context, Shown was, Shown is, Shown field,
                               std::size_t ordinal) {
    if (was == none && is == none)
        return;
    std::uint32_t taken = none;
    for (const std::uint32_t number : usesOf(context.owner, _source.after[field].field))
        if (use(number).form != Form::wrapper)
            taken = number;
    if (taken == none)
        return is != none && was == none ? insertValue(context, is, field, ordinal) : fail(field);
    if (is == none)
        return removeValue(taken, field);
    const bool isAttribute = use(taken).form == Form::attribute;
    if (isAttribute && !_source.markup[use(taken).entry].isPlaced())
        return insertAttribute(context, parentOf(use(taken).entry), is, ordinal);
    compareValue(context, taken, was, is, ordinal);
}

// A value in the place where one was read.
void UpdatePlan::compareValue(const Context& context, std::uint32_t number, Shown was, Shown is,
                              std::size_t ordinal) {
    const ReadingTrace::Use& taken = use(number);
    const auto& before = _source.before;
    const bool wasText = was == none || before[was].kind == WritingTrace::Kind::text;
    if (wasText && isText(is)) {
        const std::string_view text = was != none ? before.text(was) : std::string_view();
        const bool isOwn = taken.form == Form::text || taken.form == Form::flattened;
        if (taken.form == Form::attribute)
            return setAttribute(taken.entry, is);
        return setText(taken.entry, isOwn, text, _source.after.text(is), is);
    }
    const bool isSameClass =
        !wasText && !isText(is) && taken.made != none && before.plan(was) == _source.after.plan(is);
    if (isSameClass)
        return compareObject(was, is, taken.made, &context, ordinal);
    const bool mayBeReplaced = taken.form == Form::child || taken.form == Form::item;
    if (mayBeReplaced && !isText(is))
        return replaceElement(taken.entry, is, nullptr);
    fail(is);
}

void UpdatePlan::removeValue(std::uint32_t number, Shown field) {
    const ReadingTrace::Use& taken = use(number);
    switch (taken.form) {
    case Form::attribute:
        return removeAttribute(taken.entry, parentOf(taken.entry), field);
    case Form::child:
        return removeElement(taken.entry, field);
    case Form::text:
        return setText(taken.entry, true, {}, {}, field);
    default:
        return fail(field);
    }
}

} // namespace qx::detail
