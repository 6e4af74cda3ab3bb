#pragma once

// Which prefix stands for which namespace in the names of a mapping, whatever a document has for
// it. No prefix stands for two namespaces, and no namespace has two. Immutable once it is used.

#include <QXXMLMarshalling/base/String.h>

#include <unordered_map>

namespace qx {

class NamespaceTable {
public:
    static constexpr const char* xmlURI = "http://www.w3.org/XML/1998/namespace";

    // Null where there is none. The empty prefix stands for names without one.
    const String* prefixOf(const String& URI) const { return find(_prefixes, URI); }
    const String* URIOf(const String& prefix) const { return find(_URIs, prefix); }
    bool isEmpty() const noexcept { return _prefixes.empty(); }

    // Neither may be in the table.
    void add(const String& URI, const String& prefix) {
        _prefixes.emplace(URI, prefix);
        _URIs.emplace(prefix, URI);
    }

private:
    using Texts = std::unordered_map<String, String>;
    static const String* find(const Texts& texts, const String& key) {
        const auto found = texts.find(key);
        return found != texts.end() ? &found->second : nullptr;
    }

    Texts _prefixes; // by URI
    Texts _URIs;     // by prefix
};

} // namespace qx
