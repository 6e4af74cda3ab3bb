#pragma once

// The marshaller's table of namespaces, made of what the host has set and, where it asks for that,
// of what the class mappings declare.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "xml/NamespaceTable.h"

namespace qx::detail {

class NamespaceMatching {
public:
    // Null where names are matched as they are written.
    static const NamespaceTable* of(const QXXMLMarshaller& marshaller) noexcept {
        return marshaller._namespaces.get();
    }
    // The same, kept whatever the host does to the marshaller.
    static std::shared_ptr<const NamespaceTable> keptOf(const QXXMLMarshaller& marshaller) {
        return marshaller._namespaces;
    }
    // Makes the table; null with -225 where it would be none.
    static std::shared_ptr<const NamespaceTable>
    make(const QXXMLMarshaller::NamespacePrefixes& prefixes,
         const QXXMLMarshallingMapping* declaring, Ref<Error>* error);
};

} // namespace qx::detail
