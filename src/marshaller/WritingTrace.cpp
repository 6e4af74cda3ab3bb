#include "marshaller/WritingTrace.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Dictionary.h>

#include "base/ShortCopy.h"

#include <cstring>

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

// Hashes of 64 bits, which stand for what they are made of: a product of 128 bits, folded, mixes
// all of both.
__extension__ using Product = unsigned __int128;
constexpr std::uint64_t oneMix = 0x9E37'79B9'7F4A'7C15U, otherMix = 0xFF51'AFD7'ED55'8CCDU;

std::uint64_t mixed(std::uint64_t hash, std::uint64_t more) noexcept {
    const Product product = Product(hash ^ oneMix) * (more ^ otherMix);
    return static_cast<std::uint64_t>(product) ^ static_cast<std::uint64_t>(product >> 64U);
}

template <class Word>
std::uint64_t wordAt(const char* place) noexcept {
    Word word;
    std::memcpy(&word, place, sizeof word);
    return word;
}

// Another one in each process, so that nobody can make texts whose hashes meet.
std::uint64_t newSeed() noexcept {
    return std::uint64_t{String::hashOf("one")} << 32U | String::hashOf("other");
}

// Two words of eight bytes at a time; the last two may overlap what came before.
std::uint64_t hashOfText(std::string_view text) noexcept {
    static const std::uint64_t seed = newSeed();
    using Long = std::uint64_t;
    using Short = std::uint32_t;
    const char* at = text.data();
    const char* const end = at + text.size();
    std::uint64_t hash = seed ^ text.size();
    for (; end - at > 16; at += 16)
        hash = mixed(wordAt<Long>(at) ^ hash, wordAt<Long>(at + 8));
    const auto left = static_cast<std::size_t>(end - at);
    if (left >= 8)
        return mixed(wordAt<Long>(at) ^ hash, wordAt<Long>(end - 8));
    if (left >= 4)
        return mixed(wordAt<Short>(at) ^ hash, wordAt<Short>(end - 4));
    std::uint64_t few = 0;
    for (; at != end; ++at)
        few = few << 8U | static_cast<unsigned char>(*at);
    return mixed(few ^ hash, 0);
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
    std::vector<Number> around;
    for (Number at = number; at != none; at = _shown[at].around)
        around.push_back(at);
    std::string path;
    for (auto at = around.rbegin(); at != around.rend(); ++at) {
        const Shown& shown = _shown[*at];
        if (shown.kind == Kind::field)
            (path += path.empty() ? "" : ".") += shown.field->key.string().view();
        else if (shown.around != none && _shown[shown.around].isList)
            ((path += '[') += std::to_string(shown.count)) += ']';
    }
    return String(path);
}

inline std::uint64_t WritingTrace::hashOf(const Shown& shown) const noexcept {
    if (shown.kind == Kind::object)
        return mixed(reinterpret_cast<std::uintptr_t>(_objects[shown.place].plan), shown.hash);
    // An empty list shows no more than none.
    return shown.isList && shown.count != 0 ? ~shown.hash : shown.hash;
}

inline void WritingTrace::mixInto(Number around, const Shown& shown) {
    if (around == none)
        _hash = shown.hash;
    else if (!shown.isHidden)
        _shown[around].hash = mixed(_shown[around].hash, shown.hash);
}

// What stands inside an entry comes behind it.
void WritingTrace::hashAnew() {
    for (Number at = size(); at-- > 0;) {
        Shown& shown = _shown[at];
        if (shown.kind == Kind::text)
            continue;
        const KeptList* const kept = shown.kind == Kind::object ? keptOf(at) : nullptr;
        shown.hash = kept != nullptr ? kept->hash() : 0;
        forEachInside(at, [&](Number inside) { mixInto(at, _shown[inside]); });
        shown.hash = hashOf(shown);
    }
    _hash = size() != 0 ? _shown[0].hash : 0;
    _isHashed = true;
}

std::uint64_t WritingTrace::KeptList::hash() const noexcept {
    std::uint64_t hash = 0;
    for (const auto* all : {&children, &attributes})
        for (const Kept& each : *all)
            hash = mixed(hash, hashOfText(each.text));
    return hash;
}

inline WritingTrace::Shown& WritingTrace::add(Kind kind) {
    Number around = none;
    std::uint32_t count = 0;
    if (!_open.empty()) {
        around = _open.back();
        if (Shown& outer = _shown[around]; outer.kind == Kind::field)
            count = outer.count++;
    }
    _shown.push_back({.kind = kind,
                      .next = size() + 1,
                      .around = around,
                      .count = count,
                      .field = nullptr,
                      .hash = 0});
    return _shown.back();
}

namespace {

bool isAttribute(const WritingTrace::Shown& field) {
    // A field that leaves its kind open has no wrapper.
    const bool mayBe =
        field.field->kind == BindingKind::automatic ||
        (field.field->kind == BindingKind::attribute && field.field->location().isEmpty());
    return mayBe && !field.isList;
}

} // namespace

// Mostly known of the object that is open.
inline void WritingTrace::noteContent() {
    const Shown& open = _shown[_open.back()];
    if (open.kind != Kind::field || !_shown[open.around].hasContent)
        noteContentAround();
}

