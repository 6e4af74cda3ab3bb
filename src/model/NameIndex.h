#pragma once

// The search that Dictionary and CountedSet share: an open-addressing hash table of positions
// beside the entries, which stand in a vector in order.
//
//     entries   | a | b | c | d | …
//     index     | 0 | 3 | 0 | 1 | 2 | 0 | 4 | 0 | …     position + 1; 0 is a free slot
//
// 1. Up to `scanLimit` entries there is no index, and they are scanned.
// 2. The index has a power of two of slots and is at most half full, so a search ends.
// 3. A name stands at the slot of its hash or, where that is taken, behind it without a gap.
// 4. No position is taken out: a removed entry keeps its place until its owner makes room, drops
//    such entries and builds the index anew.
//
// With an index from the first entry on, reading orders takes 15 % more instructions
// (bench/orders_bench.cpp, read).

#include <QXXMLMarshalling/base/String.h>

#include <vector>

namespace qx::nameindex {

constexpr std::size_t scanLimit = 8;
constexpr std::size_t none = static_cast<std::size_t>(-1);

// The position of the entry with that name; `nameOf(position)` gives each one's name.
template <class NameOf>
std::size_t scan(std::size_t entries, const String& name, NameOf nameOf) noexcept {
    for (std::size_t i = 0; i < entries; ++i)
        if (nameOf(i).isSameAs(name))
            return i;
    // Of two interned names that are not the same no more has to be looked at.
    const bool isInterned = name.isInterned();
    for (std::size_t i = 0; i < entries; ++i)
        if (!(isInterned && nameOf(i).isInterned()) && nameOf(i) == name)
            return i;
    return none;
}

// The same by a table, which must not be empty.
template <class NameOf>
std::size_t lookUp(const std::vector<std::uint32_t>& index, const String& name,
                   NameOf nameOf) noexcept {
    const std::size_t mask = index.size() - 1;
    for (std::size_t slot = name.hash() & mask; index[slot] != 0; slot = (slot + 1) & mask)
        if (nameOf(index[slot] - 1) == name)
            return index[slot] - 1;
    return none;
}

inline void add(std::vector<std::uint32_t>& index, const String& name,
                std::size_t position) noexcept {
    const std::size_t mask = index.size() - 1;
    std::size_t slot = name.hash() & mask;
    while (index[slot] != 0)
        slot = (slot + 1) & mask;
    index[slot] = static_cast<std::uint32_t>(position + 1);
}

// Whether a table with one more entry than `entries` is too full (more than half).
inline bool isFull(const std::vector<std::uint32_t>& index, std::size_t entries) noexcept {
    return index.empty() ? entries >= scanLimit : (entries + 1) * 2 > index.size();
}

// An empty table for that many entries; none while they are scanned.
inline std::vector<std::uint32_t> tableFor(std::size_t entries) {
    if (entries <= scanLimit)
        return {};
    std::size_t size = 32;
    while (size < entries * 4)
        size *= 2;
    return std::vector<std::uint32_t>(size);
}

} // namespace qx::nameindex
