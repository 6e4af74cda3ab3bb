// Why a node of a document is bound, or is not.

#include <QXXMLMarshalling/model/Format.h>

#include "check/DocumentRules.h"
#include "marshaller/TakenNames.h"
#include "model/Localizer.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <optional>

namespace qx::detail {

namespace {

using Number = XMLIndex::Number;
using Fate = TakenEntries::Fate;
using Form = ReadingTrace::Form;

// One step of a path: /item[2], /@price.
struct Step {
    std::string_view name;
    std::size_t position = 1;
    bool isAttribute = false;
};

// The next step, which is taken off the path; nothing where that is none.
std::optional<Step> takeStep(std::string_view& path) {
    if (!path.starts_with('/'))
        return std::nullopt;
    path.remove_prefix(1);
    Step step;
    std::string_view text = path.substr(0, path.find('/'));
    path.remove_prefix(text.size());
    step.isAttribute = text.starts_with('@');
    if (step.isAttribute)
        text.remove_prefix(1);
    step.name = text.substr(0, text.find('['));
    const std::string_view position = text.substr(step.name.size());
    if (!position.empty()) {
        const char* const end = position.data() + position.size() - 1;
        const auto read = std::from_chars(position.data() + 1, end, step.position);
        if (read.ec != std::errc() || read.ptr != end || *end != ']' || step.position == 0)
            return std::nullopt;
    }
    return step.name.empty() ? std::nullopt : std::optional(step);
}

class Reasons {
public:
    Reasons(const TakenEntries& taken, const DocumentPlaces& places, bool keepsUnknown)
        : _taken(taken), _index(taken.index()), _places(places), _keepsUnknown(keepsUnknown) {}

    // The elements from the root to the node, and the node; empty where there is none.
    std::vector<Number> find(std::string_view path, Number root) const;
    String tell(const std::vector<Number>& way) const;

private:
    std::optional<Number> child(Number element, const Step& step) const;
    void tellTaken(Number entry, std::string& text) const;
    void tellUntaken(const std::vector<Number>& way, std::string& text) const;
    std::string userOf(Number element) const;

    const String& nameOf(Number number) const { return _index.name(_index[number]); }
    template <class... Arguments>
    static std::string line(const FindingText& text, const Arguments&... arguments) {
        const std::array<Value, sizeof...(Arguments)> values{Value(arguments)...};
        return "\n    " + qx::format(localizedText(text.message), values).str();
    }

