#pragma once

// What an object is bound from: an element, or a private copy of one.
//
// A class with flattened fields works on a private copy, so that the flattened objects can take
// children away from each other without touching the document. The copy is a view: it lists the
// element's children and forgets those that are taken. What an object keeps of a copy (unknown XML)
// is copied when it is kept, once, so that nothing of the document itself is ever moved out of it;
// that holds for nested elements too, which share the copy's scope.
//
// Children are found by scanning, or through an index where many names are looked up among many
// children.

#include <QXXMLMarshalling/platform/XMLElement.h>

#include <memory>
#include <optional>
#include <unordered_map>
#include <vector>

class ElementSource {
public:
    // The copies that objects bound from one private copy keep.
    struct CopyScope {
        std::unordered_map<const qx::XMLNode*, qx::Ref<qx::XMLNode>> copies;
    };

    // The element itself; `scope` is that of the source in which it was found, null in the
    // document. `lookups` is how many names will be looked up.
    ElementSource(qx::XMLElement& element, CopyScope* scope, std::size_t lookups) noexcept
        : _element(element), _scope(scope), _lookups(lookups) {}
    // A private copy of what is left in the other.
    static std::unique_ptr<ElementSource> copyOf(const ElementSource& other);
    ElementSource(const ElementSource&) = delete;
    ElementSource& operator=(const ElementSource&) = delete;

    qx::XMLElement& element() const noexcept { return _element; }
    CopyScope* scope() const noexcept { return _scope; }
    bool isCopy() const noexcept { return _ownScope != nullptr; }
    // Says that another object will look that many names up, too.
    void expectLookups(std::size_t lookups) noexcept { _lookups += lookups; }

    // The child elements of that name.
    struct Found {
        qx::XMLElement* first = nullptr;
        bool several = false;
    };
    Found find(const qx::String& name);
    qx::XMLElement* last(const qx::String& name);
    // All of them, one after the other, as long as the source is not used otherwise. To bind one
    // before the next is looked for finds that one in memory that is still at hand.
    class Walk;

    // Calls visit(XMLNode&) for each child node in document order.
    template <class Visit>
    void forEachChild(Visit visit) const {
        if (_children) {
            for (const Child& child : _children->list)
                if (!child.taken)
                    visit(*child.node);
        } else {
            for (qx::XMLNode& child : _element.children())
                visit(child);
        }
    }

    // The text of the children, concatenated.
    qx::String stringValue() const;

    // Takes the child, the first of its name, out: of the copy, else of the element itself.
    void take(qx::XMLElement& child);
    // The node as an object may keep it.
    qx::Ref<qx::XMLNode> keep(qx::XMLNode& node) const;

private:
    static constexpr std::uint32_t none = UINT32_MAX;
    struct Child {
        qx::XMLNode* node;
        std::uint32_t next = none; // of the same name; only among elements
        bool taken = false;
    };
    // Of the elements of one name: where they begin and end in the list.
    struct Run {
        std::uint32_t first = none;
        std::uint32_t last = none;
    };
    struct NameHash {
        std::size_t operator()(const qx::String& name) const noexcept { return name.hash(); }
    };
    struct Children {
        std::vector<Child> list;
        std::unordered_map<qx::String, Run, NameHash> runs; // empty: scan the list
        bool indexed = false;
    };

    void list();
    void index();
    void indexIfWorthIt();
    qx::XMLElement& _element;
    CopyScope* _scope;
    std::size_t _lookups;
    std::unique_ptr<Children> _children;  // a private copy's, or the index of an element's
    std::unique_ptr<CopyScope> _ownScope; // of a private copy
};

class ElementSource::Walk {
public:
    Walk(ElementSource& source, qx::String name);
    // Null behind the last.
    qx::XMLElement* next() noexcept {
        return _isIndexed ? nextIndexed() : _list != nullptr ? nextListed() : nextChild();
    }

private:
    bool isOne(const qx::XMLNode& node) const noexcept {
        return node.isElement() && node.name() == _name;
    }
    qx::XMLElement* nextIndexed() noexcept;
    qx::XMLElement* nextListed() noexcept;
    qx::XMLElement* nextChild() noexcept {
        while (_child != nullptr) {
            qx::XMLNode* const node = _child;
            _child = node->nextSibling();
            if (isOne(*node))
                return static_cast<qx::XMLElement*>(node);
        }
        return nullptr;
    }

    const qx::String _name;
    const std::vector<Child>* _list = nullptr; // null: the element's own children are walked
    bool _isIndexed = false;
    std::uint32_t _position = 0;   // in the list
    qx::XMLNode* _child = nullptr; // among the children
};
