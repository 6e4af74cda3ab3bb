// What is new: attributes and elements get a place among those of the fields around them.

#include "model/Errors.h"
#include "saving/UpdatePlan.h"

#include <algorithm>

namespace qx::detail {

using Form = ReadingTrace::Form;

// As reading looks for it, which is not everywhere as writing writes it.
void UpdatePlan::insertValue(const Context& context, Shown value, Shown field,
                             std::size_t ordinal) {
    const FieldPlan& plan = *_source.after[field].field;
    const bool isText = this->isText(value);
    const bool isAttribute =
        isText && (plan.kind == BindingKind::attribute || plan.kind == BindingKind::automatic);
    if (isAttribute && (plan.location().isEmpty() || plan.kind == BindingKind::automatic))
        return insertAttribute(context, context.entry, value, ordinal);
    const String name = plan.xmlName();
    const bool isOwnText = plan.kind == BindingKind::text && plan.bindTo().isEmpty();
    if (isOwnText)
        return setText(context.entry, true, {}, _source.after.text(value), value);
    if (!isText && (plan.kind == BindingKind::flattened || !plan.isContainer))
        return fail(field);
    if (isAttribute) {
        const Entry wrapper = childNamed(context.entry, plan.location());
        if (wrapper != none)
            return insertAttribute(context, wrapper, value, ordinal);
    }
    const Place place = placeFor(context, ordinal);
    const NewXML::Around around = this->around(context.entry, place.line);
    const std::string printed =
        isAttribute ? _source.writer.elementWithAttribute(plan.location(), name,
                                                          _source.after.text(value), around)
        : isText    ? _source.writer.element(name, _source.after.text(value), around)
                    : _source.writer.element(*_source.after.element(value), nullptr, around);
    insertChild(printed, place, value);
}

// Behind the attribute of the field before it, or before that of the one behind it.
void UpdatePlan::insertAttribute(const Context& context, Entry element, Shown value,
                                 std::size_t ordinal) {
    const SourceMarkup::Spot& tag = _source.markup[element];
    if (!tag.isPlaced())
        return fail(value);
    const FieldPlan& plan = *_source.after[_source.after[value].around].field;
    std::string declaration;
    const std::string name =
        _source.writer.attributeName(plan.xmlName(), around(element, std::nullopt), declaration);
    Entry before = none, behind = none;
    std::size_t at = 0;
    for (Shown field = context.after + 1; field < _source.after[context.after].next;
         field = _source.after[field].next, ++at) {
        const Entry attribute = attributeOf(context, field);
        if (attribute == none || parentOf(attribute) != element)
            continue;
        if (at < ordinal)
            before = attribute;
        else if (at > ordinal && behind == none)
            behind = attribute;
    }
    const std::string_view text = _source.markup.text();
    Entry last = none;
    for (Entry entry = _source.index.content(element); entry < _source.index.firstChild(element);
         ++entry)
        if (_source.markup[entry].isPlaced() &&
            (last == none || _source.markup[entry].end > _source.markup[last].end))
            last = entry;
    const Entry beside = before != none ? before : behind != none ? behind : last;
    std::string blanks = " ";
    SourceMarkup::Offset place =
        tag.begin + 1 +
        static_cast<SourceMarkup::Offset>(_source.document.writtenName(element).size());
    char quote = _source.layout.quote();
    if (beside != none) {
        const SourceMarkup::Spot& spot = _source.markup[beside];
        const SourceMarkup::Offset begin = blanksBefore(spot.begin);
        if (const auto all = text.substr(begin, spot.begin - begin);
            all.find_first_of("\r\n") != all.npos)
            blanks = all;
        place = before != none || behind == none ? spot.end : begin;
        quote = text[spot.end - 1];
    }
    add(place, place,
        declaration + blanks + name + "=" + quote +
            _source.writer.attributeValue(_source.after.text(value), quote) + quote,
        value);
}

// The attribute that the field was read from.
UpdatePlan::Entry UpdatePlan::attributeOf(const Context& context, Shown field) const {
    for (const std::uint32_t number : usesOf(context.owner, _source.after[field].field))
        if (use(number).form == Form::attribute && _source.markup[use(number).entry].isPlaced())
            return use(number).entry;
    return none;
}

void UpdatePlan::insertChild(const std::string& printed, const Place& place, Shown shown) {
    if (place.at == SourceMarkup::none)
        return fail(shown);
    const std::string text = (place.line ? *place.line : "") + printed;
    if (place.opened == none)
        return add(place.at, place.at, text, shown);
    Opening& opening = _openings.try_emplace(place.opened, Opening{{}, {}, shown}).first->second;
    opening.content += text;
    opening.line = place.line;
}

// Beside text nothing is laid out.
void UpdatePlan::openWithText(Entry element, const std::string& text, Shown shown) {
    Opening& opening = _openings.try_emplace(element, Opening{{}, {}, shown}).first->second;
    opening.content.insert(0, text);
    opening.line.reset();
}

void UpdatePlan::replaceElement(Entry element, Shown object, const String* name) {
    const SourceMarkup::Spot& spot = _source.markup[element];
    const Entry parent = parentOf(element);
    if (!spot.isPlaced() || parent == none)
        return fail(object);
    std::optional<std::string> line;
    if (const auto start = _source.layout.lineStart(spot.begin);
        start && !start->empty() && !_source.layout.isInline(parent))
        line = std::string(*start);
    add(spot.begin, spot.end,
        _source.writer.element(*_source.after.element(object), name, around(parent, line)), object);
}

void UpdatePlan::removeElement(Entry element, Shown shown) {
    const SourceMarkup::Spot& spot = _source.markup[element];
    const Entry parent = parentOf(element);
    if (!spot.isPlaced() || parent == none)
        return fail(shown);
    const auto [begin, end] = regionOf(element, false);
    add(begin, end, {}, shown);
}

std::pair<SourceMarkup::Offset, SourceMarkup::Offset>
UpdatePlan::regionOf(Entry element, bool withComments) const {
    const SourceMarkup::Spot& spot = _source.markup[element];
    if (_source.layout.isInline(parentOf(element)))
        return {spot.begin, spot.end};
    return _source.layout.region(element, withComments ? _source.layout.withComments(spot.begin)
                                                       : spot.begin);
}

UpdatePlan::Place UpdatePlan::placeBehind(Entry child) const {
    const SourceMarkup::Spot& spot = _source.markup[child];
    if (_source.layout.isInline(parentOf(child)))
        return {spot.end, std::nullopt, none};
    const auto line = _source.layout.lineStart(spot.begin);
    const auto end = _source.layout.behind(child);
    const bool hasLine = line && !line->empty() && _source.layout.endsLine(end);
    return {hasLine ? end : spot.end, hasLine ? std::optional(std::string(*line)) : std::nullopt,
            none};
}

UpdatePlan::Place UpdatePlan::placeBefore(Entry child) const {
    const SourceMarkup::Spot& spot = _source.markup[child];
    if (_source.layout.isInline(parentOf(child)))
        return {spot.begin, std::nullopt, none};
    const SourceMarkup::Offset begin = _source.layout.withComments(spot.begin);
    const auto line = _source.layout.lineStart(begin);
    if (!line || line->empty())
        return {spot.begin, std::nullopt, none};
    return {begin - static_cast<SourceMarkup::Offset>(line->size()), std::string(*line), none};
}

// At the end of what the element holds.
UpdatePlan::Place UpdatePlan::placeInside(Entry element) const {
    const SourceMarkup::Spot& spot = _source.markup[element];
    if (!spot.isPlaced())
        return {SourceMarkup::none, std::nullopt, none};
    Entry last = none;
    _source.document.forEachChild(element, [&](Entry child) {
        if (_source.markup[child].isPlaced() && _source.document.kind(child) != XMLNodeKind::text)
            last = child;
    });
    if (last != none && !_source.layout.isInline(element))
        return placeBehind(last);
    const bool isInline = _source.layout.isInline(element);
    const auto line = isInline ? std::nullopt : _source.layout.lineStartInside(element);
    if (spot.isEmptyTag() || (line && spot.insideBegin == spot.insideEnd))
        return {spot.insideBegin, line, element};
    const auto end = isInline ? std::nullopt : _source.layout.lineStart(spot.insideEnd);
    const auto at = spot.insideEnd - static_cast<SourceMarkup::Offset>(end ? end->size() : 0);
    return {std::max(at, spot.insideBegin), end ? line : std::nullopt, none};
}

UpdatePlan::Place UpdatePlan::placeFor(const Context& context, std::size_t ordinal) {
    for (const Context* at = &context; at != nullptr && at->entry == context.entry;
         ordinal = at->ordinal, at = at->parent) {
        Entry before = none, behind = none;
        std::size_t number = 0;
        for (Shown field = at->after + 1; field < _source.after[at->after].next;
             field = _source.after[field].next, ++number) {
            if (number == ordinal || (number > ordinal && behind != none))
                continue;
            const Range range = rangeOf(*at, field);
            if (range.first == none)
                continue;
            if (number < ordinal)
                before = range.last;
            else
                behind = range.first;
        }
        if (before != none)
            return placeBehind(before);
        if (behind != none)
            return placeBefore(behind);
    }
    return placeInside(context.entry);
}

UpdatePlan::Range UpdatePlan::rangeOf(const Context& context, Shown field) const {
    Range range;
    for (const std::uint32_t number : usesOf(context.owner, _source.after[field].field)) {
        const ReadingTrace::Use& taken = use(number);
        Range one{taken.entry, taken.entry};
        if (taken.form == Form::flattened && taken.made != ReadingTrace::none)
            one = rangeOfOwner(taken.made, context.entry);
        const bool isChild = one.first != none && parentOf(one.first) == context.entry &&
                             _source.index[one.first].nodeKind() == XMLNodeKind::element &&
                             _source.markup[one.first].isPlaced() &&
                             _source.markup[one.last].isPlaced();
        if (!isChild)
            continue;
        range.first = std::min(range.first, one.first);
        range.last = range.last == none ? one.last : std::max(range.last, one.last);
    }
    return range;
}

UpdatePlan::Range UpdatePlan::rangeOfOwner(std::uint32_t owner, Entry element) const {
    Range range;
    for (const std::uint32_t number : usesOf(owner)) {
        const Entry entry = use(number).entry;
        if (use(number).field == nullptr || parentOf(entry) != element ||
            _source.index[entry].nodeKind() != XMLNodeKind::element)
            continue;
        range.first = std::min(range.first, entry);
        range.last = range.last == none ? entry : std::max(range.last, entry);
    }
    return range;
}

NewXML::Around UpdatePlan::around(Entry element, const std::optional<std::string>& line) {
    NewXML::Around around{line, nullptr,
                          [this, element](const String& prefix, std::string_view URI) {
                              return isDeclared(element, prefix, URI);
                          },
                          [this](Shown object, const WritingTrace::Kept& kept) {
                              return !isNamedByField(*_source.after.plan(object), kept) ||
                                     mayAddKept(object, kept.text);
                          }};
    if (!_source.names)
        return around;
    _names = std::make_unique<OutputNames>(_source.names);
    std::vector<Entry> elements;
    for (Entry at = element; at != none; at = parentOf(at))
        elements.push_back(at);
    for (auto at = elements.rbegin(); at != elements.rend(); ++at) {
        std::vector<OutputNames::Declaration> declared;
        _source.document.forEachOfKind(
            XMLNodeKind::namespaceDeclaration, *at, [&](Entry declaration) {
                declared.push_back({_source.document.writtenName(declaration),
                                    _source.document.value(declaration).string()});
            });
        _names->enter(declared);
    }
    around.names = _names.get();
    return around;
}

bool UpdatePlan::isDeclared(Entry element, const String& prefix, std::string_view URI) const {
    for (Entry at = element; at != none; at = parentOf(at)) {
        Entry found = none;
        _source.document.forEachOfKind(XMLNodeKind::namespaceDeclaration, at,
                                       [&](Entry declaration) {
                                           if (_source.document.writtenName(declaration) == prefix)
                                               found = declaration;
                                       });
        if (found != none)
            return _source.document.value(found).view() == URI;
    }
    return false;
}

UpdatePlan::Entry UpdatePlan::childNamed(Entry element, const String& name) const {
    Entry found = none;
    _source.document.forEachChild(element, [&](Entry child) {
        if (_source.document.isElement(child) && _source.document.name(child) == name)
            found = child;
    });
    return found;
}

// Several that were all of a line take it along.
void UpdatePlan::joinRemovals() {
    auto& edits = _edits->edits();
    for (std::size_t first = 0; first < edits.size();) {
        const auto isRemoval = [&](std::size_t i) {
            return i < edits.size() && edits[i].text.empty() && edits[i].begin != edits[i].end;
        };
        const auto isBeside = [&](std::size_t i) {
            const std::size_t gap = edits[i].begin - edits[i - 1].end;
            return _source.markup.text().substr(edits[i - 1].end, gap).find_first_not_of(" \t") ==
                   std::string_view::npos;
        };
        std::size_t last = first;
        while (isRemoval(first) && isRemoval(last + 1) && isBeside(last + 1))
            ++last;
        const auto line = _source.layout.lineStart(edits[first].begin);
        if (last != first && line && !line->empty() && _source.layout.endsLine(edits[last].end)) {
            edits[first].begin -= static_cast<EditList::Offset>(line->size());
            for (std::size_t i = first; i < last; ++i)
                edits[i].end = edits[i + 1].begin;
        }
        first = last + 1;
    }
}

// <a/> becomes <a>…</a>.
void UpdatePlan::finishOpenings() {
    for (auto& [element, opening] : _openings) {
        const SourceMarkup::Spot& spot = _source.markup[element];
        const std::string name = _source.document.writtenName(element).str();
        std::string closing;
        if (opening.line) {
            const auto outer = _source.layout.lineStart(spot.begin);
            const bool hasBreak = outer && outer->find_first_of("\r\n") != outer->npos;
            closing = std::string(hasBreak ? "" : _source.layout.newline()) +
                      std::string(outer ? *outer : "");
        }
        if (!spot.isEmptyTag()) {
            add(spot.insideBegin, spot.insideEnd, opening.content + closing, opening.shown);
            continue;
        }
        add(blanksBefore(spot.end - 2), spot.end,
            ">" + opening.content + closing + "</" + name + ">", opening.shown);
    }
}

} // namespace qx::detail