    const TakenEntries& _taken;
    const XMLIndex& _index;
    const DocumentPlaces& _places;
    const bool _keepsUnknown;
};

std::optional<Number> Reasons::child(Number element, const Step& step) const {
    const Number first = _index.firstChild(element);
    const Number end = step.isAttribute ? first : _index.contentEnd(element);
    const auto kind = step.isAttribute ? XMLNodeKind::attribute : XMLNodeKind::element;
    std::size_t left = step.position;
    for (Number at = step.isAttribute ? _index.content(element) : first; at < end;
         at = step.isAttribute ? at + 1 : _index.siblingOf(at))
        if (_index[at].nodeKind() == kind && nameOf(at) == step.name && --left == 0)
            return at;
    return std::nullopt;
}

std::vector<Number> Reasons::find(std::string_view path, Number root) const {
    std::vector<Number> way;
    while (!path.empty()) {
        const auto step = takeStep(path);
        if (!step || (!way.empty() && _index[way.back()].nodeKind() != XMLNodeKind::element))
            return {};
        if (way.empty()) {
            if (step->isAttribute || step->position != 1 || nameOf(root) != step->name)
                return {};
            way.push_back(root);
            continue;
        }
        const auto found = child(way.back(), *step);
        if (!found)
            return {};
        way.push_back(*found);
    }
    return way;
}

std::string placeIn(const QXXMLMapping& node) {
    const QXXMLMappingPlace place = node.place();
    return place.documentName.str() + ":" + std::to_string(place.line) + ":" +
           std::to_string(place.column);
}

void Reasons::tellTaken(Number entry, std::string& text) const {
    if (const TakenEntries::Owner* const owner = _taken.ownerOf(entry))
        text += line(findings::becameObject, owner->plan->className.string(),
                     placeIn(*owner->plan->mapping));
    for (const TakenEntries::Use* use : _taken.usesOf(entry)) {
        if (use->field == nullptr)
            continue;
        const FindingText& how = use->form == Form::wrapper     ? findings::takenAsWrapper
                                 : use->form == Form::item      ? findings::takenAsItem
                                 : use->form == Form::flattened ? findings::takenAsFlattened
                                 : use->form == Form::text      ? findings::takenAsText
                                                                : findings::takenByField;
        const auto type = use->field->mapping->classMapping();
        std::string keyPath = _taken.trace().keyPath(use->owner, use->field).str();
        if (use->form == Form::item)
            keyPath += "[" + std::to_string(use->item) + "]";
        text += line(how, use->field->key.string(), type ? type->className() : String(),
                     placeIn(*use->field->mapping), keyPath);
    }
}

// The field that took the element, as Class.field.
std::string Reasons::userOf(Number element) const {
    for (const TakenEntries::Use* use : _taken.usesOf(element))
        if (use->field != nullptr) {
            const auto type = use->field->mapping->classMapping();
            return (type ? type->className().str() + "." : "") + use->field->key.string().str();
        }
    return {};
}

void Reasons::tellUntaken(const std::vector<Number>& way, std::string& text) const {
    const Number entry = way.back();
    if (way.size() == 1) {
        text += line(findings::noClassForRoot, nameOf(entry));
        return;
    }
    const Number element = way[way.size() - 2];
    const bool isElement = _index[entry].nodeKind() == XMLNodeKind::element;
    switch (_taken.fateOf(element)) {
    case Fate::object: {
        const ClassPlan& type = *_taken.ownerOf(element)->plan;
        const TakenNames taken = TakenNames::of(type);
        const auto& names = isElement ? taken.children : taken.attributes;
        const bool isKnown = std::find(names.begin(), names.end(), nameOf(entry)) != names.end();
        text += line(isKnown     ? findings::nameTakenElsewhere
                     : isElement ? findings::noFieldForElement
                                 : findings::noFieldForAttribute,
                     type.className.string(), nameOf(entry));
        std::vector<String> children;
        if (isElement)
            children = _places.childrenOf(entry);
        if (const String near = suggestionFor({nameOf(entry), !isElement, children}, taken);
            !isKnown && !near.isNull())
            text += "\n    " + near.str();
        text += line(_keepsUnknown ? findings::keptAsUnknown : findings::dropped);
        return;
    }
    case Fate::value:
        text += line(findings::onlyTextTaken, nameOf(element), userOf(element));
        return;
    case Fate::wrapper:
        text += line(findings::onlyItemsTaken, nameOf(element), userOf(element));
        return;
    case Fate::none:
        text += line(findings::insideOfUntaken, _places.placeOf(element).path);
        tellUntaken({way.begin(), way.end() - 1}, text);
    }
}

String Reasons::tell(const std::vector<Number>& way) const {
    const SourcePlace source = _places.placeOf(way.back());
    std::string text = source.path.str() + " " + source.place.documentName.str() + ":" +
                       std::to_string(source.place.line) + ":" +
                       std::to_string(source.place.column);
    if (_taken.fateOf(way.back()) != Fate::none)
        tellTaken(way.back(), text);
    else
        tellUntaken(way, text);
    return text;
}

} // namespace

String reasonFor(std::string_view path, const TakenEntries& taken, const DocumentPlaces& places,
                 XMLIndex::Number root, bool keepsUnknown) {
    const Reasons reasons(taken, places, keepsUnknown);
    const std::vector<Number> way = reasons.find(path, root);
    return way.empty() ? String() : reasons.tell(way);
}

} // namespace qx::detail
