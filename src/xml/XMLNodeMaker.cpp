#include "xml/XMLNodeMaker.h"

#include "base/TextBlocks.h"
#include "xml/XMLSiblings.h"

#include <algorithm>
#include <vector>

namespace qx {

namespace {

std::uint32_t saturated(std::size_t number) {
    return static_cast<std::uint32_t>(std::min<std::size_t>(number, UINT32_MAX));
}

} // namespace

XMLNode* XMLNodeMaker::newNode(const XMLIndexEntry& entry) {
    const XMLNodeKind kind = entry.nodeKind();
    const bool isNamed = kind != XMLNodeKind::text && kind != XMLNodeKind::comment;
    String name = isNamed ? _index.name(entry) : String();
    String value = textInBlock(_index.value(entry, _room));
    auto* const made =
        ::new (_blocks.allocate(sizeof(XMLNode))) XMLNode(kind, std::move(name), std::move(value));
    made->_isLayout = entry.has(XMLIndexEntry::isBlank);
    return made;
}

Ref<XMLNode> XMLNodeMaker::node(Number number) {
    return Ref<XMLNode>::adopt(newNode(_index[number]));
}

Ref<XMLNode> XMLNodeMaker::attributeOf(const XMLElement& element, XMLNodeKind kind,
                                       const String& name) {
    return Ref<XMLNode>(kind == XMLNodeKind::attribute
                            ? element.attributeForName(name)
                            : element.findNode(element._firstNamespace, name));
}

void XMLNodeMaker::place(XMLElement& element, Number number) {
    if (_tree != nullptr) {
        element._line = _tree->element(number)._line;
        element._column = _tree->element(number)._column;
        return;
    }
    _position.moveTo(_index[number].begin);
    element._line = saturated(_position.line());
    element._column = saturated(_position.column());
}

// The element with its attributes and declarations.
Ref<XMLElement> XMLNodeMaker::start(Number number) {
    const Number begin = _index.content(number);
    const Number end = _index.firstChild(number);
    std::size_t attributes = 0;
    for (Number at = begin; at < end; ++at)
        attributes += _index[at].nodeKind() == XMLNodeKind::attribute ? 1 : 0;
    auto element = Ref<XMLElement>::adopt(::new (_blocks.allocate(sizeof(XMLElement)))
                                              XMLElement(_index.name(_index[number]), 0));
    place(*element, number);
    element->expectAttributes(attributes);
    for (Number at = begin; at < end; ++at)
        addAttribute(*element, at);
    if (_table != nullptr)
        _table->add(number, *element);
    return element;
}

void XMLNodeMaker::addAttribute(XMLElement& element, Number number) {
    const XMLIndexEntry& entry = _index[number];
    const bool isAttribute = entry.nodeKind() == XMLNodeKind::attribute;
    Ref<XMLNode> known = _table != nullptr ? _table->find(number) : nullptr;
    if (known && known->_parent != nullptr)
        return; // the host has put it elsewhere
    if (!known)
        known = node(number);
    if (!isAttribute)
        return element.appendUnlessThere(element._firstNamespace, std::move(known));
    element.appendAttribute(std::move(known));
}

XMLElement* XMLNodeMaker::addElement(XMLElement& parent, Number number) {
    Ref<XMLNode> known = _table != nullptr ? _table->find(number) : nullptr;
    if (known && known->_parent != nullptr)
        return nullptr; // the host has put it elsewhere
    const bool isNew = !known;
    XMLNode* const child = (isNew ? Ref<XMLNode>(start(number)) : std::move(known)).detach();
    XMLSiblings::append(parent, parent._firstChild, child);
    ++parent._childCount;
    return isNew ? child->asElement() : nullptr;
}

// What is no element.
void XMLNodeMaker::addContent(const Open& parent, Number number) {
    const XMLIndexEntry& content = _index[number];
    XMLElement& element = *parent.element;
    if (XMLIndex::isLayout(content, _index[parent.number]))
        return;
    XMLSiblings::append(element, element._firstChild, newNode(content));
    ++element._childCount;
}

XMLNodeMaker::Open XMLNodeMaker::opened(XMLElement& element, Number number) const noexcept {
    return {&element, number, _index.firstChild(number), _index.contentEnd(number)};
}

Ref<XMLElement> XMLNodeMaker::element(Number number) {
    Ref<XMLElement> top = start(number);
    std::vector<Open> open{opened(*top, number)};
    while (!open.empty()) {
        Open& inner = open.back();
        if (inner.at == inner.end) {
            open.pop_back();
            continue;
        }
        const Number at = std::exchange(inner.at, _index.siblingOf(inner.at));
        if (_index[at].nodeKind() != XMLNodeKind::element)
            addContent(inner, at);
        else if (XMLElement* const child = addElement(*inner.element, at))
            open.push_back(opened(*child, at));
    }
    return top;
}

void XMLNodeMaker::fill(XMLDocument& document) {
    const auto count = static_cast<Number>(_index.entries().size());
    for (Number at = 0; at < count; at = _index.siblingOf(at)) {
        Ref<XMLNode> child =
            _index[at].nodeKind() == XMLNodeKind::element ? Ref<XMLNode>(element(at)) : node(at);
        XMLSiblings::append(document, document._firstChild, child.detach());
    }
}

} // namespace qx
