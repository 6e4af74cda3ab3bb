// What no field takes of a document.

#include "check/DocumentRules.h"

#include <QXXMLMarshalling/model/Format.h>

#include "base/NearestName.h"
#include "base/WhiteSpace.h"
#include "check/ClassFields.h"
#include "model/Localizer.h"
#include "xml/DocumentPlaces.h"

#include <algorithm>

namespace qx::detail {

namespace {

// Flattened objects take of the same element; of those that nest without end a few levels count.
void addNames(const ClassPlan& type, XMLNodeKind kind, std::size_t levels,
              std::vector<std::string_view>& names) {
    for (const auto& [owner, field] : fieldsAsRead(type)) {
        if (field->kind == BindingKind::flattened && !field->isCollection()) {
            if (field->typeClass != nullptr && levels != 0)
                addNames(*field->typeClass, kind, levels - 1, names);
            continue;
        }
        const bool isAttribute = !field->isCollection() && (field->kind == BindingKind::attribute ||
                                                            field->kind == BindingKind::automatic);
        const bool isChild = field->isCollection() || field->kind != BindingKind::attribute;
        for (const BindingPlan& binding : field->bindings) {
            if (kind == XMLNodeKind::attribute ? isAttribute && binding.location.isEmpty()
                                               : isChild)
                names.push_back(binding.name);
            if (kind == XMLNodeKind::element && !binding.location.isEmpty())
                names.push_back(binding.location);
        }
    }
}

} // namespace

std::vector<std::string_view> namesTakenBy(const ClassPlan& type, XMLNodeKind kind) {
    constexpr std::size_t mostLevels = 4;
    std::vector<std::string_view> names;
    addNames(type, kind, mostLevels, names);
    return names;
}

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
    _tally.add(findings::unboundText, {nameOf(element)}, nullptr,
               [&] { return _places.placeOf(element).place; });
}

void UntakenCheck::add(const FindingText& text, Number entry, Number element) {
    const TakenEntries::Owner* const owner = _taken.ownerOf(element);
    _tally.add(
        text, {nameOf(entry), nameOf(element)},
        owner != nullptr ? owner->plan->className.string() : String(),
        [&] { return _places.placeOf(entry).place; },
        [&]() -> String {
            if (owner == nullptr || _suggestionsLeft == 0)
                return nullptr;
            --_suggestionsLeft;
            const auto names = namesTakenBy(*owner->plan, _index[entry].nodeKind());
            const std::string_view near = nearestName(nameOf(entry), names);
            return near.empty() ? String() : String(near);
        });
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
