// Items that have gone to another list: those that are gone from one and new in another, with the
// same content, each the only one with it. They take their text along.

#include "saving/UpdatePlan.h"

#include <algorithm>

namespace qx::detail {

// An item that is gone, and those inside.
void UpdatePlan::noteGone(Shown was, std::uint32_t number) {
    if (use(number).made == none)
        return;
    _gone.push_back({was, number});
    noteGoneInside(was, use(number).made);
}

void UpdatePlan::noteGoneInside(Shown object, std::uint32_t owner) {
    const Context context{object, none, owner, nullptr, 0, none};
    _source.before.forEachInside(object, [&](Shown field) {
        List list;
        list.was = _source.before.shownValues(field);
        list.plan = _source.before[field].field;
        if (!findEntries(context, list))
            return;
        for (std::size_t i = 0; i < list.was.size(); ++i)
            if (_source.before[field].isList)
                noteGone(list.was[i], list.uses[i]);
            else if (use(list.uses[i]).made != none)
                noteGoneInside(list.was[i], use(list.uses[i]).made);
    });
}

// Whether there are any.
bool UpdatePlan::findMoves() {
    if (_gone.empty() || _added.empty() || _comparesAll)
        return false;
    struct Found {
        std::vector<const Gone*> gone;
        std::vector<const Added*> added;
    };
    std::unordered_map<std::uint64_t, Found> byContent;
    for (const Added& added : _added)
        byContent[_source.after[added.is].hash].added.push_back(&added);
    for (const Gone& gone : _gone)
        if (const auto found = byContent.find(_source.before[gone.was].hash);
            found != byContent.end())
            found->second.gone.push_back(&gone);
    std::unordered_set<Shown> movedFrom;
    for (const Gone& gone : _gone) {
        const auto found = byContent.find(_source.before[gone.was].hash);
        const bool isOne = found != byContent.end() && found->second.gone.size() == 1 &&
                           found->second.added.size() == 1;
        // What stands around it comes first, and takes it along.
        bool isInside = false;
        for (Shown at = gone.was; at != none && !isInside; at = _source.before[at].around)
            isInside = movedFrom.contains(at);
        if (!isOne || isInside || !mayMove(gone, *found->second.added.front()))
            continue;
        movedFrom.insert(gone.was);
        _moves.emplace(found->second.added.front()->is, gone.use);
        _movedFrom.insert(gone.use);
    }
    return !_moves.empty();
}

// Whether the text of what is gone may stand in the other place: under the same name, where the
// same namespaces are declared.
bool UpdatePlan::mayMove(const Gone& gone, const Added& added) const {
    const Entry entry = use(gone.use).entry;
    if (!_source.markup[entry].isPlaced() || parentOf(entry) == none ||
        _source.document.name(entry) != added.name)
        return false;
    const auto elementsAround = [&](Entry element) {
        std::vector<Entry> around;
        for (Entry at = element; at != none; at = parentOf(at))
            around.push_back(at);
        return around;
    };
    std::vector<Entry> from = elementsAround(parentOf(entry)), to = elementsAround(added.inside);
    while (!from.empty() && !to.empty() && from.back() == to.back()) {
        from.pop_back();
        to.pop_back();
    }
    from.insert(from.end(), to.begin(), to.end());
    return std::ranges::none_of(from, [&](Entry element) {
        bool declares = false;
        _source.document.forEachOfKind(XMLNodeKind::namespaceDeclaration, element,
                                       [&](Entry) { declares = true; });
        return declares;
    });
}

// All that was planned, once it is known what has moved.
void UpdatePlan::startAgain() {
    _all = {};
    _newKept.clear();
    _failures.clear();
    _rewritten.clear();
    _owners.clear();
    _openings.clear();
}

namespace {

// The blanks of a line's start, behind its line break.
std::string_view indentation(std::string_view line) {
    return line.substr(std::min(line.find_first_of(" \t"), line.size()));
}

} // namespace

// The item's text with the comments above it, indented like its new neighbours.
std::string UpdatePlan::movedFrom(std::uint32_t number, const std::optional<std::string>& line) {
    const Entry entry = use(number).entry;
    const SourceMarkup::Spot spot = _source.markup[entry];
    const bool isInline = _source.layout.isInline(parentOf(entry));
    const auto begin = isInline ? spot.begin : _source.layout.withComments(spot.begin);
    const auto old = isInline ? std::nullopt : _source.layout.lineStart(begin);
    EditList indents;
    if (old && line && indentation(*old) != indentation(*line)) {
        const std::string_view text = _source.markup.text();
        const Indent indent{indentation(*old), indentation(*line)};
        for (auto at = text.find("<!--", begin + 1); at < spot.begin;
             at = text.find("<!--", at + 1))
            indentAnew(static_cast<SourceMarkup::Offset>(at), indent, indents);
        if (begin != spot.begin)
            indentAnew(spot.begin, indent, indents);
        indentInside(entry, indent, indents);
        indents.arrange();
    }
    return indents.applied(_source.markup.text(), begin, spot.end);
}

// Where white space is layout.
void UpdatePlan::indentInside(Entry element, const Indent& indent, EditList& edits) const {
    for (Entry at = element; at < _source.index[element].next; ++at) {
        const XMLNodeKind kind = _source.index[at].nodeKind();
        const bool isNode = kind == XMLNodeKind::element || kind == XMLNodeKind::comment ||
                            kind == XMLNodeKind::processingInstruction;
        const SourceMarkup::Spot spot = isNode ? _source.markup[at] : SourceMarkup::Spot();
        if (!spot.isPlaced())
            continue;
        if (at != element && !_source.layout.isInline(parentOf(at)))
            indentAnew(spot.begin, indent, edits);
        if (kind == XMLNodeKind::element && !spot.isEmptyTag() && !_source.layout.isInline(at))
            indentAnew(spot.insideEnd, indent, edits);
    }
}

// What begins a line there.
void UpdatePlan::indentAnew(SourceMarkup::Offset place, const Indent& indent,
                            EditList& edits) const {
    const auto line = _source.layout.lineStart(place);
    if (!line || !indentation(*line).starts_with(indent.old))
        return;
    const auto begin = place - static_cast<SourceMarkup::Offset>(indentation(*line).size());
    const auto end = begin + static_cast<SourceMarkup::Offset>(indent.old.size());
    edits.add({begin, end, std::string(indent.now), none, {}});
}

} // namespace qx::detail
