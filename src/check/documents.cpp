// What no field takes of a document.

#include "check/DocumentRules.h"

#include <QXXMLMarshalling/model/Format.h>

#include "base/WhiteSpace.h"
#include "check/ClassFields.h"
#include "marshaller/TakenNames.h"
#include "model/Localizer.h"
#include "xml/DocumentPlaces.h"

#include <algorithm>

namespace qx::detail {

namespace {

using Number = XMLIndex::Number;
using Fate = TakenEntries::Fate;

class UntakenCheck {
public:
    UntakenCheck(const TakenEntries& taken, const DocumentPlaces& places, Tally& tally)
        : _taken(taken), _index(taken.index()), _places(places), _tally(tally) {}

    void run(Number root) {
        _open.push_back(root);
        while (!_open.empty()) {
            const Number element = _open.back();
            _open.pop_back();
            checkContent(element);
        }
    }

private:
    void checkContent(Number element);
    void checkEntry(Number entry, Number element, Fate fate);
    void checkText(Number text, Number element);
    void add(const FindingText& text, Number entry, Number element);
    String suggestionOf(Number entry, Number element) const;

    const String& nameOf(Number number) const { return _index.name(_index[number]); }

    const TakenEntries& _taken;
    const XMLIndex& _index;
    const DocumentPlaces& _places;
    Tally& _tally;
    std::vector<Number> _open; // elements of which something was taken
    // Looking for one goes over all names of a class.
    std::size_t _suggestionsLeft = 200;
};

void UntakenCheck::checkContent(Number element) {
    const Fate fate = _taken.fateOf(element);
    const std::size_t opened = _open.size();
    Number at = _index.content(element);
    for (const Number first = _index.firstChild(element); at < first; ++at)
        if (_index[at].nodeKind() == XMLNodeKind::attribute)
            checkEntry(at, element, fate);
    for (const Number end = _index.contentEnd(element); at < end; at = _index.siblingOf(at)) {
        const XMLNodeKind kind = _index[at].nodeKind();
        if (kind == XMLNodeKind::element)
            checkEntry(at, element, fate);
        else if (kind == XMLNodeKind::text && fate != Fate::value)
            checkText(at, element);
    }
    std::reverse(_open.begin() + static_cast<std::ptrdiff_t>(opened), _open.end());
}

void UntakenCheck::checkEntry(Number entry, Number element, Fate fate) {
    const bool isElement = _index[entry].nodeKind() == XMLNodeKind::element;
    if (_taken.fateOf(entry) != Fate::none) {
        if (isElement)
            _open.push_back(entry);
        return;
    }
    if (fate == Fate::object)
        return add(isElement ? findings::unboundElement : findings::unboundAttribute, entry,
                   element);
    if (fate == Fate::wrapper)
        return add(isElement ? findings::elementInWrapper : findings::attributeOfWrapper, entry,
                   element);
    add(isElement ? findings::elementInText : findings::attributeOfText, entry, element);
}

void UntakenCheck::checkText(Number text, Number element) {
    if (_index[text].has(XMLIndexEntry::isBlank) || _taken.hasText(element))
        return;
    std::string room;
    if (isWhite(_index.value(_index[text], room)))
        return;
    _tally.add(findings::unboundText, {nameOf(element)}, {},
               [&] { return _places.placeOf(text).place; });
}

void UntakenCheck::add(const FindingText& text, Number entry, Number element) {
    _tally.add(
        text, {nameOf(entry), nameOf(element)}, _taken.concernedBy(element),
        [&] { return _places.placeOf(entry).place; },
        [&]() -> String {
            if (_suggestionsLeft == 0)
                return nullptr;
            --_suggestionsLeft;
            return suggestionOf(entry, element);
        });
}

// By the names of the class that was made of the element, or of those that it is the wrapper for.
String UntakenCheck::suggestionOf(Number entry, Number element) const {
    const bool isAttribute = _index[entry].nodeKind() == XMLNodeKind::attribute;
    UntakenNode node{nameOf(entry), isAttribute, {}};
    if (!isAttribute)
        node.children = _places.childrenOf(entry);
    if (const TakenEntries::Owner* const owner = _taken.ownerOf(element))
        return suggestionFor(node, TakenNames::of(*owner->plan));
    for (const TakenEntries::Use* use : _taken.usesOf(element))
        if (use->form == ReadingTrace::Form::wrapper) {
            const TakenNames names = TakenNames::of(*use->field).in(nameOf(element));
            const String near = suggestionFor(node, names);
            return !near.isNull() || isAttribute || names.children.empty()
                       ? near
                       : "the mapping looks for " + quoted(names.children.front()) + " there";
        }
    return nullptr;
}

} // namespace

void checkUntaken(const TakenEntries& taken, const DocumentPlaces& places, Number root,
                  Tally& tally) {
    UntakenCheck(taken, places, tally).run(root);
}

void FoundFields::add(const ReadingTrace& trace) {
    std::unordered_map<const ClassPlan*, std::size_t> objects;
    for (const ReadingTrace::Owner& owner : trace.owners())
        ++objects[owner.plan];
    for (const auto& [plan, count] : objects)
        for (const ClassField& field : fieldsAsRead(*plan))
            _asked[field.field] += count;
    for (const ReadingTrace::Use& use : trace.uses())
        if (use.field != nullptr)
            _found.insert(use.field);
}

void FoundFields::addFindings(const MappingPlan& plan, const QXXMLDocumentMapping& mapping,
                              std::vector<QXXMLFinding>& all) const {
    const auto add = [&](const FindingText& text, const QXXMLMapping& node, const String& className,
                         const String& fieldName, std::vector<Value> arguments) {
        QXXMLFinding finding;
        finding.severity = text.severity;
        finding.kind = text.kind;
        finding.text = qx::format(localizedText(text.message), arguments);
        finding.place = node.place();
        finding.includedFrom = node.includedFrom();
        finding.className = className;
        finding.fieldName = fieldName;
        all.push_back(std::move(finding));
    };
    for (const auto& type : mapping.classMappings()) {
        const ClassPlan* const known = plan.planOf(*type);
        for (std::size_t i = 0; known != nullptr && i < known->fields.size(); ++i) {
            const FieldPlan& field = known->fields[i];
            const auto asked = _asked.find(&field);
            if (asked != _asked.end() && !_found.contains(&field))
                add(findings::fieldNeverFound, *field.mapping, type->className(),
                    field.key.string(), {std::to_string(asked->second)});
        }
    }
}

} // namespace qx::detail
