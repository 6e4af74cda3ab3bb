#pragma once

// The names of a document that is scanned, each known by a number: a hash table.
//
//     _slots  | 0 | 2 | 0 | 1 | ...   by hash: a number plus one, 0 where free; open addressing, at
//                                     most half full
//     _names  | "b" | "a:b" | ...     its bytes, if it is short, and its last use as an attribute;
//                                     of a prefixed one the local name has an entry, too
//     _texts  | "b" | "a:b" | ...     for the index, interned where some code knows them
//
// 1. Numbers stay. A reference to a Name is good until the next name is looked up.
// 2. The hash's seed differs from process to process, so no document is known to fill one slot.
// 3. There are at most xmlLimits::names of them: a number fits into an entry.
// 4. Small documents have few names and mostly those of the one before: they can be kept from one
//    to the next. Without that, a document of 1 kB takes a sixth more instructions to read.

#include <QXXMLMarshalling/base/String.h>

#include "xml/ByteRuns.h"
#include "xml/XMLIndex.h"
#include "xml/XMLLimits.h"

#include <cstdint>
#include <optional>
#include <vector>

namespace qx {

class ScannedNames {
public:
    using Number = std::uint32_t;
    static constexpr Number none = UINT32_MAX;
    static_assert(xmlLimits::names < XMLIndex::mostNames);

    // Thrown for what is left to the C parser.
    struct Refused {};

    // What a name means as an attribute's.
    enum class Meaning : std::uint8_t { plain, space, defaultNamespace, prefixNamespace };
    struct Name {
        ShortName bytes; // of a long one what no short one has
        std::uint32_t size;
        std::uint32_t hash;
        Number number;
        std::uint32_t usedAt = 0; // the element that had it last as an attribute, see element()
        Number local = none;      // with a prefix: the number of the name behind the colon
        std::uint32_t localUsedAt = 0; // the element that had an attribute of this local name last
        Number follower;               // that came behind it last; itself, where none did
        Meaning meaning = Meaning::plain;
    };

    // No name is longer than the limit.
    explicit ScannedNames(std::size_t longest);

    // What is kept of one document for the next, if anything.
    using Kept = std::optional<ScannedNames>;
    // Those that were kept, if under the same limit; else new ones.
    static ScannedNames take(Kept& kept, std::size_t longest);
    // The texts by number, for the index. If they are few and short, the names are kept: of those
    // that no code knows each document has to find that out again. `element` was the document's
    // last.
    std::vector<String> finish(std::uint32_t element, Kept& kept);

    // Counts the elements of all documents: that of the latest one.
    std::uint32_t element() const noexcept { return _element; }

    Name& operator[](Number number) noexcept { return _names[number]; }
    std::string_view text(const Name& name) const noexcept { return _texts[name.number].view(); }

    // The name at that place of the text. A new one is looked at in full: throws Refused for what
    // is none, and beyond a limit.
    Name& find(const char* begin, std::size_t size) {
        return size <= ShortName::longest ? find(begin, size, ShortName::of(begin, size))
                                          : findLong({begin, size});
    }
    // The same of one whose bytes are at hand.
    Name& find(const char* begin, std::size_t size, const ShortName& bytes) {
        const std::uint32_t hash = hashOf(bytes);
        const std::size_t mask = _slots.size() - 1;
        for (std::size_t slot = hash & mask; _slots[slot] != 0; slot = (slot + 1) & mask) {
            Name& name = _names[_slots[slot] - 1];
            if (name.bytes == bytes)
                return name;
        }
        return add({begin, size}, bytes, hash);
    }
    // The one that came behind that name last, if it stands at that place again; null where it does
    // not. Names mostly follow each other as they did before.
    Name* follower(Number number, const char* at, const char* end) noexcept {
        Name& name = _names[_names[number].follower];
        const bool isThere = name.size <= ShortName::longest &&
                             name.bytes.standsAt(at, end, name.size) &&
                             !is(at[name.size], nameByte);
        return isThere ? &name : nullptr;
    }
    void setFollower(Number number, const Name& name) noexcept {
        _names[number].follower = name.number;
    }
    // The empty prefix, that of a default namespace.
    Number numberOfNoPrefix() { return find("", 0).number; }

    // The URI of each declaration counts as one more name. Throws Refused beyond the limit.
    void countURI();

private:
    static constexpr std::uint64_t mixed(std::uint64_t hash) noexcept {
        hash *= 0x9E3779B97F4A7C15U;
        return hash ^ hash >> 32U;
    }
    // The last word is mixed twice: once would leave the slot untouched by what only the last bytes
    // differ in, whatever the seed, and a document could have all its names meet in one.
    std::uint32_t hashOf(const ShortName& bytes) const noexcept {
        return static_cast<std::uint32_t>(mixed(mixed(mixed(_seed ^ bytes.lower) ^ bytes.upper)));
    }
    Name& findLong(std::string_view text);
    Name& add(std::string_view text, const ShortName& bytes, std::uint32_t hash);
    void takeApart(Name& name, std::string_view text);
    void fill(Number number);
    void grow();

    std::size_t _longest;
    std::uint32_t _seed;
    std::vector<Name> _names;
    std::vector<Number> _slots;
    std::vector<String> _texts;
    std::size_t _textSize = 0; // of all texts
    std::size_t _URIs = 0;     // of this document
    std::uint32_t _element = 0;
};

} // namespace qx
