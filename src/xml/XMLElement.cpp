#include <QXXMLMarshalling/xml/XMLElement.h>

#include <QXXMLMarshalling/base/Exception.h>

#include "base/MemoryBlocks.h"
#include "xml/NodeAttachment.h"
#include "xml/XMLSiblings.h"

#include <optional>
#include <string>
#include <unordered_map>

namespace qx {

namespace {

[[noreturn]] void refuse(std::string_view what, const XMLElement& element) {
    throw Exception(Exception::invalidArgument,
                    String::concat({what, ", element ", element.name()}));
}

// Raises unless the node can be put into one of the element's lists.
void requireFree(const XMLNode* node, const XMLElement& element) {
    if (node == nullptr)
        refuse("a null node cannot be added", element);
    if (node->parent() != nullptr)
        refuse("a node that has a parent cannot be added", element);
}

void requireChild(const XMLNode* child, const XMLElement& element) {
    requireFree(child, element);
    switch (child->kind()) {
    case XMLNodeKind::document:
    case XMLNodeKind::attribute:
    case XMLNodeKind::namespaceDeclaration:
        refuse("a document, attribute or namespace cannot be a child", element);
    default:
        break;
    }
    if (child == &element)
        refuse("an element cannot be its own child", element);
    const XMLElement* parent = child->asElement();
    if (parent == nullptr || parent->childCount() == 0)
        return;
    for (const XMLNode* above = element.parent(); above != nullptr; above = above->parent())
        if (above == child)
            refuse("an element cannot be the child of its descendant", element);
}

} // namespace

// Documents hold millions of elements: small members fill holes, lists keep one end.
static_assert(sizeof(void*) != 8 || (sizeof(XMLElement) <= 112 && sizeof(XMLNode) <= 72));

// An index holds all the nodes of its list, or is not there.
struct XMLElement::Indexes final : ObjectAttachment {
    using Index = std::unordered_map<String, XMLNode*>;

