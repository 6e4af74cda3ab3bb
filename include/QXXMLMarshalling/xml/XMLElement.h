#pragma once

// An element with its attributes, namespace declarations and child nodes. Attributes never include
// namespace declarations: those are namespaces(), and are written before the attributes.

#include <QXXMLMarshalling/xml/XMLNode.h>

#include <memory>
#include <span>
#include <vector>

namespace qx {

class QX_API XMLElement final : public XMLNode {
public:
    static Ref<XMLElement> initWithName(const String& name);
    static Ref<XMLElement> initWithName(const String& name, const String& stringValue);
    // With memory for that many attributes, which is the fastest way to have a few of them.
    static Ref<XMLElement> initForAttributes(const String& name, std::size_t count);
    ~XMLElement() override;

    XMLNode* firstChild() const override {
        if (holdsText())
            makeTextNode();
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

    // In document order. Those of an element made by hand, too, may become nodes when they are
    // asked for: see XMLNode::children().
    XMLNodeRange attributes() const {
        if (_heldCount != 0)
            makeAttributeNodes();
        return XMLNodeRange(_firstAttribute);
    }
    // Null when there is none.
    XMLNode* attributeForName(const String& name) const;
    // The value of the attribute; null when there is none. It needs no node.
    String attributeValue(const String& name) const noexcept;
    // Calls visit(name, value) for each attribute in document order; that needs no nodes. The
    // attributes must not change meanwhile.
    template <class Visit>
    void forEachAttribute(Visit visit) const {
        std::size_t visited = 0;
        for (; visited < _heldCount; ++visited) {
            const HeldAttribute attribute = held()[visited]; // nodes may be made of them
            visit(attribute.name, attribute.value);
        }
        const XMLNode* node = _firstAttribute;
        for (; visited != 0 && node != nullptr; --visited)
            node = node->_next;
        for (; node != nullptr; node = node->_next)
            visit(node->_name, node->_value);
    }
    // Adds nothing when an attribute of that name is there already. A node that has a parent or is
    // no attribute raises NSInvalidArgumentException.
    void addAttribute(Ref<XMLNode> attribute);
    void addAttribute(const String& name, const String& value);
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
    // Whether the content is one text that nobody has asked for as a node: stringValue() only
    // hands it out then.
    bool holdsText() const noexcept { return !_value.isNull(); }
    void setStringValue(const String& value) override;
    Ref<XMLNode> copy() const override;

private:
    friend class XMLNode;
    friend class XMLNodeMaker;
    friend class XMLSerializer;

    // Attributes are held behind the element, in memory that it is made with:
    //
    //     | XMLElement | name, value | name, value | (free) |
    //                    <----- _heldCount ------>
    //                    <------------ _heldRoom ----------->
    //
    // 1. An attribute is held or has a node, and while one is held none has a node: asking for a
    //    node makes those of all, lazily.
    // 2. The room is fixed when the element is made, and goes with it. What does not fit is a node.
    // 3. The element owns them. A parsed one holds none: many threads may ask for its attributes.
    struct HeldAttribute {
        String name;
        String value;
    };
    static constexpr std::size_t mostHeld = 32;
    static std::size_t roomFor(std::size_t attributes) noexcept {
        return attributes <= mostHeld ? attributes : 0;
    }
    static std::size_t sizeWith(std::size_t room) noexcept {
        return sizeof(XMLElement) + room * sizeof(HeldAttribute);
    }
    static XMLElement* newElement(const String& name, std::size_t attributes);
    Ref<XMLElement> copyAlone() const;
    std::span<HeldAttribute> held() const noexcept {
        auto* first = reinterpret_cast<HeldAttribute*>(const_cast<XMLElement*>(this) + 1);
        return {first, _heldCount};
    }
    bool canHoldAttribute() const noexcept {
        return _heldCount < _heldRoom && _firstAttribute == nullptr;
    }
    void holdAttribute(String name, String value) noexcept {
        new (held().data() + _heldCount) HeldAttribute{std::move(name), std::move(value)};
        ++_heldCount;
    }
    void dropHeldAttributes() noexcept {
        std::destroy(held().begin(), held().end());
        _heldCount = 0;
    }
    void makeAttributeNodes() const;

    // Attributes and declarations beyond the first few are found by name through an index.
    struct Indexes;
    static constexpr std::size_t mostScanned = 64;
    Indexes* indexes() const noexcept;
    Indexes& madeIndexes();
    XMLNode* findNode(XMLNode* first, const String& name) const noexcept;
    // Nothing where one of that name is there already.
    void appendUnlessThere(XMLNode*& first, Ref<XMLNode> node);
    // Makes it known that as many nodes come, each of another name.
    void expectAttributes(std::size_t count);
    void appendAttribute(Ref<XMLNode> node);

    // Most elements with text have one text and nothing else. The element then holds it as its
    // value, and makes the node when somebody asks for its children.
    void holdText(String text) noexcept {
        _value = std::move(text);
        _childCount = 1;
    }
    void makeTextNode() const;
    // The first child that there is a node of.
    static const XMLNode* firstNodeOf(const XMLNode& node) noexcept;
    const XMLNode* following(const XMLNode* node) const noexcept;

    XMLElement(const String& name, std::size_t heldRoom) noexcept
        : XMLNode(XMLNodeKind::element, name, String()),
          _heldRoom(static_cast<std::uint8_t>(heldRoom)) {}
    void unlink(XMLNode& node) noexcept;

    std::uint8_t _heldCount = 0;
    std::uint8_t _heldRoom;
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
