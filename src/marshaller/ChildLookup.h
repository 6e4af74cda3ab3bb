#pragma once

// What an object is bound from: an element, or a private copy of one.
//
// A class with flattened fields works on a private copy, so that the flattened objects can take
// children away from each other without touching the document. The copy is a view: it lists the
// element's children and forgets those that are taken. What an object keeps of a copy (unknown XML)
// is copied when it is kept, so that nothing of the document itself is ever moved out of it; that
// holds for nested elements too, which share the copies.
//
// Children are found by scanning, or through an index where many names are looked up among many
// children.

#include "marshaller/ReadingBudget.h"
#include "plan/MappingPlan.h"

#include <array>
#include <memory>
#include <span>
#include <vector>

namespace qx::detail {

class ChildLookup {
public:
    using Number = IndexedXML::Number;
    using Nodes = IndexedXML::Nodes;
    static constexpr Number none = IndexedXML::none;

    // `nodes` are those that are kept of the element; `lookups` is how many names will be looked
    // up.
    ChildLookup(IndexedXML& document, Number element, Nodes nodes, std::size_t lookups);
    ChildLookup(const ChildLookup&) = delete;
    ChildLookup& operator=(const ChildLookup&) = delete;
    // A private copy of what is left in the other.
    static std::unique_ptr<ChildLookup> copyOf(const ChildLookup& other);

    IndexedXML& document() const noexcept { return _document; }
    Number element() const noexcept { return _element; }
    const String& elementName() const noexcept { return _document.writtenName(_element); }
    Nodes nodes() const noexcept { return _nodes; }
    bool isCopy() const noexcept { return _isCopy; }
    // Whether namespaces are declared on it.
    bool hasDeclarations() const noexcept { return _attributes.haveDeclarations; }
    // Calls visit(Number) for each of its attributes.
    template <class Visit>
    void forEachAttribute(Visit visit) const {
        for (Number at = _attributes.begin; at < _attributes.end; ++at)
            if (_document.kind(at) == XMLNodeKind::attribute)
                visit(at);
    }
    // Its attribute of that name, which is interned; none where there is none.
    Number attribute(const String& name) const {
        return _document.attribute(_element, _attributes, name);
    }
    // How many children the element has.
    std::size_t childCount() const noexcept { return children().size(); }
    // Says that another object will look that many names up, too.
    void expectLookups(std::size_t lookups) noexcept { _lookups += lookups; }

    // The child elements of that name, which is interned.
    struct Found {
        Number first = none;
        bool several = false;
    };
    Found find(const String& name);
    Number last(const String& name);
    std::vector<Number> all(const String& name);
    // All children.
    std::vector<Number> all() const;

    // Calls visit(Number) for each child in document order.
    template <class Visit>
    void forEachChild(Visit visit) const {
        for (const Child& child : children())
            if (child.number != none)
                visit(child.number);
    }

    // The text of the children, concatenated: see IndexedXML::text.
    Value stringValue() const;

    // Takes the child, the first of its name, out: of the copy, else of the element itself.
    void take(Number child);
    // The nodes as an object may keep them; null with -224 when that is more than the budget has.
    Ref<XMLNode> keepElement(Number child, ReadingBudget& budget,
                             ReadingBudget::ErrorSlot error) const;
    // Of the element, or of the one around it that holds the attribute.
    Ref<XMLNode> keepAttribute(Number attribute, Number holder, ReadingBudget& budget,
                               ReadingBudget::ErrorSlot error) const;

private:
    using Name = const void*; // of an interned name, which stands once
    static Name identity(const String& name) noexcept { return name.view().data(); }

    struct Child {
        Name name;          // of an element; null for other kinds
        Number number;      // none: taken
        std::uint32_t next; // of the same name, where there is an index, else none
    };
    // Of the elements of one name: where they begin and end in the list.
    struct Run {
        std::uint32_t first = none;
        std::uint32_t last = none;
    };

    std::span<Child> children() noexcept { return {_children, _count}; }
    std::span<const Child> children() const noexcept { return {_children, _count}; }
    void add(Name name, Number number) {
        if (_count == _room) [[unlikely]]
            makeRoom();
        _children[_count++] = {name, number, none};
    }
    void makeRoom();
    bool isIndexed() const noexcept { return _runs != nullptr; }
    // Look-ups times children up to which scanning costs no more than an index.
    static constexpr std::size_t scanLimit = 256;
    void indexIfWorthIt() {
        if (_lookups * _count > scanLimit && _lookups >= 2 && !isIndexed()) [[unlikely]]
            makeIndex();
    }
    void makeIndex();
    // Calls visit(Number) for each child element of that name until it says false.
    template <class Visit>
    void forEachNamed(const String& name, Visit visit);

    IndexedXML& _document;
    const Number _element;
    const IndexedXML::Attributes _attributes;
    const Nodes _nodes;
    const bool _isCopy = false;
    bool _isWhole = true; // no child was taken
    std::size_t _lookups;
    // The children: most elements have few, which take no memory of their own. Elements that are
    // bound so take 6 % fewer instructions for it.
    std::array<Child, 8> _few;
    std::vector<Child> _many; // where they are more
    Child* _children = _few.data();
    std::size_t _count = 0;
    std::size_t _room = _few.size();
    std::unique_ptr<std::unordered_map<Name, Run>> _runs; // where it is indexed

    ChildLookup(const ChildLookup& other, Nodes nodes);
};

} // namespace qx::detail
