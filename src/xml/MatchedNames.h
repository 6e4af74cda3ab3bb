#pragma once

// The names that the elements and attributes of an index are matched by, where they are matched by
// namespace. They are worked out in one pass over the index, in time linear in its size: an
// entry's name is found by the name as written and the namespace that its prefix stands for.
//
//     namespace           prefix as written     name to match by
//     in the table        whatever              that of the table : local name
//     none                declared nowhere      as written
//     another, or none    in the table          {number}local name, which is no mapping's
//     another, or none    not in the table      as written
//
// So names of two namespaces never are the same, if one of them is in the table. An attribute
// without a prefix is in no namespace; it is matched as written. One whose namespace has the empty
// prefix in the table has no name to be matched by, for that would be another attribute's.

#include "xml/NamespaceTable.h"
#include "xml/XMLIndex.h"

#include <span>
#include <unordered_map>
#include <utility>
#include <vector>

namespace qx {

class MatchedNames {
public:
    using Number = XMLIndex::Number;               // of an entry
    using Declaration = std::pair<String, String>; // a prefix and its URI

    // Of everything inside the element, itself included, and its attributes. `around` are the
    // declarations that are in force there, outermost first. `names` are those of the index; those
    // that are made come behind them.
    MatchedNames(const XMLIndex& index, Number root, std::span<const Declaration> around,
                 const NamespaceTable& table, std::vector<String>& names);

    // The number of each entry's name, which is an entry's own one where it is not matched.
    std::vector<std::uint32_t> takeNumbers() { return std::move(_numbers); }

private:
    using Id = std::uint32_t; // of a prefix or a URI; 0 for the empty one
    // What a name is made of.
    struct Parts {
        Id prefix = 0;
        std::uint32_t local = 0; // where it begins
        bool isKnown = false;
        bool isLatest[2] = {}; // of elements and of attributes: the namespace that came last
        Id latestURI[2] = {};
        std::uint32_t latest[2] = {};
    };
    struct Undo {
        Id prefix;
        Id URI;
    };
    struct Open {
        Number at;
        Number end;
        std::size_t declared; // how long the list of what is to be undone was
    };

    void walk(Number root);
    Open enter(Number element);
    void leave(const Open& open);
    void declare(const String& prefix, const String& URI);
    void match(Number entry, bool isAttribute);
    Parts& partsOf(std::uint32_t name);
    std::uint32_t numberFor(std::uint32_t name, Id URI, bool isAttribute);
    std::uint32_t newNumber(std::uint32_t name, const Parts& parts, Id URI, bool isAttribute);
    std::uint32_t numberOf(std::string_view text);
    Id idOf(std::unordered_map<String, Id>& ids, std::vector<String>& texts, const String& text);

    const XMLIndex& _index;
    const NamespaceTable& _table;
    std::vector<String>& _names;
    std::vector<std::uint32_t> _numbers;
    std::vector<Parts> _parts; // by the number of a name of the index
    std::unordered_map<String, Id> _prefixIds, _URIIds;
    std::vector<String> _prefixes, _URIs; // by id
    std::vector<Id> _inForce;             // by prefix: the URI
    std::vector<Undo> _undo;
    std::unordered_map<std::uint64_t, std::uint32_t> _known[2]; // by name and URI
    std::unordered_map<String, std::uint32_t> _made;
    std::string _room;
};

} // namespace qx
