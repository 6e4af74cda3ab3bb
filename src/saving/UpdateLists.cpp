// Collections: which items are new, gone or moved, and where they stand.

#include "saving/UpdatePlan.h"

#include <algorithm>
#include <unordered_set>
#include <utility>

namespace qx::detail {

using Form = ReadingTrace::Form;

void UpdatePlan::compareList(const Context& context, Shown before, Shown after,
                             std::size_t ordinal) {
    List list;
    list.was = _source.before.shownValues(before);
    list.is = _source.after.shownValues(after);
    if (list.was.empty() && list.is.empty())
        return;
    list.plan = _source.after[after].field;
    list.field = after;
    if (!findEntries(context, list))
        return fail(after);
    if (list.is.empty() && removeWrapper(list))
        return;
    if (list.was.empty())
        return fillList(context, list, ordinal);
    arrangeList(context, list, ordinal);
}

namespace {

// Null of a text and of a plain struct.
const Object* objectIn(const WritingTrace& trace, WritingTrace::Number value) {
    return trace[value].kind == WritingTrace::Kind::object ? trace.object(value) : nullptr;
}

} // namespace

// By place, or, where a setter has sorted them, by the objects themselves. False where it does not
// show which is which.
bool UpdatePlan::findEntries(const Context& context, List& list) const {
    for (const std::uint32_t number : usesOf(context.owner, list.plan)) {
        const ReadingTrace::Use& taken = use(number);
        list.binding = taken.binding;
        if (taken.form == Form::wrapper)
            list.wrapper = taken.entry;
        else if (taken.form == Form::item || taken.form == Form::child)
            list.uses.push_back(number);
    }
    if (list.uses.size() != list.was.size())
        return false;
    bool isSorted = false;
    for (std::size_t i = 0; i < list.was.size(); ++i) {
        const Object* const object = objectIn(_source.before, list.was[i]);
        const bool isObject = _source.before[list.was[i]].kind == WritingTrace::Kind::object;
        if (isObject != (use(list.uses[i]).made != ReadingTrace::none))
            return false;
        isSorted = isSorted || (object != nullptr && object != objectOf(list.uses[i]));
    }
    return !isSorted || findObjects(list);
}

// What was read as it; null of a text.
const Object* UpdatePlan::objectOf(std::uint32_t number) const {
    const std::uint32_t made = use(number).made;
    return made != ReadingTrace::none ? _source.read.owners()[made].object : nullptr;
}

bool UpdatePlan::findObjects(List& list) const {
    std::unordered_map<const Object*, std::uint32_t> byObject;
    for (const std::uint32_t number : list.uses)
        byObject.emplace(objectOf(number), number);
    for (std::size_t i = 0; i < list.was.size(); ++i) {
        const Object* const object = objectIn(_source.before, list.was[i]);
        if (object == nullptr)
            continue;
        const auto found = byObject.find(object);
        if (found == byObject.end())
            return false;
        list.uses[i] = found->second;
    }
    return true;
}

namespace {

ListItem itemOf(const WritingTrace& trace, WritingTrace::Number value) {
    const WritingTrace::Shown& shown = trace[value];
    const bool isObject = shown.kind == WritingTrace::Kind::object;
    return {shown.hash, isObject ? reinterpret_cast<std::uintptr_t>(trace.plan(value)) : 0};
}

// The text of the item's field, where it has one.
std::string_view textOfField(const WritingTrace& trace, WritingTrace::Number item,
                             std::size_t ordinal) {
    WritingTrace::Number field = item + 1;
    for (std::size_t i = 0; i < ordinal; ++i)
        field = trace[field].next;
    const WritingTrace::Number value = field + 1;
    const bool hasText = value < trace[field].next && !trace[value].isHidden &&
                         trace[value].kind == WritingTrace::Kind::text;
    return hasText ? trace.text(value) : std::string_view();
}

// False where not all have one, each its own.
bool findKeys(const WritingTrace& trace, const std::vector<WritingTrace::Number>& values,
              std::size_t ordinal, std::vector<std::string_view>& keys) {
    std::unordered_set<std::string_view> seen;
    seen.reserve(values.size());
    keys.clear();
    keys.reserve(values.size());
    for (const WritingTrace::Number value : values) {
        const std::string_view text = textOfField(trace, value, ordinal);
        if (text.empty() || !seen.insert(text).second)
            return false;
        keys.push_back(text);
    }
    return true;
}

bool areOfKind(const WritingTrace& trace, const std::vector<WritingTrace::Number>& values,
               std::uint64_t kind) {
    return std::ranges::all_of(
        values, [&](WritingTrace::Number value) { return itemOf(trace, value).kind == kind; });
}

} // namespace

// The first attribute in the mapping's order that all items have, each its own.
ListKeys UpdatePlan::keysOf(const List& list) const {
    const Shown first = list.is.front();
    const std::uint64_t kind = itemOf(_source.after, first).kind;
    if (kind == 0 || !areOfKind(_source.before, list.was, kind) ||
        !areOfKind(_source.after, list.is, kind))
        return {};
    std::size_t ordinal = 0;
    ListKeys keys;
    for (Shown field = first + 1; field < _source.after[first].next;
         field = _source.after[field].next, ++ordinal)
        if (_source.after[field].field->kind == BindingKind::attribute &&
            findKeys(_source.before, list.was, ordinal, keys.before) &&
            findKeys(_source.after, list.is, ordinal, keys.now))
            return keys;
    return {};
}

// How many fields of two objects of a class say the same, and whether these keep the same; half as
// much are fields that both have.
std::size_t UpdatePlan::likeness(Shown was, Shown is) const {
    const auto& before = _source.before;
    const auto& after = _source.after;
    if (isText(is) || before[was].kind == WritingTrace::Kind::text)
        return 0;
    std::size_t alike = 0;
    Shown other = was + 1;
    for (Shown field = is + 1; field < after[is].next; field = after[field].next) {
        const bool haveBoth = after[field].next > field + 1 && before[other].next > other + 1;
        if (haveBoth)
            alike += after[field].hash == before[other].hash ? 2 : 1;
        other = before[other].next;
    }
    const auto* const kept = after.keptOf(is);
    const auto* const wasKept = before.keptOf(was);
    const bool keepsTheSame = kept != nullptr && wasKept != nullptr &&
                              kept->children.size() + kept->attributes.size() != 0 &&
                              kept->hash() == wasKept->hash();
    return alike + (keepsTheSame ? 4 : 0);
}

void UpdatePlan::arrangeList(const Context& context, const List& list, std::size_t ordinal) {
    std::vector<ListItem> before, now;
    before.reserve(list.was.size());
    now.reserve(list.is.size());
    for (const Shown value : list.was)
        before.push_back(itemOf(_source.before, value));
    for (const Shown value : list.is)
        now.push_back(itemOf(_source.after, value));
    const ListMatching matching = match(
        before, now,
        [&](std::size_t was, std::size_t is) { return likeness(list.was[was], list.is[is]); },
        [&] { return keysOf(list); },
        [&](std::size_t was) -> std::size_t {
            const SourceMarkup::Spot& spot = _source.markup[use(list.uses[was]).entry];
            return spot.isPlaced() ? spot.size() : 1;
        });
    std::size_t previous = ListMatching::none; // that has kept its place
    std::size_t first = 0;
    for (std::size_t i = 0; i < list.is.size() && first == 0; ++i)
        first = matching.stays[i] ? matching.was[i] + 1 : 0;
    const std::size_t front = first != 0 ? first - 1 : 0;
    for (std::size_t i = 0; i < list.is.size(); ++i) {
        const std::size_t was = matching.was[i];
        if (was != ListMatching::none && matching.stays[i]) {
            previous = was;
            const bool isSame = areSame(list.was[was], list.is[i]) && _anew.empty();
            if (!isSame || (_comparesAll && !isText(list.is[i])))
                compareValue(context, list.uses[was], list.was[was], list.is[i], ordinal);
            continue;
        }
        const Entry beside =
            use(list.uses[previous != ListMatching::none ? previous : front]).entry;
        if (!_source.markup[beside].isPlaced() || parentOf(beside) == none)
            return fail(list.is[i]);
        const Place place =
            previous != ListMatching::none ? placeBehind(beside) : placeBefore(beside);
        const std::string text =
            was != ListMatching::none
                ? moved(context, list, was, list.is[i], ordinal)
                : newItem(list, list.is[i], parentOf(beside), place.line, beside);
        insertChild(text, place, list.is[i]);
    }
    removeItems(list, matching);
}

// Those that are gone, and the places of those that have moved.
void UpdatePlan::removeItems(const List& list, const ListMatching& matching) {
    enum class Fate : std::uint8_t { gone, moved, stays };
    std::vector<Fate> fates(list.was.size());
    for (std::size_t i = 0; i < list.is.size(); ++i)
        if (matching.was[i] != ListMatching::none)
            fates[matching.was[i]] = matching.stays[i] ? Fate::stays : Fate::moved;
    for (std::size_t i = 0; i < list.was.size(); ++i) {
        const Entry entry = use(list.uses[i]).entry;
        if (fates[i] == Fate::stays)
            continue;
        if (!_source.markup[entry].isPlaced() || parentOf(entry) == none)
            return fail(list.field);
        if (fates[i] == Fate::gone)
            noteGone(list.was[i], list.uses[i]);
        const bool isMoved = fates[i] == Fate::moved || _movedFrom.contains(list.uses[i]);
        const auto [begin, end] = regionOf(entry, isMoved);
        _edits->add({begin, end, {}, list.field, _source.before.keyPath(list.was[i])});
    }
}

// The item's own text, with its comments and what has changed in it.
std::string UpdatePlan::moved(const Context& context, const List& list, std::size_t was, Shown is,
                              std::size_t ordinal) {
    const Entry entry = use(list.uses[was]).entry;
    const SourceMarkup::Spot& spot = _source.markup[entry];
    if (!spot.isPlaced()) {
        fail(is);
        return {};
    }
    EditList own;
    EditList* const outer = std::exchange(_edits, &own);
    auto openings = std::exchange(_openings, {});
    compareValue(context, list.uses[was], list.was[was], is, ordinal);
    finishOpenings();
    _openings = std::move(openings);
    _edits = outer;
    if (own.arrange() != nullptr)
        fail(is);
    const auto begin = _source.layout.isInline(parentOf(entry))
                           ? spot.begin
                           : _source.layout.withComments(spot.begin);
    return own.applied(_source.markup.text(), begin, spot.end);
}

// With the text that it had in another list, or printed.
std::string UpdatePlan::newItem(const List& list, Shown item, Entry inside,
                                const std::optional<std::string>& line, Entry beside) {
    if (const auto move = _moves.find(item); move != _moves.end())
        return movedFrom(move->second, line);
    if (_ways.moveAcross && !isText(item) && !_anew.contains(item)) {
        const String* const bindTo = nameOfItems(list);
        _added.push_back({item, inside, bindTo ? *bindTo : *_source.after.element(item)->name});
    }
    return printed(list, item, inside, line, beside);
}

// The bind name by which the others were read, where it is not the first.
const String* UpdatePlan::nameOfItems(const List& list) {
    const FieldPlan& plan = *list.plan;
    const bool isNamed = plan.hasType() && list.binding != 0 &&
                         list.binding < plan.bindings.size() &&
                         !plan.bindings[list.binding].bindTo.isEmpty();
    return isNamed ? &plan.bindings[list.binding].bindTo : nullptr;
}

// Under the name by which the others were read, on one line if the item beside it is.
std::string UpdatePlan::printed(const List& list, Shown item, Entry inside,
                                const std::optional<std::string>& line, Entry beside) {
    const FieldPlan& plan = *list.plan;
    const bool isTyped = plan.hasType() && list.binding < plan.bindings.size();
    const BindingPlan* const binding = isTyped ? &plan.bindings[list.binding] : nullptr;
    NewXML::Around around = this->around(inside, line);
    around.isOnOneLine = beside != none && _source.layout.isOnOneLine(beside);
    if (isText(item))
        return _source.writer.element(binding != nullptr ? binding->name : plan.xmlName(),
                                      _source.after.text(item), around);
    return _source.writer.element(*_source.after.element(item), nameOfItems(list), around);
}

// The first items: in the wrapper that is there, or in a new one.
void UpdatePlan::fillList(const Context& context, const List& list, std::size_t ordinal) {
    const FieldPlan& plan = *list.plan;
    const bool isNew = list.wrapper == none;
    const bool isWrapped =
        !plan.location().isEmpty() || (!plan.hasType() && !plan.bindTo().isEmpty() &&
                                       plan.bindings.front().classOfBindTo == nullptr);
    Place place = isNew ? placeFor(context, ordinal) : placeInside(list.wrapper);
    const Entry inside = isNew ? context.entry : list.wrapper;
    if (!isNew || !isWrapped) {
        for (const Shown item : list.is)
            insertChild(newItem(list, item, inside, place.line), place, item);
        return;
    }
    std::optional<std::string> line = place.line;
    if (line)
        *line += _source.layout.unit();
    std::string items;
    for (const Shown item : list.is)
        items += (line ? *line : "") + newItem(list, item, inside, line);
    const String& name = !plan.location().isEmpty() ? plan.location() : plan.bindTo();
    insertChild(_source.writer.wrapper(name, items, around(inside, place.line)), place, list.field);
}

// The last item goes with its wrapper, where that holds nothing else.
bool UpdatePlan::removeWrapper(const List& list) {
    if (list.wrapper == none || list.plan->isRequired || !_source.markup[list.wrapper].isPlaced() ||
        _source.index.firstChild(list.wrapper) != list.wrapper + 1)
        return false;
    std::size_t children = 0;
    _source.document.forEachChild(list.wrapper, [&](Entry) { ++children; });
    if (children != list.was.size())
        return false;
    removeElement(list.wrapper, list.field);
    for (std::size_t i = 0; i < list.was.size(); ++i)
        noteGone(list.was[i], list.uses[i]);
    return true;
}

} // namespace qx::detail
