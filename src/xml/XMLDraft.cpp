#include "xml/XMLDraft.h"

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "base/BulkArray.h"

#include <algorithm>
#include <cstring>

namespace qx {

static_assert(std::is_trivially_destructible_v<XMLDraft::Element> && sizeof(XMLDraft::Node) == 24);

void XMLDraft::Release::operator()(std::byte* block) const noexcept {
    if (isAligned)
        ::operator delete[](block, std::align_val_t(largePageSize));
    else
        ::operator delete[](block);
}

// What does not fit leaves the rest of the block unused: little, as blocks grow.
void XMLDraft::grow(std::size_t size) {
    constexpr std::size_t largestBlock = 8 * 1024 * 1024;
    const std::size_t capacity = std::max(size, _blockSize);
    const bool isAligned = capacity >= largestBlock;
    void* const block = isAligned ? ::operator new[](capacity, std::align_val_t(largePageSize))
                                  : ::operator new[](capacity);
    _blocks.push_back(Block(static_cast<std::byte*>(block), Release{isAligned}));
    askForLargePages(_blocks.back().get(), capacity);
    _blockSize = std::min(2 * _blockSize, largestBlock);
    _next = _blocks.back().get();
    _left = capacity;
    _allocated += capacity;
}

// The holder of the list's last place if that is of the kind, else of a new place at its end.
XMLElement& XMLDraft::newHolder(Kind kind, Node*& last) {
    if (last != nullptr && last->kind() == kind)
        return last->holder();
    _holders.push_back(XMLElement::initWithName("kept"));
    XMLElement* const holder = _holders.back().get();
    append(last,
           newNode(kind, nullptr, {reinterpret_cast<const char*>(&holder), sizeof(XMLElement*)}));
    return *holder;
}

void XMLDraft::addDeclaration(Element& element, const String& prefix, const String& URI) {
    bool isThere = false;
    if (element.hasDeclarations)
        forEach(element.lastAttribute, [&](const Node& node) {
            isThere |= node.kind() == Kind::declaration && *node.name == prefix;
        });
    if (isThere)
        return;
    append(element.lastAttribute, newText(Kind::declaration, &prefix, URI));
    element.hasDeclarations = true;
}

void XMLDraft::addAttribute(Element& element, const String& name, std::string_view value) {
    if (element.lastAttribute != nullptr && hasAttribute(element, name))
        return;
    Node* const attribute = newText(Kind::attribute, &name, value);
    if (element.isIndexed)
        _attributes.at(&element).names.insert(name.view());
    append(element.lastAttribute, attribute);
}

bool XMLDraft::hasAttribute(Element& element, const String& name) {
    if (element.isIndexed) {
        const Attributes& index = _attributes.at(&element);
        return index.names.contains(name.view()) ||
               std::any_of(index.holders.begin(), index.holders.end(),
                           [&](auto* holder) { return !holder->attributeValue(name).isNull(); });
    }
    std::size_t scanned = 0;
    const Node* node = element.lastAttribute;
    do {
        node = node->next;
        if (node->kind() == Kind::attribute ? *node->name == name
                                            : node->kind() == Kind::keptAttributes &&
                                                  !node->holder().attributeValue(name).isNull())
            return true;
        ++scanned;
    } while (node != element.lastAttribute);
    if (scanned > mostScanned)
        indexAttributes(element);
    return false;
}

void XMLDraft::indexAttributes(Element& element) {
    Attributes index;
    forEach(element.lastAttribute, [&](const Node& node) {
        if (node.kind() == Kind::attribute)
            index.names.insert(node.name->view());
        else if (node.kind() == Kind::keptAttributes)
            index.holders.push_back(&node.holder());
    });
    _attributes.insert_or_assign(&element, std::move(index));
    element.isIndexed = true;
}

XMLDraft::Element& XMLDraft::enlarged(Node& child) {
    if (child.kind() == Kind::leaf) {
        Element& element = newElement(*child.name);
        setText(element, child.value());
        const Element* const place = &element;
        std::memcpy(&child + 1, &place, sizeof place);
        child.bits = Node::bitsOf(Kind::moved, 0);
    }
    return const_cast<Element&>(child.element());
}

void XMLDraft::setText(Element& element, std::string_view text) {
    Node* const node = !text.empty() ? newText(Kind::text, nullptr, text) : nullptr;
    _children.erase(&element);
    element.lastChild = nullptr;
    element.hasText = node != nullptr;
    element.hasKept = false;
    if (node != nullptr)
        append(element.lastChild, node);
}

void XMLDraft::moveChildren(Element& from, Element& to) {
    Node* const last = std::exchange(from.lastChild, nullptr);
    if (last == nullptr)
        return;
    if (to.lastChild != nullptr)
        std::swap(last->next, to.lastChild->next);
    to.lastChild = last;
    to.hasText = to.hasText || from.hasText;
    to.hasKept = to.hasKept || from.hasKept;
}

XMLElement& XMLDraft::holderOfChildren(Element& element) {
    element.hasKept = true;
    return newHolder(Kind::keptChildren, element.lastChild);
}

XMLElement* XMLDraft::holderOfAttribute(Element& element, const String& name) {
    if (element.lastAttribute != nullptr && hasAttribute(element, name))
        return nullptr;
    XMLElement& holder = newHolder(Kind::keptAttributes, element.lastAttribute);
    if (element.isIndexed) {
        auto& holders = _attributes.at(&element).holders;
        if (holders.empty() || holders.back() != &holder)
            holders.push_back(&holder);
    }
    return &holder;
}

XMLElement& XMLDraft::holderOfDeclarations(Element& element) {
    Node* present = nullptr;
    forEach(element.lastAttribute, [&](Node& node) {
        if (node.kind() == Kind::keptDeclarations)
            present = &node;
    });
    if (present != nullptr)
        return present->holder();
    XMLElement& holder = newHolder(Kind::keptDeclarations, element.lastAttribute);
    element.hasDeclarations = true;
    return holder;
}

XMLDraft::Children& XMLDraft::indexedChildren(const Element& element) {
    Children& index = _children[&element];
    while (index.seen != element.lastChild) {
        Node* const node = (index.seen != nullptr ? index.seen : element.lastChild)->next;
        const std::size_t place = index.count + 1;
        if (node->name != nullptr)
            index.elements.insert_or_assign(node->name->view(), Children::Last{node, place});
        else if (node->kind() == Kind::keptChildren)
            index.holders.emplace_back(place, &node->holder());
        index.count = place;
        index.seen = node;
    }
    return index;
}

namespace {

std::vector<Ref<XMLNode>> taken(const XMLNodeRange& nodes) {
    std::vector<Ref<XMLNode>> all;
    for (XMLNode& node : nodes)
        all.emplace_back(&node);
    for (const Ref<XMLNode>& node : all)
        node->detach();
    return all;
}

} // namespace

// As deep as the draft is, which whoever made it has bounded.
Ref<XMLElement> XMLDraft::makeElement(const Element& draft) {
    auto element = XMLElement::initWithName(*draft.name);
    forEach(draft.lastAttribute, [&](const Node& node) {
        if (node.kind() == Kind::attribute)
            element->addAttribute(*node.name, String(node.value()));
        else if (node.kind() == Kind::declaration)
            element->addNamespace(XMLNode::namespaceWithName(*node.name, String(node.value())));
        else if (node.kind() == Kind::keptDeclarations)
            element->setNamespaces(taken(node.holder().namespaces()));
        else
            for (Ref<XMLNode>& kept : taken(node.holder().attributes()))
                element->addAttribute(std::move(kept));
    });
    forEach(draft.lastChild, [&](const Node& node) {
        if (node.kind() == Kind::element || node.kind() == Kind::moved)
            element->addChild(makeElement(node.element()));
        else if (node.kind() == Kind::leaf)
            element->addChild(XMLElement::initWithName(*node.name, String(node.value())));
        else if (node.kind() == Kind::text)
            element->addChild(XMLNode::initTextWithStringValue(String(node.value())));
        else
            for (Ref<XMLNode>& kept : taken(node.holder().children()))
                element->addChild(std::move(kept));
    });
    return element;
}

Ref<XMLDocument> XMLDraft::makeDocument(const Element& root) {
    auto document = XMLDocument::initWithRootElement(makeElement(root));
    document->setVersion("1.0");
    document->setCharacterEncoding("UTF-8");
    return document;
}

} // namespace qx
