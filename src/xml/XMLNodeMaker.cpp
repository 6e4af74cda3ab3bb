#include "xml/XMLNodeMaker.h"

#include "base/TextBlocks.h"
#include "xml/XMLSiblings.h"

#include <algorithm>

namespace qx {

namespace {

std::uint32_t saturated(std::size_t number) {
    return static_cast<std::uint32_t>(std::min<std::size_t>(number, UINT32_MAX));
}

} // namespace

XMLNode* XMLNodeMaker::newNode(XMLNodeKind kind, const XMLIndexEntry& entry) {
    const bool isNamed = kind != XMLNodeKind::text && kind != XMLNodeKind::comment;
    String name = isNamed ? _index.name(entry) : String();
    String value = textInBlock(_index.value(entry, _room));
    return ::new (_blocks.allocate(sizeof(XMLNode)))
        XMLNode(kind, std::move(name), std::move(value));
}

// The element with its attributes and declarations.
Ref<XMLElement> XMLNodeMaker::start(Number number) {
    const XMLIndexEntry& entry = _index[number];
    const Number content = _index.firstChild(number);
    std::size_t attributes = 0;
    for (Number at = number + 1; at < content; ++at)
        attributes += _index[at].nodeKind() == XMLNodeKind::attribute ? 1 : 0;
    const std::size_t room = XMLElement::roomFor(attributes);
    auto element = Ref<XMLElement>::adopt(::new (_blocks.allocate(XMLElement::sizeWith(room)))
                                              XMLElement(_index.name(entry), room));
    _position.moveTo(entry.begin);
    element->_line = saturated(_position.line());
    element->_column = saturated(_position.column());
    element->expectAttributes(attributes);
    for (Number at = number + 1; at < content; ++at)
        addAttribute(*element, _index[at]);
    if (_table != nullptr)
        _table->add(number, *element);
    return element;
}

void XMLNodeMaker::addAttribute(XMLElement& element, const XMLIndexEntry& entry) {
    if (entry.nodeKind() == XMLNodeKind::namespaceDeclaration)
        element.appendUnlessThere(
            element._firstNamespace,
            Ref<XMLNode>::adopt(newNode(XMLNodeKind::namespaceDeclaration, entry)));
    else if (element.canHoldAttribute())
        element.holdAttribute(_index.name(entry), textInBlock(_index.value(entry, _room)));
    else
        element.appendAttribute(Ref<XMLNode>::adopt(newNode(XMLNodeKind::attribute, entry)));
}

// What is no element. The only text of an element is held by the element itself.
void XMLNodeMaker::addContent(XMLElement& element, const XMLIndexEntry& entry, Number number) {
    const XMLIndexEntry& content = _index[number];
    if (XMLIndex::isLayout(content, entry))
        return;
    if (content.nodeKind() == XMLNodeKind::text && content.isBlank == 0 &&
        element._childCount == 0 && number + 1 == entry.next) {
        element.holdText(textInBlock(_index.value(content, _room)));
        return;
    }
    XMLNode* const node = newNode(content.nodeKind(), content);
    node->_isLayout = content.isBlank != 0;
    XMLSiblings::append(element, element._firstChild, node);
    ++element._childCount;
}

void XMLNodeMaker::fill(std::vector<Open>& open, Number from, Number end) {
    for (Number at = from; at < end;) {
        while (open.back().entry->next == at)
            open.pop_back();
        XMLElement& parent = *open.back().element;
        const XMLIndexEntry& entry = _index[at];
        if (entry.nodeKind() != XMLNodeKind::element) {
            addContent(parent, *open.back().entry, at++);
            continue;
        }
        Ref<XMLElement> child = _table != nullptr ? _table->find(at) : nullptr;
        const bool isThere = child.get() != nullptr;
        if (!isThere)
            child = start(at);
        // What the host has put elsewhere stays there.
        if (child->_parent == nullptr) {
            XMLElement* const element = child.get();
            XMLSiblings::append(parent, parent._firstChild, child.detach());
            ++parent._childCount;
            if (!isThere)
                open.push_back({element, &entry});
        }
        at = isThere ? entry.next : _index.firstChild(at);
    }
}

Ref<XMLElement> XMLNodeMaker::element(Number number) {
    Ref<XMLElement> top = start(number);
    std::vector<Open> open{{top.get(), &_index[number]}};
    fill(open, _index.firstChild(number), _index[number].next);
    return top;
}

void XMLNodeMaker::fill(XMLDocument& document) {
    const auto count = static_cast<Number>(_index.entries().size());
    for (Number at = 0; at < count; at = _index[at].next) {
        const XMLIndexEntry& entry = _index[at];
        XMLNode* const node = entry.nodeKind() == XMLNodeKind::element
                                  ? element(at).detach()
                                  : newNode(entry.nodeKind(), entry);
        XMLSiblings::append(document, document._firstChild, node);
    }
}

} // namespace qx
