#pragma once

// An element tree that is put together to be printed once: flat nodes without counts, cut from an
// arena, which go all at once.
//
//     element    | name | next | kind, flags | last attribute | last child |
//     attribute  | name | next | kind, size  | bytes of the value ... |
//     text       |   -  | next | kind, size  | bytes of the text ... |
//     leaf       | name | next | kind, size  | bytes of the text ... |    an element with a text
//     only moved      | name | next | kind        | element |                  a leaf that became
//     more kept       |   -  | next | kind        | holder |
//
// 1. Names are lent: the caller keeps them while the draft is used. Values are copied.
// 2. A list is a ring: the parent knows the last node, and the last one's `next` is the first.
// 3. Nodes of a tree are kept as what they are. They belong to a holder, an element that nobody
//    sees, and the draft has a place for all that a holder has. Whoever takes such a node elsewhere
//    thereby takes it out of the draft.
// 4. What no list leads to is not printed; its memory stays until the draft goes.
//
// Used by one thread. With a tree of nodes instead, writing orders takes more than twice the
// instructions and three times as long (bench/orders_bench.cpp, write).

#include <QXXMLMarshalling/xml/XMLElement.h>

#include "base/ShortCopy.h"

#include <algorithm>
#include <cstdint>
#include <memory>
#include <new>
#include <unordered_map>
#include <unordered_set>
#include <utility>
#include <vector>

namespace qx {

class XMLDocument;

class XMLDraft {
public:
    enum class Kind : std::uint8_t {
        element,
        attribute,
        declaration, // of a namespace: the prefix and the URI
        text,
        leaf,
        moved,
        keptChildren,
        keptAttributes,
        keptDeclarations // instead of all others
    };
    struct Element;
    struct Node {
        const String* name;
        Node* next;
        // The size above the kind: a word that is written at once. Bit fields are read before that,
        // and so memory that nothing has touched yet.
        std::uint64_t bits;

        static constexpr std::uint64_t bitsOf(Kind kind, std::size_t size) noexcept {
            return std::uint64_t(size) << 8U | static_cast<std::uint64_t>(kind);
        }
        Kind kind() const noexcept { return static_cast<Kind>(bits & 0xFFU); }
        // Of an attribute, a declaration, a text or a leaf.
        std::string_view value() const noexcept {
            return {reinterpret_cast<const char*>(this + 1), bits >> 8U};
        }
        inline const Element& element() const noexcept; // itself, or that of what moved
        XMLElement& holder() const noexcept;            // of what is kept
    };
    struct Element : Node {
        Node* lastAttribute; // declarations stand among the attributes
        Node* lastChild;
        bool hasText;         // a text that is not empty
        bool hasKept;         // places for what is kept among the children
        bool hasDeclarations; // of whatever kind
        bool isIndexed;       // its attributes are
    };

    // What is only to be looked at needs no values.
    enum class Values : std::uint8_t { copied, dropped };
    explicit XMLDraft(Values values = Values::copied) noexcept : _values(values) {}
    XMLDraft(const XMLDraft&) = delete;
    XMLDraft& operator=(const XMLDraft&) = delete;

    // An element that stands nowhere yet.
    Element& newElement(const String& name) {
        return *::new (allocate(sizeof(Element)))
            Element{{&name, nullptr, Node::bitsOf(Kind::element, 0)},
                    nullptr,
                    nullptr,
                    false,
                    false,
                    false,
                    false};
    }
    // Adds nothing when the prefix is declared there already.
    void addDeclaration(Element& element, const String& prefix, const String& URI);
    // Adds nothing when an attribute of that name is there already.
    void addAttribute(Element& element, const String& name, std::string_view value);
    static void addChild(Element& parent, Element& child) noexcept {
        append(parent.lastChild, &child);
    }
    void addLeaf(Element& parent, const String& name, std::string_view text) {
        append(parent.lastChild,
               text.empty() ? &newElement(name) : newText(Kind::leaf, &name, text));
    }
    // Takes the place of all children. An empty text is none.
    void setText(Element& element, std::string_view text);
    // Appends the children of the one to those of the other.
    static void moveChildren(Element& from, Element& to);

    // The element to whose children what is kept is to be added.
    XMLElement& holderOfChildren(Element& element);
    // The same for an attribute; null where there is one of that name.
    XMLElement* holderOfAttribute(Element& element, const String& name);
    // That of all the declarations there are to be.
    XMLElement& holderOfDeclarations(Element& element);

    // The last child of that name: an element of the draft, or one that is kept. lastIn(holder)
    // answers the last such child of a holder, which may be none.
    struct Found {
        Element* element = nullptr;
        XMLElement* kept = nullptr;
    };
    template <class LastIn>
    Found lastChildNamed(const Element& element, const String& name, LastIn lastIn);

