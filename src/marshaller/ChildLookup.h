#pragma once

// What an object is bound from: an element, or a private copy of one.
//
// A class with flattened fields works on a private copy, so that the flattened objects can take
// children away from each other without touching the document. The copy is a view: it lists the
// element's children and forgets those that are taken. What an object keeps of a copy (unknown XML)
// is copied when it is kept (KeptCopies.h), so that nothing of the document itself is ever moved
// out of it; that holds for nested elements too, which share the copies.
//
// Children are found by scanning, or through an index where many names are looked up among many
// children. A list of children holds them: a host may change the element meanwhile.

#include "marshaller/KeptCopies.h"
#include "plan/MappingPlan.h"

#include <memory>
#include <vector>

namespace qx::detail {

class ChildLookup {
public:
    using Nodes = std::vector<Ref<XMLNode>>;

    // The element itself, which must outlive the source; `copies` are those of the lookup in which
    // it was found, null in the document. `lookups` is how many names will be looked up.
    ChildLookup(XMLElement& element, KeptCopies* copies, std::size_t lookups) noexcept
        : _element(element), _copies(copies), _lookups(lookups), _childCount(element.childCount()) {
    }
    // A private copy of what is left in the other.
    static std::unique_ptr<ChildLookup> copyOf(const ChildLookup& other);
    ChildLookup(const ChildLookup&) = delete;
    ChildLookup& operator=(const ChildLookup&) = delete;

    XMLElement& element() const noexcept { return _element; }
    KeptCopies* copies() const noexcept { return _copies; }
    bool isCopy() const noexcept { return _ownCopies != nullptr; }
    // How many children the element had at first.
    std::size_t firstChildCount() const noexcept { return _childCount; }
    // Says that another object will look that many names up, too.
    void expectLookups(std::size_t lookups) noexcept { _lookups += lookups; }

    // The child elements of that name.
    struct Found {
        XMLElement* first = nullptr;
        bool several = false;
    };
    Found find(const String& name);
    XMLElement* last(const String& name);
    // All of them, held.
    Nodes all(const String& name);
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
            for (XMLNode& child : _element.children())
                visit(child);
        }
    }

    // The text of the children, concatenated.
    String stringValue() const;

    // Takes the child, the first of its name, out: of the copy, else of the element itself.
    void take(XMLElement& child);
    // The node as an object may keep it; null with -224 when that is more than the budget has.
    Ref<XMLNode> keep(XMLNode& node, ReadingBudget& budget, ReadingBudget::ErrorSlot error) const;

private:
    static constexpr std::uint32_t none = UINT32_MAX;
    struct Child {
        Ref<XMLNode> node;
        std::uint32_t next = none; // of the same name; only among elements
        bool taken = false;
    };
    // Of the elements of one name: where they begin and end in the list.
    struct Run {
        std::uint32_t first = none;
        std::uint32_t last = none;
    };
    struct Children {
        std::vector<Child> list;
        StringMap<Run> runs; // empty: scan the list
        bool indexed = false;
    };

    void list();
    void index();
    void indexIfWorthIt();
    // Calls visit(XMLElement&) for each child element of that name until it says false.
    template <class Visit>
    void forEachNamed(const String& name, Visit visit);

    XMLElement& _element;
    KeptCopies* _copies;
    std::size_t _lookups;
    std::size_t _childCount;
    std::unique_ptr<Children> _children;    // a private copy's, or the index of an element's
    std::unique_ptr<KeptCopies> _ownCopies; // of a private copy
};

} // namespace qx::detail
