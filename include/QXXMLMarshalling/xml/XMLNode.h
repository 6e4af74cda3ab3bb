#pragma once

// The node tree of an XML document. Each node is counted on its own: a parent owns its children,
// and a child that someone keeps outlives its parent and its document. A node can be detached and
// put into another tree; it stays the same node. Nodes are made with the init… operations of this
// class, of XMLElement and of XMLDocument.
//
//     kind                   name()                   stringValue()
//     document               null                     the text of the root element
//     element                qualified name           all text inside, concatenated
//     attribute              qualified name           the value
//     namespaceDeclaration   prefix ("" the default)  the URI
//     text, comment          null                     the text
//     processingInstruction  target                   the data
//
// Names are kept as written, prefix included; a prefix needs no declaration.

#include <QXXMLMarshalling/model/Object.h>

#include <iterator>

namespace qx {

class XMLDocument;
class XMLElement;
class XMLNode;

enum class XMLNodeKind : std::uint8_t {
    document,
    element,
    attribute,
    namespaceDeclaration,
    text,
    comment,
    processingInstruction
};

// Options of serialising, to be combined with |.
enum XMLOptions : std::uint32_t {
    XMLNoOptions = 0,
    // One node a line, 4 blanks a level, where no text stands beside elements and no
    // xml:space="preserve" is in force.
    XMLPrettyPrint = 1U << 17,
    // <a/> instead of <a></a>.
    XMLCompactEmptyElements = 1U << 18
};
constexpr XMLOptions operator|(XMLOptions a, XMLOptions b) {
    return static_cast<XMLOptions>(static_cast<std::uint32_t>(a) | static_cast<std::uint32_t>(b));
}

// Sibling nodes, lent by their parent: good until the parent's list changes.
class XMLNodeRange {
public:
    class Iterator {
    public:
        using difference_type = std::ptrdiff_t;
        using value_type = XMLNode;
        using reference = XMLNode&;
        using pointer = XMLNode*;
        using iterator_category = std::forward_iterator_tag;
        Iterator() noexcept = default;
        explicit Iterator(XMLNode* node) noexcept : _node(node) {}
        XMLNode& operator*() const noexcept { return *_node; }
        XMLNode* operator->() const noexcept { return _node; }
        inline Iterator& operator++() noexcept;
        Iterator operator++(int) noexcept {
            Iterator before = *this;
            ++*this;
            return before;
        }
        friend bool operator==(Iterator a, Iterator b) noexcept { return a._node == b._node; }

    private:
        XMLNode* _node = nullptr;
    };

    explicit XMLNodeRange(XMLNode* first) noexcept : _first(first) {}
    Iterator begin() const noexcept { return Iterator(_first); }
    Iterator end() const noexcept { return Iterator(); }
    bool empty() const noexcept { return _first == nullptr; }

private:
    XMLNode* _first;
};

class QX_API XMLNode : public Object {
public:
    ~XMLNode() override;
    // Nodes share blocks of memory.
    static void* operator new(std::size_t size);
    static void operator delete(void* node) noexcept;

    static Ref<XMLNode> initTextWithStringValue(const String& text);
    static Ref<XMLNode> initCommentWithStringValue(const String& text);
    static Ref<XMLNode> initProcessingInstructionWithName(const String& target, const String& data);
    static Ref<XMLNode> attributeWithName(const String& name, const String& value);
    // A namespace declaration; the empty prefix declares the default namespace.
    static Ref<XMLNode> namespaceWithName(const String& prefix, const String& URI);

    XMLNodeKind kind() const noexcept { return _kind; }
    bool isElement() const noexcept { return _kind == XMLNodeKind::element; }
    // This node as an element; null for any other kind.
    inline XMLElement* asElement() noexcept;
    inline const XMLElement* asElement() const noexcept;

    // See the table above.
    const String& name() const noexcept { return _name; }
    virtual String stringValue() const;
    // Replaces the value; of an element its whole content, by one text (none for empty text).
    virtual void setStringValue(const String& value);

    // An element, or the document; null for a node that stands alone.
    XMLNode* parent() const noexcept { return _parent; }
    // The document at the top; null when there is none.
    XMLDocument* rootDocument() const noexcept;
    XMLNode* nextSibling() const noexcept { return _next; }
    XMLNode* previousSibling() const noexcept {
        return _previous != nullptr && _previous->_next != nullptr ? _previous : nullptr;
    }
    // The child nodes in document order: of elements and documents; of other kinds none.
    // What was parsed has all its nodes, and any number of threads may read it while none changes
    // it. Of elements set by hand the only text may become a node now: for one thread at a time.
    XMLNodeRange children() const { return XMLNodeRange(firstChild()); }
    virtual XMLNode* firstChild() const { return nullptr; }

    // Takes the node out of its parent, which gives up its count: keep a Ref before you call it.
    // Nothing happens to a node that stands alone.
    virtual void detach();
    // A deep copy without a parent. Positions in the document are copied too.
    virtual Ref<XMLNode> copy() const;
    // True when both print as the same XML.
    bool isSameXML(const XMLNode& other) const;

    // Where the element's "<" stood in the parsed document, 1-based, a column being one character
    // (code point) of the line; 0 for nodes made by hand and for other kinds. An element that an
    // entity brought stands where the entity was referred to.
    inline std::size_t line() const noexcept;
    inline std::size_t column() const noexcept;

    // The node as XML text (an attribute as name="value"), without layout. Raises
    // NSInvalidArgumentException, naming the place, for what would not be XML: an illegal name, a
    // control character, a comment with "--".
    String XMLString(XMLOptions options = XMLNoOptions) const;
    // The XML text, with what is no XML shown as it is; messages print nodes so.
    String description() const override;

protected:
    friend class XMLElement;
    friend class XMLDocument;
    friend class XMLNodeMaker;
    friend class XMLTreeIndexer;
    friend class XMLSerializer;
    friend struct XMLSiblings;

    XMLNode(XMLNodeKind kind, String name, String value) noexcept
        : _kind(kind), _name(std::move(name)), _value(std::move(value)) {}
    const Class& describedClass() const override;
    static XMLNode* lastOf(XMLNode* first) noexcept {
        return first != nullptr ? first->_previous : nullptr;
    }

    XMLNodeKind _kind;
    // A text of white space that stood in a parsed document as such, and was asked to be kept. It
    // is written as it is; the line breaks of any other such text are escaped, so that it is read
    // back.
    bool _isLayout = false;
    XMLNode* _parent = nullptr; // owns this node
    XMLNode* _next = nullptr;
    XMLNode* _previous = nullptr; // of the first of its siblings: the last one
    String _name;
    String _value;
};

inline XMLNodeRange::Iterator& XMLNodeRange::Iterator::operator++() noexcept {
    _node = _node->nextSibling();
    return *this;
}

} // namespace qx

#include <QXXMLMarshalling/xml/XMLElement.h>
