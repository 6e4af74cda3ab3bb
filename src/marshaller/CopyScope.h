#pragma once

// The nodes of one private copy of an element that objects keep. Only those children of the element
// are copied of which something is kept, each once and whole: a node that is kept is the one inside
// the copy of a kept ancestor.

#include "marshaller/ReadingBudget.h"

#include <unordered_map>

class CopyScope {
public:
    // Of the element, which must outlive it.
    explicit CopyScope(const qx::XMLElement& element) noexcept : _element(element) {}
    CopyScope(const CopyScope&) = delete;
    CopyScope& operator=(const CopyScope&) = delete;

    // What stands for the element, attribute or namespace in the copy; null with -224 when copying
    // it takes more than the budget has.
    qx::Ref<qx::XMLNode> counterpart(qx::XMLNode& node, ReadingBudget& budget,
                                     ReadingBudget::ErrorSlot error);

private:
    // Originals are held: a host may let go of them, and others stand in their place in memory.
    struct Copied {
        qx::Ref<qx::XMLNode> original;
        qx::Ref<qx::XMLNode> copy;
    };
    qx::Ref<qx::XMLNode> find(const qx::XMLNode& node) const;
    void add(qx::XMLNode& original, qx::XMLNode& copy);
    qx::XMLNode& topOf(qx::XMLNode& node) const;
    bool copyWhole(qx::XMLNode& top, ReadingBudget& budget, ReadingBudget::ErrorSlot error);
    void pairAttributes(const qx::XMLElement& original, const qx::XMLElement& copy);

    const qx::XMLElement& _element;
    std::unordered_map<const qx::XMLNode*, Copied> _copied;
};