    std::optional<Index>& of(XMLNodeKind kind) noexcept {
        return kind == XMLNodeKind::attribute ? attributes : namespaces;
    }
    std::optional<Index> attributes;
    std::optional<Index> namespaces;
};

XMLElement::Indexes* XMLElement::indexes() const noexcept {
    const NodeAttachment* const attachment = NodeAttachment::of(*this);
    return attachment != nullptr ? static_cast<Indexes*>(attachment->indexes.get()) : nullptr;
}

XMLElement::Indexes& XMLElement::madeIndexes() {
    auto& indexes = NodeAttachment::made(*this).indexes;
    if (!indexes)
        indexes = std::make_unique<Indexes>();
    return static_cast<Indexes&>(*indexes);
}

XMLNode* XMLElement::findNode(XMLNode* first, const String& name) const noexcept {
    if (first == nullptr)
        return nullptr;
    if (Indexes* const all = indexes())
        if (const auto& index = all->of(first->_kind)) {
            const auto found = index->find(name);
            return found != index->end() ? found->second : nullptr;
        }
    for (XMLNode* node = first; node != nullptr; node = node->_next)
        if (node->_name == name)
            return node;
    return nullptr;
}

void XMLElement::appendUnlessThere(XMLNode*& first, Ref<XMLNode> node) {
    Indexes* all = indexes();
    if (all != nullptr && all->of(node->_kind)) {
        if (!all->of(node->_kind)->try_emplace(node->_name, node.get()).second)
            return;
        return XMLSiblings::append(*this, first, node.detach());
    }
    std::size_t scanned = 0;
    for (const XMLNode* other = first; other != nullptr; other = other->_next, ++scanned)
        if (other->_name == node->_name)
            return;
    if (scanned >= mostScanned) {
        Indexes::Index index;
        for (XMLNode* other = first; other != nullptr; other = other->_next)
            index.try_emplace(other->_name, other);
        index.try_emplace(node->_name, node.get());
        madeIndexes().of(node->_kind) = std::move(index);
    }
    XMLSiblings::append(*this, first, node.detach());
}

void XMLElement::expectAttributes(std::size_t count) {
    if (count > mostScanned)
        madeIndexes().attributes.emplace().reserve(count);
}

void XMLElement::appendAttribute(Ref<XMLNode> node) {
    Indexes* const all = indexes();
    if (all != nullptr && all->attributes)
        all->attributes->try_emplace(node->_name, node.get());
    XMLSiblings::append(*this, _firstAttribute, node.detach());
}

XMLElement::~XMLElement() {
    dropHeldAttributes();
    XMLSiblings::releaseAll(_firstChild);
    XMLSiblings::releaseAll(_firstAttribute);
    XMLSiblings::releaseAll(_firstNamespace);
}

XMLElement* XMLElement::newElement(const String& name, std::size_t attributes) {
    const std::size_t room = roomFor(attributes);
    return ::new (MemoryBlocks::ofNodes().allocate(sizeWith(room))) XMLElement(name, room);
}

Ref<XMLElement> XMLElement::initWithName(const String& name) { return initForAttributes(name, 0); }

Ref<XMLElement> XMLElement::initForAttributes(const String& name, std::size_t count) {
    return Ref<XMLElement>::adopt(newElement(name.isNull() ? String("") : name, count));
}

Ref<XMLElement> XMLElement::initWithName(const String& name, const String& stringValue) {
    Ref<XMLElement> element = initWithName(name);
    element->setStringValue(stringValue);
    return element;
}

std::vector<XMLElement*> XMLElement::elementsForName(const String& name) const {
    std::vector<XMLElement*> found;
    for (XMLNode* child = _firstChild; child != nullptr; child = child->_next)
        if (child->isElement() && child->_name == name)
            found.push_back(child->asElement());
    return found;
}

void XMLElement::makeTextNode() const {
    auto& self = const_cast<XMLElement&>(*this);
    auto* text = new XMLNode(XMLNodeKind::text, String(), _value);
    self._value = String();
    XMLSiblings::append(self, self._firstChild, text);
}

void XMLElement::addChild(Ref<XMLNode> child) { insertChild(std::move(child), nullptr); }

void XMLElement::insertChild(Ref<XMLNode> child, XMLNode* before) {
    requireChild(child.get(), *this);
    if (before != nullptr && (before->_parent != this || before->_kind == XMLNodeKind::attribute ||
                              before->_kind == XMLNodeKind::namespaceDeclaration))
        refuse("a child cannot be inserted before a node that is no child", *this);
    firstChild(); // a text that is held stands in the list from now on
    XMLSiblings::insert(*this, _firstChild, child.detach(), before);
    ++_childCount;
}

void XMLElement::makeAttributeNodes() const {
    auto& self = const_cast<XMLElement&>(*this);
    std::vector<Ref<XMLNode>> nodes;
    nodes.reserve(_heldCount);
    for (const HeldAttribute& attribute : held())
        nodes.push_back(XMLNode::attributeWithName(attribute.name, attribute.value));
    self.dropHeldAttributes();
    for (Ref<XMLNode>& node : nodes)
        XMLSiblings::append(self, self._firstAttribute, node.detach());
}

XMLNode* XMLElement::attributeForName(const String& name) const {
    // The name may be that of one that is held.
    // NOLINTNEXTLINE(performance-unnecessary-copy-initialization)
    const String wanted = name;
    if (_heldCount != 0 && !attributeValue(wanted).isNull())
        makeAttributeNodes();
    return findNode(_firstAttribute, wanted);
}

String XMLElement::attributeValue(const String& name) const noexcept {
    for (const HeldAttribute& attribute : held())
        if (attribute.name == name)
            return attribute.value;
    const XMLNode* const node = findNode(_firstAttribute, name);
    return node != nullptr ? node->_value : String();
}

void XMLElement::addAttribute(Ref<XMLNode> attribute) {
    requireFree(attribute.get(), *this);
    if (attribute->_kind != XMLNodeKind::attribute)
        refuse("a node that is no attribute cannot be added as one", *this);
    if (_heldCount != 0 && !attributeValue(attribute->_name).isNull())
        return;
    attributes(); // those that are held stand in the list from now on
    appendUnlessThere(_firstAttribute, std::move(attribute));
}

void XMLElement::addAttribute(const String& name, const String& value) {
    if (!canHoldAttribute())
        return addAttribute(attributeWithName(name, value));
    String present = name.isNull() ? String("") : name;
    if (attributeValue(present).isNull())
        holdAttribute(std::move(present), value.isNull() ? String("") : value);
}

// NOLINTNEXTLINE(readability-make-member-function-const): it changes what the element holds
void XMLElement::removeAttributeForName(const String& name) {
    if (XMLNode* attribute = attributeForName(name))
        attribute->detach();
}

void XMLElement::setNamespaces(std::span<const Ref<XMLNode>> namespaces) {
    for (const Ref<XMLNode>& declaration : namespaces) {
        requireFree(declaration.get(), *this);
        if (declaration->_kind != XMLNodeKind::namespaceDeclaration)
            refuse("a node that is no namespace cannot be set as one", *this);
    }
    std::optional<Indexes::Index> index;
    if (namespaces.size() > mostScanned) {
        index.emplace();
        for (const Ref<XMLNode>& declaration : namespaces)
            index->try_emplace(declaration->_name, declaration.get());
        madeIndexes();
    }
    // Nothing fails from here on.
    XMLSiblings::releaseAll(_firstNamespace);
    if (Indexes* const all = indexes())
        all->namespaces = std::move(index);
    // A node that stands in the list twice has a parent by then.
    for (const Ref<XMLNode>& declaration : namespaces) {
        const XMLNode* const first = findNode(_firstNamespace, declaration->_name);
        if (declaration->_parent == nullptr && (first == nullptr || first == declaration.get()))
            XMLSiblings::append(*this, _firstNamespace, Ref<XMLNode>(declaration).detach());
    }
}

void XMLElement::addNamespace(Ref<XMLNode> declaration) {
    requireFree(declaration.get(), *this);
    if (declaration->_kind != XMLNodeKind::namespaceDeclaration)
        refuse("a node that is no namespace cannot be added as one", *this);
    appendUnlessThere(_firstNamespace, std::move(declaration));
}

void XMLElement::unlink(XMLNode& node) noexcept {
    const bool isChild =
        node._kind != XMLNodeKind::attribute && node._kind != XMLNodeKind::namespaceDeclaration;
    if (Indexes* const all = isChild ? nullptr : indexes())
        if (auto& index = all->of(node._kind))
            index->erase(node._name);
    if (node._kind == XMLNodeKind::attribute) {
        XMLSiblings::remove(_firstAttribute, node);
    } else if (node._kind == XMLNodeKind::namespaceDeclaration) {
        XMLSiblings::remove(_firstNamespace, node);
    } else {
        XMLSiblings::remove(_firstChild, node);
        --_childCount;
    }
}

const XMLNode* XMLElement::firstNodeOf(const XMLNode& node) noexcept {
    const XMLElement* element = node.asElement();
    return element != nullptr ? element->_firstChild : nullptr;
}

// The node after `node` in document order, within this element.
const XMLNode* XMLElement::following(const XMLNode* node) const noexcept {
    if (const XMLNode* child = firstNodeOf(*node))
        return child;
    while (node != this && node->_next == nullptr)
        node = node->_parent;
    return node == this ? nullptr : node->_next;
}

// The text of an element with one text, as most have, is shared with the caller, not copied. Of the
// nodes within, texts and elements that hold one have a value; of no others the value counts.
String XMLElement::stringValue() const {
    if (holdsText())
        return _value;
    const XMLNode* only = nullptr;
    std::string joined;
    for (const XMLNode* node = _firstChild; node != nullptr; node = following(node)) {
        const bool isText = node->_kind == XMLNodeKind::text || node->isElement();
        if (!isText || node->_value.isNull())
            continue;
        if (only == nullptr && joined.empty()) {
            only = node;
            continue;
        }
        if (only != nullptr)
            joined = only->_value.view();
        only = nullptr;
        joined += node->_value.view();
    }
    return only != nullptr ? only->_value : String(joined);
}

void XMLElement::setStringValue(const String& value) {
    String text = value; // which may be a name of what goes now
    XMLSiblings::releaseAll(_firstChild);
    _value = String();
    _childCount = 0;
    if (!text.isEmpty())
        holdText(std::move(text));
}

Ref<XMLElement> XMLElement::copyAlone() const {
    auto element = Ref<XMLElement>::adopt(newElement(_name, _heldCount));
    element->_line = _line;
    element->_column = _column;
    KeptPlace::copy(*this, *element);
    if (holdsText())
        element->holdText(_value);
    for (const HeldAttribute& attribute : held())
        element->holdAttribute(attribute.name, attribute.value);
    for (const XMLNode* node = _firstAttribute; node != nullptr; node = node->_next)
        element->appendUnlessThere(element->_firstAttribute, node->copy());
    for (const XMLNode* node = _firstNamespace; node != nullptr; node = node->_next)
        element->appendUnlessThere(element->_firstNamespace, node->copy());
    return element;
}

// Walks both trees in step, so that depth costs no stack.
Ref<XMLNode> XMLElement::copy() const {
    Ref<XMLElement> top = copyAlone();
    XMLElement* target = top.get();
    const XMLNode* node = this;
    while (true) {
        if (firstNodeOf(*node) != nullptr) {
            node = firstNodeOf(*node);
        } else {
            while (node != this && node->_next == nullptr) {
                node = node->_parent;
                // The copy has every level that the walk leaves.
                if (node != this) // NOLINTNEXTLINE(clang-analyzer-core.NullDereference)
                    target = static_cast<XMLElement*>(target->_parent);
            }
            if (node == this)
                return top;
            node = node->_next;
        }
        const XMLElement* element = node->asElement();
        Ref<XMLNode> copied =
            element != nullptr ? Ref<XMLNode>(element->copyAlone()) : node->copy();
        XMLNode* child = copied.get();
        // NOLINTNEXTLINE(clang-analyzer-core.NonNullParamChecker): likewise
        XMLSiblings::append(*target, target->_firstChild, copied.detach());
        ++target->_childCount;
        if (firstNodeOf(*node) != nullptr)
            target = static_cast<XMLElement*>(child);
    }
}

} // namespace qx
