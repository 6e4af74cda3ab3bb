#pragma once

// Loads what a mapping document includes, and what that includes, through the shared repository
// manager.

#include <QXXMLMarshalling/model/Error.h>
#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "plan/MergedClasses.h"

class QXXMLDataRepositoryManager;

namespace qx::detail {

class IncludeLoader {
public:
    // Loads the includes and checks the classes, the document's own and those below it. False with
    // the error that QXXMLMarshallingMapping::initWithDocument names.
    bool load(QXXMLDocumentMapping& document, Ref<Error>* error);
    // What was loaded, in the order in which it is merged into the first document.
    const std::vector<Ref<QXXMLDocumentMapping>>& included() const noexcept { return _included; }

private:
    bool loadIncludes(const QXXMLDocumentMapping& document, Ref<Error>* error);
    // The include of that number in the includer.
    bool loadInclude(const QXXMLDataRepositoryManager& manager,
                     const QXXMLDocumentMapping& includer, std::size_t number, Ref<Error>* error);
    bool resolve(XMLDocument* document, const QXXMLDocumentMapping& includer, std::size_t number,
                 Ref<Error>* error);

    MergedClasses _classes;
    std::vector<Ref<QXXMLDocumentMapping>> _included;
    std::vector<const String*> _open; // the names of the documents that are being loaded
    std::size_t _count = 0;           // of the documents asked for
};

} // namespace qx::detail
