#pragma once

// The names of one document. The parser keeps each name once, so its pointers stand for the names;
// from a pair of them (local name and prefix) this finds the number of the qualified name. A name
// that a mapping or code uses is interned, so that comparing with it compares pointers.

#include <QXXMLMarshalling/base/Key.h>

#include "xml/XMLLimits.h"

#include <bit>
#include <optional>
#include <vector>

namespace qx {

class XMLNames {
public:
    using Name = const unsigned char*;
    using Number = std::uint32_t;

    // The qualified names go into the list, which must outlive this, each where its number says.
    explicit XMLNames(std::vector<String>& names) : _names(names), _entries(initialSize) {}

    // Of the qualified name; the prefix is null where there is none. Throws ParseFailure when the
    // document has too many different names: the parser's own table of names gets slow with them.
    Number numberOf(Name local, Name prefix) {
        std::size_t at = slot(local, prefix);
        while (_entries[at].local != nullptr) {
            if (_entries[at].local == local && _entries[at].prefix == prefix)
                return _entries[at].number;
            at = (at + 1) & (_entries.size() - 1);
        }
        return add(local, prefix);
    }
    // The empty prefix, that of a default namespace.
    Number numberOfNoPrefix();

private:
    struct Entry {
        Name local = nullptr;
        Name prefix = nullptr;
        Number number = 0;
    };
    static constexpr std::size_t initialSize = 256; // a power of two
    static constexpr std::size_t maximumNames = xmlLimits::names;

    std::size_t slot(Name local, Name prefix) const noexcept {
        const auto mixed = (reinterpret_cast<std::uintptr_t>(local) +
                            std::rotl(reinterpret_cast<std::uintptr_t>(prefix), 21)) *
                           0x9E3779B97F4A7C15U;
        return (mixed >> 32) & (_entries.size() - 1);
    }
    Number add(Name local, Name prefix);
    Entry& freeEntry(Name local, Name prefix) noexcept;

    std::vector<String>& _names;
    std::vector<Entry> _entries;
    std::size_t _count = 0;
    std::optional<Number> _noPrefix;
};

} // namespace qx
