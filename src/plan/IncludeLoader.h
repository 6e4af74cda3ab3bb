#pragma once

// Loads what a mapping document includes, and what that includes, through the shared repository
// manager.

#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>

#include "plan/MergedClasses.h"

class QXXMLDataRepositoryManager;

class IncludeLoader {
public:
    // Loads the includes and checks the classes, the document's own and those below it. False with
    // the error that QXXMLMarshallingMapping::initWithDocument names.
    bool load(QXXMLDocumentMapping& document, qx::Ref<qx::Error>* error);
    // What was loaded, in the order in which it is merged into the first document.
    const std::vector<qx::Ref<QXXMLDocumentMapping>>& included() const noexcept {
        return _included;
    }

private:
    bool loadIncludes(const QXXMLDocumentMapping& document, qx::Ref<qx::Error>* error);
    bool loadInclude(const QXXMLDataRepositoryManager& manager, const qx::String& href,
                     qx::Ref<qx::Error>* error);
    bool resolve(qx::XMLDocument* document, qx::Ref<qx::Error>* error);

    MergedClasses _classes;
    std::vector<qx::Ref<QXXMLDocumentMapping>> _included;
    std::vector<const qx::String*> _open; // the names of the documents that are being loaded
    std::size_t _count = 0;               // of the documents asked for
};