    // How much memory it takes.
    std::size_t size() const noexcept { return _allocated - _left; }
    // The tree as nodes, in a document of version "1.0" and encoding "UTF-8". What is kept moves.
    static Ref<XMLDocument> makeDocument(const Element& root);

    // Calls visit(node) for each node of the ring that ends with `last`.
    template <class Visit>
    static void forEach(Node* last, Visit visit) {
        if (last == nullptr)
            return;
        Node* node = last;
        do {
            node = node->next;
            visit(*node);
        } while (node != last);
    }

private:
    // What lists with more nodes are searched by.
    static constexpr std::size_t mostScanned = 64;
    struct Attributes {
        std::unordered_set<std::string_view> names;
        std::vector<XMLElement*> holders;
    };
    struct Children {
        struct Last {
            Node* node = nullptr;
            std::size_t place = 0;
        };
        Node* seen = nullptr;
        std::size_t count = 0;
        std::unordered_map<std::string_view, Last> elements;
        std::vector<std::pair<std::size_t, XMLElement*>> holders; // with their places
    };

    void* allocate(std::size_t size) {
        size = (size + alignof(Node) - 1) / alignof(Node) * alignof(Node);
        if (size > _left)
            grow(size);
        _left -= size;
        return std::exchange(_next, _next + size);
    }
    void grow(std::size_t size);
    // The element in place of the child, which has room for more than a text.
    Element& enlarged(Node& child);
    Node* newNode(Kind kind, const String* name, std::string_view value) {
        // What moves leaves a pointer.
        void* const memory = allocate(sizeof(Node) + std::max(value.size(), sizeof(Element*)));
        Node* const node = ::new (memory) Node{name, nullptr, Node::bitsOf(kind, value.size())};
        copyShort(value.data(), value.size(), reinterpret_cast<char*>(node + 1));
        return node;
    }
    Node* newText(Kind kind, const String* name, std::string_view value) {
        return newNode(kind, name, _values == Values::copied ? value : std::string_view());
    }
    XMLElement& newHolder(Kind kind, Node*& last);
    static void append(Node*& last, Node* node) noexcept {
        node->next = last != nullptr ? std::exchange(last->next, node) : node;
        last = node;
    }
    bool hasAttribute(Element& element, const String& name);
    void indexAttributes(Element& element);
    Children& indexedChildren(const Element& element);
    static Ref<XMLElement> makeElement(const Element& draft);

    const Values _values;
    struct Release {
        bool isAligned; // to large pages
        void operator()(std::byte* block) const noexcept;
    };
    using Block = std::unique_ptr<std::byte, Release>;

    std::vector<Block> _blocks;
    std::byte* _next = nullptr;
    std::size_t _left = 0;
    std::size_t _allocated = 0;
    std::size_t _blockSize = 2048;
    std::vector<Ref<XMLElement>> _holders;
    std::unordered_map<const Element*, Attributes> _attributes;
    std::unordered_map<const Element*, Children> _children;
};

inline const XMLDraft::Element& XMLDraft::Node::element() const noexcept {
    return kind() == Kind::element ? static_cast<const Element&>(*this)
                                   : **reinterpret_cast<const Element* const*>(this + 1);
}

inline XMLElement& XMLDraft::Node::holder() const noexcept {
    return **reinterpret_cast<XMLElement* const*>(this + 1);
}

template <class LastIn>
XMLDraft::Found XMLDraft::lastChildNamed(const Element& element, const String& name,
                                         LastIn lastIn) {
    Node* found = nullptr;
    XMLElement* kept = nullptr;
    std::size_t scanned = 0;
    Node* node = element.lastChild;
    for (; node != nullptr && scanned <= mostScanned; ++scanned) {
        node = node->next;
        if (node->name != nullptr && *node->name == name)
            found = node;
        XMLElement* const other =
            node->kind() == Kind::keptChildren ? lastIn(node->holder()) : nullptr;
        kept = other != nullptr ? other : found == node ? nullptr : kept;
        if (node == element.lastChild)
            return kept != nullptr || found == nullptr ? Found{nullptr, kept}
                                                       : Found{&enlarged(*found), nullptr};
    }
    if (node == nullptr)
        return {};
    const Children& children = indexedChildren(element);
    const auto known = children.elements.find(name.view());
    const std::size_t place = known != children.elements.end() ? known->second.place : 0;
    for (auto holder = children.holders.rbegin();
         holder != children.holders.rend() && holder->first > place; ++holder)
        if ((kept = lastIn(*holder->second)) != nullptr)
            return {nullptr, kept};
    return {known != children.elements.end() ? &enlarged(*known->second.node) : nullptr, nullptr};
}

} // namespace qx
