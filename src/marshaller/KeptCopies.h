#pragma once

// The nodes of one private copy of an element that objects keep. Only those children of the element
// are copied of which something is kept, each once and whole: a node that is kept is the one inside
// the copy of a kept ancestor.

#include "marshaller/ReadingBudget.h"

#include <unordered_map>

namespace qx::detail {

class KeptCopies {
public:
    // Of the element, which must outlive it.
    explicit KeptCopies(const XMLElement& element) noexcept : _element(element) {}
    KeptCopies(const KeptCopies&) = delete;
    KeptCopies& operator=(const KeptCopies&) = delete;

    // What stands for the element, attribute or namespace in the copy; null with -224 when copying
    // it takes more than the budget has.
    Ref<XMLNode> counterpart(XMLNode& node, ReadingBudget& budget, ReadingBudget::ErrorSlot error);

private:
    // Originals are held: a host may let go of them, and others stand in their place in memory.
    struct Copied {
        Ref<XMLNode> original;
        Ref<XMLNode> copy;
    };
    Ref<XMLNode> find(const XMLNode& node) const;
    void add(XMLNode& original, XMLNode& copy);
    XMLNode& topOf(XMLNode& node) const;
    bool copyWhole(XMLNode& top, ReadingBudget& budget, ReadingBudget::ErrorSlot error);
    void pairAttributes(const XMLElement& original, const XMLElement& copy);

    const XMLElement& _element;
    std::unordered_map<const XMLNode*, Copied> _copied;
};

} // namespace qx::detail
