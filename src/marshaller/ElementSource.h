#pragma once

// What an object is bound from: an element, or a private copy of one.
//
// A class with flattened fields works on a private copy, so that the flattened objects can take
// children away from each other without touching the document. The copy is a view: it lists the
// element's children and forgets those that are taken. What an object keeps of a copy (unknown XML)
// is copied when it is kept (CopyScope.h), so that nothing of the document itself is ever moved out
// of it; that holds for nested elements too, which share the copy's scope.
//
// Children are found by scanning, or through an index where many names are looked up among many
// children. A list of children holds them: a host may change the element meanwhile.

#include "marshaller/CopyScope.h"

#include <memory>
#include <vector>

class ElementSource {
public:
    using Nodes = std::vector<qx::Ref<qx::XMLNode>>;

    // The element itself, which must outlive the source; `scope` is that of the source in which it
    // was found, null in the document. `lookups` is how many names will be looked up.
    ElementSource(qx::XMLElement& element, CopyScope* scope, std::size_t lookups) noexcept
        : _element(element), _scope(scope), _lookups(lookups), _childCount(element.childCount()) {}
    // A private copy of what is left in the other.
    static std::unique_ptr<ElementSource> copyOf(const ElementSource& other);
    ElementSource(const ElementSource&) = delete;
    ElementSource& operator=(const ElementSource&) = delete;

    qx::XMLElement& element() const noexcept { return _element; }
    CopyScope* scope() const noexcept { return _scope; }
    bool isCopy() const noexcept { return _ownScope != nullptr; }
    // How many children the element had at first.
    std::size_t firstChildCount() const noexcept { return _childCount; }
    // Says that another object will look that many names up, too.
    void expectLookups(std::size_t lookups) noexcept { _lookups += lookups; }

    // The child elements of that name.
    struct Found {
        qx::XMLElement* first = nullptr;
        bool several = false;
    };
    Found find(const qx::String& name);
    qx::XMLElement* last(const qx::String& name);
    // All of them, held.
    Nodes all(const qx::String& name);
    // All children.
    Nodes all() const;
    // Whether children are found in a list, which holds them; else the element's own are walked.
    bool isListed() {
        indexIfWorthIt();
        return _children != nullptr;
    }

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
    // The node as an object may keep it; null with -224 when that is more than the budget has.
    qx::Ref<qx::XMLNode> keep(qx::XMLNode& node, ReadingBudget& budget,
                              ReadingBudget::ErrorSlot error) const;

private:
    static constexpr std::uint32_t none = UINT32_MAX;
    struct Child {
        qx::Ref<qx::XMLNode> node;
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
    // Calls visit(XMLElement&) for each child element of that name until it says false.
    template <class Visit>
    void forEachNamed(const qx::String& name, Visit visit);

    qx::XMLElement& _element;
    CopyScope* _scope;
    std::size_t _lookups;
    std::size_t _childCount;
    std::unique_ptr<Children> _children;  // a private copy's, or the index of an element's
    std::unique_ptr<CopyScope> _ownScope; // of a private copy
};
