#include "xml/MatchedNames.h"

#include "base/KnownName.h"

namespace qx {

MatchedNames::MatchedNames(const XMLIndex& index, Number root, std::span<const Declaration> around,
                           const NamespaceTable& table, std::vector<String>& names)
    : _index(index), _table(table), _names(names), _parts(names.size()) {
    const auto entries = index.entries();
    _numbers.reserve(entries.size());
    for (const XMLIndexEntry& entry : entries)
        _numbers.push_back(entry.name());
    idOf(_prefixIds, _prefixes, "");
    idOf(_URIIds, _URIs, "");
    declare("", "");
    declare("xml", NamespaceTable::xmlURI);
    for (const auto& [prefix, URI] : around)
        declare(prefix, URI);
    walk(root);
}

void MatchedNames::walk(Number root) {
    std::vector<Open> open{enter(root)};
    while (!open.empty()) {
        Open& inner = open.back();
        if (inner.at == inner.end) {
            leave(inner);
            open.pop_back();
            continue;
        }
        const Number at = std::exchange(inner.at, _index.siblingOf(inner.at));
        if (_index[at].nodeKind() == XMLNodeKind::element)
            open.push_back(enter(at));
    }
}

// An element's own declarations are in force for its name, too.
MatchedNames::Open MatchedNames::enter(Number element) {
    const Open open{_index.firstChild(element), _index.contentEnd(element), _undo.size()};
    const Number begin = _index.content(element);
    for (Number at = begin; at < open.at; ++at)
        if (_index[at].nodeKind() == XMLNodeKind::namespaceDeclaration)
            declare(_names[_index[at].name()], String(_index.value(_index[at], _room)));
    match(element, false);
    for (Number at = begin; at < open.at; ++at)
        if (_index[at].nodeKind() == XMLNodeKind::attribute)
            match(at, true);
    return open;
}

void MatchedNames::leave(const Open& open) {
    for (; _undo.size() > open.declared; _undo.pop_back())
        _inForce[_undo.back().prefix] = _undo.back().URI;
}

void MatchedNames::declare(const String& prefix, const String& URI) {
    const Id id = idOf(_prefixIds, _prefixes, prefix);
    _undo.push_back({id, std::exchange(_inForce[id], idOf(_URIIds, _URIs, URI))});
}

MatchedNames::Id MatchedNames::idOf(std::unordered_map<String, Id>& ids, std::vector<String>& texts,
                                    const String& text) {
    const auto [at, isNew] = ids.try_emplace(text, static_cast<Id>(texts.size()));
    if (isNew)
        texts.push_back(text);
    _inForce.resize(_prefixes.size());
    return at->second;
}

void MatchedNames::match(Number entry, bool isAttribute) {
    const std::uint32_t name = _index[entry].name();
    const Parts& parts = partsOf(name);
    if (!isAttribute || parts.prefix != 0)
        _numbers[entry] = numberFor(name, _inForce[parts.prefix], isAttribute);
}

MatchedNames::Parts& MatchedNames::partsOf(std::uint32_t name) {
    Parts& parts = _parts[name];
    if (parts.isKnown)
        return parts;
    const std::string_view text = _names[name].view();
    const std::size_t colon = text.find(':');
    parts.isKnown = true;
    if (colon == std::string_view::npos || colon == 0)
        return parts;
    parts.prefix = idOf(_prefixIds, _prefixes, String(text.substr(0, colon)));
    parts.local = static_cast<std::uint32_t>(colon + 1);
    return parts;
}

// Most elements of a name are in the same namespace: the latest one of a name is at hand.
std::uint32_t MatchedNames::numberFor(std::uint32_t name, Id URI, bool isAttribute) {
    const std::size_t kind = isAttribute ? 1 : 0;
    Parts& parts = _parts[name];
    if (!parts.isLatest[kind] || parts.latestURI[kind] != URI) {
        const auto [known, isNew] =
            _known[kind].try_emplace(std::uint64_t{name} << 32U | URI, std::uint32_t{0});
        if (isNew)
            known->second = newNumber(name, parts, URI, isAttribute);
        parts.isLatest[kind] = true;
        parts.latestURI[kind] = URI;
        parts.latest[kind] = known->second;
    }
    return parts.latest[kind];
}

std::uint32_t MatchedNames::newNumber(std::uint32_t name, const Parts& parts, Id URI,
                                      bool isAttribute) {
    const String written = _names[name];
    const String& prefix = _prefixes[parts.prefix];
    const std::string_view local = written.view().substr(parts.local);
    const String* const matched = URI != 0 ? _table.prefixOf(_URIs[URI]) : nullptr;
    const bool isForeign =
        matched == nullptr && _table.URIOf(prefix) != nullptr && (URI != 0 || parts.prefix == 0);
    // The namespace by number: one long URI would be part of many names.
    if (isForeign || (matched != nullptr && matched->isEmpty() && isAttribute))
        return numberOf(String::concat({"{", std::to_string(URI), "}", local}).view());
    if (matched == nullptr || *matched == prefix)
        return name;
    return numberOf(matched->isEmpty() ? local : String::concat({*matched, ":", local}).view());
}

std::uint32_t MatchedNames::numberOf(std::string_view text) {
    const auto [at, isNew] =
        _made.try_emplace(knownName(text), static_cast<std::uint32_t>(_names.size()));
    if (isNew)
        _names.push_back(at->first);
    return at->second;
}

} // namespace qx
