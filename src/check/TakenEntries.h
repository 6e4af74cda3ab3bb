#pragma once

// What one reading made of each element and attribute of a document, as its trace tells.

#include "check/Tally.h"
#include "marshaller/ReadingTrace.h"

namespace qx::detail {

class TakenEntries {
public:
    using Number = ReadingTrace::Number;
    using Use = ReadingTrace::Use;
    using Owner = ReadingTrace::Owner;

    // Both must outlive this.
    TakenEntries(const XMLIndex& index, const ReadingTrace& trace);

    enum class Fate : std::uint8_t {
        object,  // an object was made of it, or of the element around it without one of its own
        value,   // an attribute, or an element whose text was taken
        wrapper, // it stands around an attribute or items that were taken
        none     // no field took it
    };
    Fate fateOf(Number entry) const;

    // The uses of an entry, in the order in which they came about.
    std::vector<const Use*> usesOf(Number entry) const;
    // The object that was made of the element, flattened ones apart; null where none was.
    const Owner* ownerOf(Number element) const;
    // The class of which the element became an object, else the field that took it.
    Tally::Concerned concernedBy(Number entry) const;
    // Whether a field took the text of an element that became an object.
    bool hasText(Number element) const;

    const XMLIndex& index() const noexcept { return _index; }
    const ReadingTrace& trace() const noexcept { return _trace; }

private:
    const XMLIndex& _index;
    const ReadingTrace& _trace;
    std::vector<std::uint32_t> _sortedUses;  // by entry
    std::vector<std::uint32_t> _firstOwners; // by element: the first that was made of it
};

} // namespace qx::detail
