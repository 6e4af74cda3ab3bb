#pragma once

// What no field took of the element that an object is made of, told from the trace of its reading:
// children and attributes of the element, and of the wrappers in it. Fields of objects that are
// flattened into the element take as those of the object do. Where a field takes the element's
// text, it takes the children with text, too.

#include "marshaller/ReadingTrace.h"
#include "xml/KeptPlace.h"

#include <unordered_map>

namespace qx::detail {

class Leftovers {
public:
    using Number = IndexedXML::Number;
    struct Node {
        Number entry;
        Number holder; // the element that it stands in
        KeptPlace place;
    };

    // Of the object that the trace has open.
    Leftovers(IndexedXML& document, const ReadingTrace& trace);

    // Elements, in document order; instructions of the element itself, too.
    const std::vector<Node>& children() const noexcept { return _children; }
    const std::vector<Node>& attributes() const noexcept { return _attributes; }
    // How many nodes were gone over.
    std::size_t visits() const noexcept { return _visits; }

private:
    using Keys = std::vector<Key>;
    struct Taker {
        const FieldPlan* field;
        std::uint32_t around; // among the keys of flattened objects
        std::uint32_t items;  // of the field's that stand before what comes behind
        bool isWrapper;
    };

    void collect(const ReadingTrace& trace, std::uint32_t owner, std::uint32_t around);
    void note(const ReadingTrace::Use& use, std::uint32_t around);
    void list(Number element, const Taker* wrapper);
    void listAttributes(Number element, const Taker* wrapper);
    KeptPlace placeBehind(const Taker* last, const Taker* wrapper);

    IndexedXML& _document;
    std::vector<Keys> _around{{}};
    std::unordered_map<Number, Taker> _taken;
    bool _isTextTaken = false;
    std::vector<Node> _children, _attributes;
    std::uint32_t _count = 0;
    std::size_t _visits = 0;
};

} // namespace qx::detail
