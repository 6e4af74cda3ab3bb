// Unknown XML that a program has changed on an object. What a field took, too, is none of it.

#include "saving/UpdatePlan.h"

#include <algorithm>
#include <unordered_map>
#include <unordered_set>

namespace qx::detail {

using Form = ReadingTrace::Form;
using Kept = WritingTrace::Kept;

namespace {

bool areEqual(const std::vector<Kept>& a, const std::vector<Kept>& b) {
    return std::equal(a.begin(), a.end(), b.begin(), b.end(),
                      [](const Kept& x, const Kept& y) { return x.text == y.text; });
}

} // namespace

void UpdatePlan::compareKept(const Context& context) {
    static const WritingTrace::KeptList nothing;
    const auto* before = _source.before.keptOf(context.before);
    const auto* after = _source.after.keptOf(context.after);
    const WritingTrace::KeptList& was = before != nullptr ? *before : nothing;
    const WritingTrace::KeptList& is = after != nullptr ? *after : nothing;
    if (!areEqual(was.children, is.children)) {
        countDoubles(*_source.after.plan(context.after), was.children, is.children);
        compareKeptChildren(context, was, is);
    }
    if (!areEqual(was.attributes, is.attributes)) {
        countDoubles(*_source.after.plan(context.after), was.attributes, is.attributes);
        compareKeptAttributes(context, was, is);
    }
    if (!is.declarations.empty() && !areEqual(was.declarations, is.declarations))
        compareDeclarations(context, was, is);
}

// Declarations stay what they are while the object keeps none: it may have been made by a program.
void UpdatePlan::compareDeclarations(const Context& context, const WritingTrace::KeptList& was,
                                     const WritingTrace::KeptList& is) {
    std::unordered_map<String, const Kept*> now;
    for (const Kept& each : is.declarations)
        now.try_emplace(each.node->name(), &each);
    std::vector<Entry> entries;
    for (const std::uint32_t number : usesOf(context.owner, nullptr))
        if (use(number).form == Form::declaration)
            entries.push_back(use(number).entry);
    for (std::size_t i = 0; i < was.declarations.size(); ++i) {
        const auto kept = now.find(was.declarations[i].node->name());
        const Kept* const found = kept != now.end() ? kept->second : nullptr;
        if (found != nullptr)
            now.erase(kept);
        if (found != nullptr && found->text == was.declarations[i].text)
            continue;
        if (!changeInTag(context, i < entries.size() ? entries[i] : none, found))
            return;
    }
    for (const Kept& each : is.declarations)
        if (const auto left = now.find(each.node->name());
            left != now.end() && left->second == &each)
            addToTag(context,
                     each.node->name().isEmpty() ? "xmlns" : "xmlns:" + each.node->name().str(),
                     each);
}

// The attribute or declaration gets the value of what is kept now, or goes where nothing is. False
// where it has no place.
bool UpdatePlan::changeInTag(const Context& context, Entry entry, const Kept* now) {
    const SourceMarkup::Spot spot = entry != none ? _source.markup[entry] : SourceMarkup::Spot();
    if (!spot.isPlaced()) {
        fail(context.after);
        return false;
    }
    const char quote = _source.markup.text()[spot.end - 1];
    if (now != nullptr)
        add(spot.insideBegin, spot.insideEnd,
            _source.writer.attributeValue(now->node->stringValue().view(), quote), context.after);
    else
        add(blanksBefore(spot.begin), spot.end, {}, context.after);
    return true;
}

// Behind the element's name.
void UpdatePlan::addToTag(const Context& context, std::string_view name, const Kept& kept) {
    const SourceMarkup::Spot tag = _source.markup[context.entry];
    if (!tag.isPlaced())
        return fail(context.after);
    const auto nameEnd =
        tag.begin + 1 +
        static_cast<SourceMarkup::Offset>(_source.document.writtenName(context.entry).size());
    add(nameEnd, nameEnd, _source.writer.attribute(name, kept.node->stringValue().view()),
        context.after);
}

// What a field took, too, is as old in the object as the object's reading. Where fields took all of
// a name, they would again; where there are as many of its name in both, it stands in the same
// place.
void UpdatePlan::countDoubles(const ClassPlan& plan, const std::vector<Kept>& was,
                              const std::vector<Kept>& is) {
    std::unordered_map<String, std::vector<const Kept*>> before, now;
    for (const Kept& each : was)
        before[each.node->name()].push_back(&each);
    for (const Kept& each : is)
        now[each.node->name()].push_back(&each);
    for (const auto& [name, named] : before) {
        const auto isTaken = [&](const Kept* kept) {
            return _source.writer.isTaken(&plan, kept->text);
        };
        const auto& same = now[name];
        const bool areAllTaken = std::ranges::all_of(named, isTaken);
        const bool areAsMany = same.size() == named.size();
        for (std::size_t i = 0; i < same.size(); ++i)
            if (areAllTaken || (areAsMany && isTaken(named[i])))
                _source.writer.countAsTaken(&plan, same[i]->text);
    }
}

bool UpdatePlan::mayAddKept(Shown object, const std::string& text) {
    _newKept.emplace_back(object, text);
    return _ways.addKept;
}

// Whether a field of the class may take a node of its name, and would take it from a new element.
bool UpdatePlan::isNamedByField(const ClassPlan& plan, const Kept& kept) {
    const String& name = kept.node->name();
    const auto names = [&](const BindingPlan& binding) {
        return binding.name == name || binding.bindTo == name || binding.location == name;
    };
    ExtendsWalk walk(plan);
    do {
        for (const FieldPlan& field : walk.current().fields)
            if (!field.isContainer || std::ranges::any_of(field.bindings, names))
                return true;
    } while (walk.next());
    return false;
}

// The object lists them by name, each name's in the order of the document.
std::vector<UpdatePlan::Entry> UpdatePlan::entriesOfKept(const Context& context,
                                                         const std::vector<Kept>& kept) const {
    std::unordered_map<String, std::vector<Entry>> byName;
    const auto uses = usesOf(context.owner, nullptr);
    for (auto number = uses.rbegin(); number != uses.rend(); ++number)
        if (use(*number).form != Form::declaration)
            byName[_source.document.writtenName(use(*number).entry)].push_back(use(*number).entry);
    std::vector<Entry> entries;
    for (const Kept& each : kept) {
        std::vector<Entry>& named = byName[each.node->name()];
        entries.push_back(named.empty() ? none : named.back());
        if (!named.empty())
            named.pop_back();
    }
    return entries;
}

void UpdatePlan::compareKeptChildren(const Context& context, const WritingTrace::KeptList& was,
                                     const WritingTrace::KeptList& is) {
    const ClassPlan* const plan = _source.after.plan(context.after);
    const std::vector<Entry> entries = entriesOfKept(context, was.children);
    const auto itemsOf = [&](const std::vector<Kept>& all) {
        std::vector<ListItem> items;
        for (const Kept& each : all)
            items.push_back({std::hash<std::string>()(each.text),
                             std::hash<std::string_view>()(each.node->name().view())});
        return items;
    };
    const ListMatching matching = match(itemsOf(was.children), itemsOf(is.children));
    std::vector<bool> isThere(was.children.size());
    const Place end = placeInside(context.entry);
    for (std::size_t i = 0; i < is.children.size(); ++i) {
        const std::string& text = is.children[i].text;
        const std::size_t before = matching.was[i];
        if (before == ListMatching::none) {
            if (!_source.writer.isTaken(plan, text) && mayAddKept(context.after, text))
                insertChild(_source.writer.markup(text), end, context.after);
            continue;
        }
        isThere[before] = true;
        if (text == was.children[before].text ||
            _source.writer.isTaken(plan, was.children[before].text))
            continue;
        const Entry entry = entries[before];
        if (entry == none || !_source.markup[entry].isPlaced())
            return fail(context.after);
        add(_source.markup[entry].begin, _source.markup[entry].end, _source.writer.markup(text),
            context.after);
    }
    for (std::size_t i = 0; i < isThere.size(); ++i) {
        if (isThere[i] || _source.writer.isTaken(plan, was.children[i].text))
            continue;
        if (entries[i] == none)
            return fail(context.after);
        removeElement(entries[i], context.after);
    }
}

void UpdatePlan::compareKeptAttributes(const Context& context, const WritingTrace::KeptList& was,
                                       const WritingTrace::KeptList& is) {
    const std::vector<Entry> entries = entriesOfKept(context, was.attributes);
    std::unordered_map<String, std::vector<const Kept*>> now; // those of wrappers may share a name
    for (auto each = is.attributes.rbegin(); each != is.attributes.rend(); ++each)
        now[each->node->name()].push_back(&*each);
    std::unordered_set<const Kept*> known;
    for (std::size_t i = 0; i < was.attributes.size(); ++i) {
        auto& named = now[was.attributes[i].node->name()];
        const Kept* const kept = !named.empty() ? named.back() : nullptr;
        if (kept != nullptr) {
            named.pop_back();
            known.insert(kept);
        }
        const bool isDouble =
            _source.writer.isTaken(_source.after.plan(context.after), was.attributes[i].text);
        if (isDouble || (kept != nullptr && kept->text == was.attributes[i].text))
            continue;
        if (!changeInTag(context, entries[i], kept))
            return;
    }
    for (const Kept& each : is.attributes)
        if (!known.contains(&each) && mayAddKept(context.after, each.text))
            addToTag(context, each.node->name().view(), each);
}

} // namespace qx::detail
