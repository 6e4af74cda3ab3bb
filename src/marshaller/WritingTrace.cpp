#include "marshaller/WritingTrace.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Dictionary.h>

#include <algorithm>

namespace qx::detail {

namespace {

void list(std::vector<WritingTrace::Kept>& all, const Value& kept, XMLNodeKind kind) {
    const auto node = kept.as<XMLNode>();
    if (!node || node->kind() != kind)
        return;
    const String text = kind == XMLNodeKind::element ? node->XMLString(XMLCompactEmptyElements)
                                                     : node->stringValue();
    std::string content = kind == XMLNodeKind::element ? "" : node->name().str() + "=";
    all.push_back({node, content + text.str()});
}

void listAll(std::vector<WritingTrace::Kept>& all, const Value& kept, XMLNodeKind kind) {
    if (const auto nodes = kept.as<Array>())
        for (const Value& node : *nodes)
            list(all, node, kind);
}

std::uint64_t mixed(std::uint64_t hash, std::uint64_t more) noexcept {
    hash ^= more + 0x9E37'79B9'7F4A'7C15U + (hash << 12U) + (hash >> 4U);
    hash *= 0xFF51'AFD7'ED55'8CCDU;
    return hash ^ (hash >> 33U);
}

std::uint64_t hashOfText(std::string_view text) noexcept {
    return std::hash<std::string_view>()(text);
}

} // namespace

const WritingTrace::KeptList* WritingTrace::keptOf(Number object) const {
    const auto found = _kept.find(object);
    return found != _kept.end() ? &found->second : nullptr;
}

std::vector<WritingTrace::Number> WritingTrace::shownValues(Number field) const {
    std::vector<Number> values;
    forEachInside(field, [&](Number value) {
        if (!_shown[value].isHidden)
            values.push_back(value);
    });
    return values;
}

String WritingTrace::keyPath(Number number) const {
    std::string path;
    for (Number at = number; at != none; at = _shown[at].around) {
        const Shown& shown = _shown[at];
        if (shown.kind == Kind::field)
            path = shown.field->key.string().str() +
                   (path.empty() || path.front() == '[' ? "" : ".") + path;
        const Number field = shown.kind == Kind::field ? none : shown.around;
        if (field == none || !_shown[field].isList)
            continue;
        path = "[" + std::to_string(shown.item) + "]" + (path.empty() ? "" : ".") + path;
    }
    return String(path);
}

void WritingTrace::hash() {
    for (auto at = static_cast<Number>(_shown.size()); at-- > 0;)
        _shown[at].hash = hashOf(at);
}

std::uint64_t WritingTrace::hashOf(Number number) const {
    const Shown& shown = _shown[number];
    std::uint64_t hash = static_cast<std::uint64_t>(shown.kind) + (shown.isList ? 16 : 0);
    hash = mixed(hash, reinterpret_cast<std::uintptr_t>(shown.plan));
    if (shown.kind == Kind::text)
        return mixed(hash, hashOfText(text(number)));
    forEachInside(number, [&](Number inside) {
        if (!_shown[inside].isHidden)
            hash = mixed(hash, _shown[inside].hash);
    });
    if (const KeptList* const kept = shown.kind == Kind::object ? keptOf(number) : nullptr)
        hash = mixed(hash, kept->hash());
    return hash;
}

std::uint64_t WritingTrace::KeptList::hash() const noexcept {
    std::uint64_t hash = 0;
    for (const auto* all : {&children, &attributes})
        for (const Kept& each : *all)
            hash = mixed(hash, hashOfText(each.text));
    return hash;
}

WritingTrace::Number WritingTrace::add(Shown shown) {
    shown.around = _open.empty() ? none : _open.back();
    shown.next = size() + 1;
    if (shown.around != none)
        shown.item = _shown[shown.around].items++;
    _shown.push_back(shown);
    return shown.next - 1;
}

void WritingTrace::enterObject(const ClassPlan& plan, XMLDraft::Element* element,
                               const Object& object, ObjectAccess& access) {
    Shown shown{Kind::object};
    shown.plan = &plan;
    shown.element = element;
    shown.object = object.isa().isStruct() ? nullptr : &object;
    const Number number = add(shown);
    _open.push_back(number);
    if (!access.mayKeepXML(object))
        return;
    KeptList kept;
    listAll(kept.declarations, access.getKept(object, KeptXML::namespaces),
            XMLNodeKind::namespaceDeclaration);
    if (_keepsUnknown) {
        listAll(kept.attributes, access.getKept(object, KeptXML::attributes),
                XMLNodeKind::attribute);
        if (const auto children = access.getKept(object, KeptXML::children).as<Dictionary>())
            for (const auto& entry : *children)
                listAll(kept.children, entry.value, XMLNodeKind::element);
    }
    if (!kept.children.empty() || !kept.attributes.empty() || !kept.declarations.empty())
        _kept.emplace(number, std::move(kept));
}

void WritingTrace::leave() {
    _shown[_open.back()].next = size();
    _open.pop_back();
}

void WritingTrace::enterField(const FieldPlan& field) {
    Shown shown{Kind::field};
    shown.field = &field;
    _open.push_back(add(shown));
}

void WritingTrace::hold(const Value& value) {
    if (value.isNull() || value.isObject())
        return;
    addText(value.description(), true);
}

// The value that was held counts only where nothing shows it.
void WritingTrace::leaveField() {
    const Number field = _open.back();
    const Number held = field + 1;
    const bool isHeld = held < size() && _shown[held].kind == Kind::text && _shown[held].isHidden;
    if (isHeld && held + 1 == size() - 1 && _shown[held + 1].kind == Kind::text) {
        _shown[held] = _shown[held + 1];
        _shown[held].next = held + 1;
        _shown[held].item = 0;
        _shown[field].items = 1;
        _shown.pop_back();
    }
    leave();
}

void WritingTrace::addText(std::string_view text, bool isHidden) {
    Shown shown{Kind::text};
    shown.isHidden = isHidden;
    shown.begin = _texts.size();
    shown.size = text.size();
    _texts += text;
    add(shown);
}

// Attributes of the element stay.
void WritingTrace::replaceContent(const XMLDraft::Element* element) {
    auto outermost = _open.rbegin();
    for (auto at = _open.rbegin(); at != _open.rend(); ++at) {
        const Shown& shown = _shown[*at];
        if (shown.kind == Kind::object && shown.element != element)
            break;
        outermost = shown.kind == Kind::object ? at : outermost;
    }
    const auto isAttribute = [&](Number value) {
        const FieldPlan* const field = _shown[_shown[value].around].field;
        const bool mayBe =
            field->kind == BindingKind::attribute || field->kind == BindingKind::automatic;
        return mayBe && _shown[value].kind == Kind::text && field->location().isEmpty() &&
               !_shown[_shown[value].around].isList;
    };
    auto open = outermost.base(); // the entries that are open come in the same order
    for (Number at = *outermost + 1; at < size(); ++at) {
        Shown& shown = _shown[at];
        const bool isOpen = open != _open.end() && *open == at;
        open += isOpen ? 1 : 0;
        const bool isFlattened = shown.kind == Kind::object && shown.element == element;
        if (shown.kind != Kind::field && !isOpen && !isFlattened && !isAttribute(at))
            shown.isHidden = true;
        if (shown.kind == Kind::object && !isOpen && !isFlattened)
            at = shown.next - 1;
    }
}

void WritingTrace::forget(Number count) {
    if (count < size())
        --_shown[_open.back()].items;
    _shown.resize(count);
    std::erase_if(_kept, [&](const auto& entry) { return entry.first >= count; });
}

} // namespace qx::detail
