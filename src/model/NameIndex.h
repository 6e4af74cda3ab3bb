#pragma once

// The search that Dictionary and CountedSet share: entries stand in a vector in order; up to a
// limit they are scanned, beyond it an open-addressing table of positions leads to them.

#include <QXXMLMarshalling/base/String.h>

#include <vector>

namespace qx::nameindex {

constexpr std::size_t scanLimit = 8;
constexpr std::size_t none = static_cast<std::size_t>(-1);

// Position of the live entry with that name; `nameOf(position)` gives each one's name. Where all
// names are interned, `allInterned`, an interned one is told from them without a look at its text.
template <class NameOf>
std::size_t scan(std::size_t entries, const String& name, bool allInterned,
                 NameOf nameOf) noexcept {
    // Most names are the very ones that were put in.
    for (std::size_t i = 0; i < entries; ++i)
        if (nameOf(i).isSameAs(name))
            return i;
    if (allInterned && name.isInterned())
        return none;
    for (std::size_t i = 0; i < entries; ++i)
        if (nameOf(i) == name)
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
