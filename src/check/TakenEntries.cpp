#include "check/TakenEntries.h"

#include <algorithm>
#include <numeric>

namespace qx::detail {

TakenEntries::TakenEntries(const XMLIndex& index, const ReadingTrace& trace)
    : _index(index), _trace(trace), _sortedUses(trace.uses().size()),
      _firstOwners(index.entries().size(), ReadingTrace::none) {
    std::iota(_sortedUses.begin(), _sortedUses.end(), 0U);
    std::stable_sort(_sortedUses.begin(), _sortedUses.end(), [&](std::uint32_t a, std::uint32_t b) {
        return trace.uses()[a].entry < trace.uses()[b].entry;
    });
    for (std::uint32_t owner = 0; owner < trace.owners().size(); ++owner) {
        std::uint32_t& first = _firstOwners[trace.owners()[owner].element];
        first = std::min(first, owner);
    }
}

std::vector<const TakenEntries::Use*> TakenEntries::usesOf(Number entry) const {
    const auto& uses = _trace.uses();
    auto at = std::lower_bound(
        _sortedUses.begin(), _sortedUses.end(), entry,
        [&](std::uint32_t use, Number wanted) { return uses[use].entry < wanted; });
    std::vector<const Use*> found;
    for (; at != _sortedUses.end() && uses[*at].entry == entry; ++at)
        found.push_back(&uses[*at]);
    return found;
}

const TakenEntries::Owner* TakenEntries::ownerOf(Number element) const {
    const std::uint32_t owner = _firstOwners[element];
    return owner != ReadingTrace::none ? &_trace.owners()[owner] : nullptr;
}

Tally::Concerned TakenEntries::concernedBy(Number entry) const {
    if (const Owner* const owner = ownerOf(entry))
        return {owner->plan->className.string()};
    for (const Use* use : usesOf(entry))
        if (use->field != nullptr)
            if (const auto type = use->field->mapping->classMapping())
                return {type->className(), use->field->key.string()};
    return {};
}

bool TakenEntries::hasText(Number element) const {
    const auto uses = usesOf(element);
    return std::any_of(uses.begin(), uses.end(),
                       [](const Use* use) { return use->form == ReadingTrace::Form::text; });
}

TakenEntries::Fate TakenEntries::fateOf(Number entry) const {
    using Form = ReadingTrace::Form;
    if (ownerOf(entry) != nullptr)
        return Fate::object;
    Fate fate = Fate::none;
    for (const Use* use : usesOf(entry)) {
        if (use->form == Form::attribute || use->form == Form::child || use->form == Form::item)
            return Fate::value;
        if (use->form == Form::wrapper)
            fate = Fate::wrapper;
    }
    return fate;
}

} // namespace qx::detail