// Objects that stand in one element are open one in the other.
void WritingTrace::noteContentAround() {
    const XMLDraft::Element* element = nullptr;
    for (auto at = _open.rbegin(); at != _open.rend(); ++at) {
        Shown& shown = _shown[*at];
        if (shown.kind != Kind::object)
            continue;
        const XMLDraft::Element* const own = _objects[shown.place].element;
        if (shown.hasContent || (element != nullptr && own != element))
            return;
        element = own;
        shown.hasContent = true;
    }
}

void WritingTrace::enterObject(const ClassPlan& plan, XMLDraft::Element* element,
                               const Object& object, ObjectAccess& access) {
    const bool isFlattened =
        !_open.empty() && placed(_shown[_open.back()].around).element == element;
    if (!_open.empty() && !isFlattened)
        noteContent();
    add(Kind::object).place = static_cast<std::uint32_t>(_objects.size());
    _objects.push_back({&plan, element, object.isa().isStruct() ? nullptr : &object});
    const Number number = size() - 1;
    _open.push_back(number);
    if (!access.mayKeepXML(object))
        return;
    KeptList kept;
    if (_declares && !isFlattened) // else they are those of the object around it
        listAll(kept.declarations, access.getKept(object, KeptXML::namespaces),
                XMLNodeKind::namespaceDeclaration);
    for (const Kept& each : kept.declarations)
        _declarationsHash = mixed(_declarationsHash, hashOfText(each.text));
    if (_keepsUnknown) {
        listAll(kept.attributes, access.getKept(object, KeptXML::attributes),
                XMLNodeKind::attribute);
        if (const auto children = access.getKept(object, KeptXML::children).as<Dictionary>())
            for (const auto& entry : *children)
                listAll(kept.children, entry.value, XMLNodeKind::element);
    }
    _shown[number].hash = kept.hash();
    const bool isEmpty =
        kept.children.empty() && kept.attributes.empty() && kept.declarations.empty();
    if (!isEmpty && _extent == Extent::all)
        _kept.emplace(number, std::move(kept));
}

void WritingTrace::leave() {
    Shown& shown = _shown[_open.back()];
    shown.next = size();
    shown.hash = hashOf(shown);
    _open.pop_back();
    mixInto(shown.around, shown);
    if (_extent == Extent::all)
        return;
    if (shown.kind == Kind::object)
        _objects.resize(shown.place);
    _shown.resize(size() - 1);
}

void WritingTrace::enterField(const FieldPlan& field) {
    add(Kind::field).field = &field;
    _open.push_back(size() - 1);
}

void WritingTrace::hold(const Value& value) {
    if (_shown[_open.back()].count == 0 && !value.isNull() && !value.isObject())
        addText(value.description(), true);
}

void WritingTrace::addText(std::string_view text, bool isHidden) {
    const std::uint64_t hash = hashOfText(text);
    const Number open = _open.back();
    if (isHidden) {
        _hidesSome = true;
        const auto field = reinterpret_cast<std::uintptr_t>(_shown[open].field);
        _hiddenHash = mixed(mixed(_hiddenHash, field), hash);
    } else {
        _shown[open].hash = mixed(_shown[open].hash, hash);
        if (!isAttribute(_shown[open]))
            noteContent();
    }
    if (_extent == Extent::hash) {
        ++_shown[open].count;
        return;
    }
    if (text.size() > UINT32_MAX - _texts.size()) {
        _isTooLarge = true;
        text = {};
    }
    Shown& shown = add(Kind::text);
    shown.isHidden = isHidden;
    shown.hash = hash;
    shown.span = {static_cast<std::uint32_t>(_texts.size()),
                  static_cast<std::uint32_t>(text.size())};
    copyShort(text.data(), text.size(), _texts.extend(text.size()));
}

// Attributes of the element stay.
void WritingTrace::replaceContent(const XMLDraft::Element* element) {
    auto outermost = _open.rbegin();
    for (auto at = _open.rbegin(); at != _open.rend(); ++at) {
        const Shown& shown = _shown[*at];
        if (shown.kind == Kind::object && _objects[shown.place].element != element)
            break;
        outermost = shown.kind == Kind::object ? at : outermost;
    }
    if (!_shown[*outermost].hasContent)
        return;
    _isHashed = false;
    if (_extent == Extent::hash)
        return;
    const auto isAttributeValue = [&](Number value) {
        return _shown[value].kind == Kind::text && isAttribute(_shown[_shown[value].around]);
    };
    auto open = outermost.base(); // the entries that are open come in the same order
    for (Number at = *outermost + 1; at < size(); ++at) {
        Shown& shown = _shown[at];
        const bool isOpen = open != _open.end() && *open == at;
        open += isOpen ? 1 : 0;
        const bool isFlattened =
            shown.kind == Kind::object && _objects[shown.place].element == element;
        if (shown.kind != Kind::field && !isOpen && !isFlattened && !isAttributeValue(at))
            shown.isHidden = _hidesSome = true;
        if (shown.kind == Kind::object && !isOpen && !isFlattened)
            at = shown.next - 1;
    }
}

void WritingTrace::forget(Number count) {
    _isHashed = false;
    if (count >= size())
        return;
    --_shown[_open.back()].count;
    for (Number number = size(); number-- > count;)
        if (_shown[number].kind == Kind::object)
            _objects.resize(_shown[number].place);
    for (Number number = count; !_kept.empty() && number < size(); ++number)
        _kept.erase(number);
    _shown.resize(count);
}

} // namespace qx::detail
