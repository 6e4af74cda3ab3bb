// Which prefixes the names of a mapping have for which namespaces.

#include "host/Log.h"
#include "marshaller/NamespaceMatching.h"
#include "model/Errors.h"
#include "xml/XMLCharacters.h"

using qx::Error;
using qx::NamespaceTable;
using qx::Ref;
using qx::String;
using qx::detail::NamespaceMatching;

namespace qx::detail {

namespace {

// The prefix "xml" belongs to one namespace only, "xmlns" to none.
bool isPrefix(const String& prefix, const String& URI) {
    const bool isXML = prefix == "xml";
    return prefix.isEmpty() || (isXMLName(prefix.view()) && prefix != "xmlns" &&
                                prefix.view().find(':') == std::string_view::npos &&
                                isXML == (URI == NamespaceTable::xmlURI));
}

bool add(NamespaceTable& table, const String& URI, const String& prefix, Ref<Error>* error) {
    if (URI.isEmpty() || !isPrefix(prefix, URI))
        return fail(error, errors::noNamespacePrefix, prefix, URI);
    if (const String* const other = table.URIOf(prefix))
        return fail(error, errors::prefixOfTwoNamespaces, prefix, *other, URI);
    table.add(URI, prefix);
    return true;
}

} // namespace

std::shared_ptr<const NamespaceTable>
NamespaceMatching::make(const QXXMLMarshaller::NamespacePrefixes& prefixes,
                        const QXXMLMarshallingMapping* declaring, Ref<Error>* error) {
    auto table = std::make_shared<NamespaceTable>();
    for (const auto& [URI, prefix] : prefixes)
        if (!add(*table, URI, prefix.isNull() ? String("") : prefix, error))
            return nullptr;
    if (declaring == nullptr)
        return table;
    for (const auto& mapping : declaring->mapping()->classMappings()) {
        const String& URI = mapping->nsURI();
        const String prefix = mapping->nsPrefix().isNull() ? String("") : mapping->nsPrefix();
        if (URI.isEmpty() || prefixes.contains(URI))
            continue;
        if (const String* const known = table->prefixOf(URI); known == nullptr) {
            if (!add(*table, URI, prefix, error))
                return nullptr;
        } else if (*known != prefix) {
            fail(error, errors::namespaceOfTwoPrefixes, URI, *known, prefix);
            return nullptr;
        }
    }
    return table;
}

} // namespace qx::detail

bool QXXMLMarshaller::setNamespacePrefixes(NamespacePrefixes prefixes, Ref<Error>* error) {
    return matchNamespaces(std::move(prefixes), _matchesNamespaces, error);
}

bool QXXMLMarshaller::setMatchesNamespaces(bool matches, Ref<Error>* error) {
    return matchNamespaces(_namespacePrefixes, matches, error);
}

bool QXXMLMarshaller::matchNamespaces(NamespacePrefixes prefixes, bool matches, Ref<Error>* error) {
    Ref<Error> problem;
    auto table = NamespaceMatching::make(prefixes, matches ? _mapping.get() : nullptr, &problem);
    if (!table) {
        if (error != nullptr)
            *error = std::move(problem);
        else
            qx::logWarningOrLine("%@", problem->localizedDescription());
        return false;
    }
    _namespaces = table->isEmpty() ? nullptr : std::move(table);
    _namespacePrefixes = std::move(prefixes);
    _matchesNamespaces = matches;
    return true;
}
