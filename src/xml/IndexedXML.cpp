#include "xml/IndexedXML.h"

#include "base/KnownName.h"
#include "xml/MatchedNames.h"
#include "xml/XMLNodeMaker.h"

#include <algorithm>

namespace qx {

// The nodes that were made of a reading's entries for their own sake.
class NodePool final : public XMLNodeTable {
public:
    NodePool(const XMLIndex& index, const XMLTreeIndexer* tree)
        : _index(index), _maker(index, this, tree) {}

    Ref<XMLNode> find(XMLIndex::Number number) const override {
        const auto found = _nodes.find(number);
        return found != _nodes.end() ? found->second : nullptr;
    }
    void add(XMLIndex::Number number, XMLElement& element) override {
        _nodes.try_emplace(number, &element);
    }

    Ref<XMLNode> element(XMLIndex::Number number) {
        auto known = find(number);
        return known ? known : Ref<XMLNode>(_maker.element(number));
    }
    Ref<XMLNode> attribute(XMLIndex::Number holder, XMLIndex::Number number);

private:
    const XMLIndex& _index;
    XMLNodeMaker _maker;
    std::unordered_map<XMLIndex::Number, Ref<XMLNode>> _nodes;
};

Ref<XMLNode> NodePool::attribute(XMLIndex::Number holder, XMLIndex::Number number) {
    if (auto known = find(number))
        return known;
    const XMLIndexEntry& entry = _index[number];
    const auto element = find(holder);
    auto node = element ? XMLNodeMaker::attributeOf(*element->asElement(), entry.nodeKind(),
                                                    _index.name(entry))
                        : nullptr;
    if (!node)
        node = _maker.node(number);
    _nodes.try_emplace(number, node);
    return node;
}

IndexedXML::IndexedXML(const ParsedDocument& parsed, String documentName)
    : _parsed(&parsed), _index(&parsed.index()), _documentName(std::move(documentName)) {
    findRoot();
}

IndexedXML::IndexedXML(XMLDocument& document) : _documentName(document.documentName()) {
    _reader.emplace(document);
    if (_reader->parsed() != nullptr) {
        _parsed = _reader->parsed();
        _index = &_reader->parsed()->index();
        findRoot();
        internNames();
        return;
    }
    _reader.reset();
    readTree(document.rootElement(), Content::atOnce);
}

IndexedXML::IndexedXML(XMLElement* element, Content content) { readTree(element, content); }

void IndexedXML::readTree(XMLElement* element, Content content) {
    if (element == nullptr)
        return;
    _tree = std::make_shared<XMLTreeIndexer>(*element);
    _index = &_tree->index();
    _root = 0;
    if (content == Content::atOnce)
        _tree->expandAll(_root);
}

IndexedXML::~IndexedXML() = default;

void IndexedXML::findRoot() noexcept {
    const auto count = static_cast<Number>(_index->entries().size());
    for (Number at = 0; at < count && _root == none; at = _index->siblingOf(at))
        if ((*_index)[at].nodeKind() == XMLNodeKind::element)
            _root = at;
}

// A mapping may have come since the document was parsed.
void IndexedXML::internNames() {
    const auto names = _index->names();
    for (std::size_t i = 0; i < names.size(); ++i) {
        const Key known = names[i].isInterned() ? Key() : Key::existing(names[i].view());
        if (known.isNull())
            continue;
        if (_interned.empty())
            _interned.assign(names.begin(), names.end());
        _interned[i] = known.string();
    }
}

namespace {

// What is declared on the elements around this one, outermost first.
std::vector<MatchedNames::Declaration> declarationsAround(const XMLElement& element) {
    std::vector<MatchedNames::Declaration> declarations;
    const XMLNode* parent = element.parent();
    for (; parent != nullptr && parent->isElement(); parent = parent->parent())
        for (const XMLNode& declaration : parent->asElement()->namespaces())
            declarations.emplace_back(declaration.name(), declaration.stringValue());
    std::ranges::reverse(declarations);
    return declarations;
}

} // namespace

void IndexedXML::matchBy(const NamespaceTable& table) {
    if (_root == none || _isAsWritten || !_matched.empty())
        return;
    expandAll(_root);
    if (_interned.empty())
        _interned.assign(index().names().begin(), index().names().end());
    const auto around = _tree ? declarationsAround(_tree->element(_root))
                              : std::vector<MatchedNames::Declaration>();
    _matched = MatchedNames(index(), _root, around, table, _interned).takeNumbers();
}

Value IndexedXML::sharedValue(Number number) {
    String& value = _longTexts[number];
    if (value.isNull())
        value = index().value(index()[number], _room);
    return value;
}

bool IndexedXML::hasPlainText(Number element) {
    expand(element);
    const Number first = index().firstChild(element);
    const Number end = index().contentEnd(element);
    return first == end || (index().siblingOf(first) == end && !isElement(first));
}

Value IndexedXML::text(Number element) {
    if (const Number only = onlyText(element); only != none)
        return value(only);
    if (index().firstChild(element) == index().contentEnd(element))
        return "";
    if (const auto known = _longTexts.find(element); known != _longTexts.end())
        return known->second;
    _joined.clear();
    appendText(element, _joined);
    if (_joined.size() <= longestUnshared)
        return detail::LentText::of(_joined);
    return _longTexts.try_emplace(element, _joined).first->second;
}

// Calls visit(const XMLIndexEntry&) for all that is inside the element and no layout, in the
// order of the document, until it answers false.
template <class Visit>
void IndexedXML::forEachInside(Number element, Visit visit) {
    struct Open {
        Number element;
        Number at;
        Number end;
    };
    const auto opened = [this](Number number) {
        expand(number);
        return Open{number, index().content(number), index().contentEnd(number)};
    };
    std::vector<Open> open{opened(element)};
    while (!open.empty()) {
        Open& inner = open.back();
        if (inner.at == inner.end) {
            open.pop_back();
            continue;
        }
        const Number at = std::exchange(inner.at, index().siblingOf(inner.at));
        if (XMLIndex::isLayout(index()[at], index()[inner.element]))
            continue;
        if (!visit(index()[at]))
            return;
        if (isElement(at))
            open.push_back(opened(at));
    }
}

void IndexedXML::appendText(Number element, std::string& text) {
    forEachInside(element, [&](const XMLIndexEntry& entry) {
        if (entry.nodeKind() == XMLNodeKind::text)
            text += index().value(entry, _room);
        return true;
    });
}

IndexedXML::Number IndexedXML::attributeOfMany(Number element, const Attributes& all,
                                               const String& name) {
    const auto [known, isNew] = _attributes.try_emplace(element);
    for (Number at = all.begin; isNew && at < all.end; ++at)
        if (kind(at) == XMLNodeKind::attribute)
            known->second.try_emplace(this->name(at).view().data(), at);
    const auto found = known->second.find(name.view().data());
    return found != known->second.end() ? found->second : none;
}

IndexedXML::Extent IndexedXML::extent(Number element, std::size_t enough) {
    Extent extent{.elements = 1, .nodes = 1};
    forEachInside(element, [&](const XMLIndexEntry& entry) {
        ++extent.nodes;
        if (entry.nodeKind() == XMLNodeKind::element)
            ++extent.elements;
        else
            extent.textSize += entry.end - entry.begin;
        return extent.nodes < enough;
    });
    return extent;
}

NodePool& IndexedXML::pool(Nodes nodes) {
    auto& pool = nodes == Nodes::own ? _own : _copies;
    if (!pool)
        pool = std::make_unique<NodePool>(index(), _tree.get());
    return *pool;
}

bool IndexedXML::isMade(Nodes nodes, Number number) const {
    const auto& pool = nodes == Nodes::own ? _own : _copies;
    return pool && pool->find(number);
}

Ref<XMLNode> IndexedXML::element(Nodes nodes, Number number) {
    if (nodes == Nodes::own && _reader)
        return _reader->element(number);
    if (nodes == Nodes::own && _tree)
        return Ref<XMLNode>(&_tree->element(number));
    expandAll(number);
    return pool(nodes).element(number);
}

Ref<XMLNode> IndexedXML::attribute(Nodes nodes, Number holder, Number number) {
    if (nodes == Nodes::copied || (!_reader && !_tree))
        return pool(nodes).attribute(holder, number);
    const XMLIndexEntry& entry = index()[number];
    const auto element = this->element(Nodes::own, holder);
    auto node =
        XMLNodeMaker::attributeOf(*element->asElement(), entry.nodeKind(), index().name(entry));
    return node ? node : XMLNodeMaker(index()).node(number);
}

Ref<XMLNode> IndexedXML::quoted(Number number) {
    if (number == none)
        return nullptr;
    return isElement(number) ? element(Nodes::own, number) : XMLNodeMaker(index()).node(number);
}

const std::shared_ptr<const DocumentPlaces>& IndexedXML::places() {
    if (_places)
        return _places;
    if (const XMLDocument* const document = _tree ? _tree->element(0).rootDocument() : nullptr)
        _documentName = document->documentName();
    if (_tree)
        _places = std::make_shared<DocumentPlaces>(_tree, _documentName);
    else if (_parsed != nullptr)
        _places = std::make_shared<DocumentPlaces>(_parsed->shared_from_this(), _documentName);
    else
        _places = std::make_shared<DocumentPlaces>();
    return _places;
}

void IndexedXML::detach(Number element) {
    if (_reader || _tree)
        this->element(Nodes::own, element)->detach();
}

} // namespace qx
