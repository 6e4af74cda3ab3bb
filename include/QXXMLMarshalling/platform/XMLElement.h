#pragma once

// An element with its attributes, namespace declarations and child nodes. Attributes never include
// namespace declarations: those are namespaces(), and are written before the attributes.

#include <QXXMLMarshalling/platform/XMLNode.h>

#include <span>
#include <vector>

namespace qx {

class QX_API XMLElement final : public XMLNode {
public:
    static Ref<XMLElement> initWithName(const String& name);
    static Ref<XMLElement> initWithName(const String& name, const String& stringValue);
    ~XMLElement() override;

    XMLNode* firstChild() const override {
        if (holdsText())
            spellTextOut();
        return _firstChild;
    }
    XMLNode* lastChild() const { return lastOf(firstChild()); }
    std::size_t childCount() const noexcept { return _childCount; }

    // The direct child elements of that qualified name, in document order.
    std::vector<XMLElement*> elementsForName(const String& name) const;
    // Appends the node, which becomes this element's. A node that has a parent, a document, an
    // attribute, a namespace or an ancestor of this element raises NSInvalidArgumentException.
    void addChild(Ref<XMLNode> child);
    // The same before a child of this element, at the end where `before` is null.
    void insertChild(Ref<XMLNode> child, XMLNode* before);

    // In document order.
    XMLNodeRange attributes() const noexcept { return XMLNodeRange(_firstAttribute); }
    // Null when there is none.
    XMLNode* attributeForName(const String& name) const noexcept;
    // Adds nothing when an attribute of that name is there already. A node that has a parent or is
    // no attribute raises NSInvalidArgumentException.
    void addAttribute(Ref<XMLNode> attribute);
    // Detaches the attribute; nothing when there is none.
    void removeAttributeForName(const String& name);

    // In document order.
    XMLNodeRange namespaces() const noexcept { return XMLNodeRange(_firstNamespace); }
    // Replaces all declarations; of equal prefixes the first wins. Nodes that have a parent or are
    // no namespaces raise NSInvalidArgumentException before anything is changed.
    void setNamespaces(std::span<const Ref<XMLNode>> namespaces);
    // Adds nothing when the prefix is declared here already.
    void addNamespace(Ref<XMLNode> declaration);

    String stringValue() const override;
    void setStringValue(const String& value) override;
    Ref<XMLNode> copy() const override;

private:
    friend class XMLNode;
    friend class XMLTreeBuilder;
    friend class XMLSerializer;

    // Most elements with text have one text and nothing else. The element then holds it as its
    // value, and makes the node when somebody asks for its children.
    bool holdsText() const noexcept { return !_value.isNull(); }
    void holdText(String text) noexcept {
        _value = std::move(text);
        _childCount = 1;
    }
    void spellTextOut() const;
    // The first child that there is a node of.
    static const XMLNode* firstNodeOf(const XMLNode& node) noexcept;
    const XMLNode* following(const XMLNode* node) const noexcept;

    explicit XMLElement(String name) noexcept
        : XMLNode(XMLNodeKind::element, std::move(name), String()) {}
    void unlink(XMLNode& node) noexcept;

    // These fill the hole that the base class leaves.
    std::uint32_t _childCount = 0;
    std::uint32_t _line = 0;
    std::uint32_t _column = 0;
    XMLNode* _firstChild = nullptr;
    XMLNode* _firstAttribute = nullptr;
    XMLNode* _firstNamespace = nullptr;
};

inline XMLElement* XMLNode::asElement() noexcept {
    return isElement() ? static_cast<XMLElement*>(this) : nullptr;
}
inline const XMLElement* XMLNode::asElement() const noexcept {
    return isElement() ? static_cast<const XMLElement*>(this) : nullptr;
}
inline std::size_t XMLNode::line() const noexcept {
    const XMLElement* element = asElement();
    return element != nullptr ? element->_line : 0;
}
inline std::size_t XMLNode::column() const noexcept {
    const XMLElement* element = asElement();
    return element != nullptr ? element->_column : 0;
}

} // namespace qx
