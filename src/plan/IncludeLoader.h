#pragma once

// Loads what a mapping document includes, and what that includes, through the shared repository
// manager, and last from a folder. It keeps what it has loaded.

#include <QXXMLMarshalling/model/Error.h>
#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "plan/MergedClasses.h"

class QXXMLDataRepositoryManager;

namespace qx::detail {

class IncludeLoader {
public:
    // An include that nothing was found for.
    struct Missing {
        Ref<const QXXMLDocumentMapping> includer;
        std::size_t number; // among its includes
    };

    // A document that no repository has is looked for in `folder`, null for nowhere.
    explicit IncludeLoader(String folder) : _folder(std::move(folder)) {}

    // Loads the includes and checks the classes, the document's own and those below it. False with
    // the error that QXXMLMarshallingMapping::initWithDocument names; where faults are collected,
    // it goes on behind each.
    bool load(QXXMLDocumentMapping& document, Ref<Error>* error);
    // What was loaded, in the order in which it is merged into the first document.
    const std::vector<Ref<QXXMLDocumentMapping>>& included() const noexcept { return _included; }
    const std::vector<Missing>& missing() const noexcept { return _missing; }

private:
    bool loadWithIncludes(const QXXMLDocumentMapping& document, Ref<Error>* error);
    bool loadIncludes(const QXXMLDocumentMapping& document, Ref<Error>* error);
    // The include of that number in the includer.
    bool loadInclude(const QXXMLDataRepositoryManager& manager,
                     const QXXMLDocumentMapping& includer, std::size_t number, Ref<Error>* error);
    Ref<XMLDocument> find(const QXXMLDataRepositoryManager& manager, const String& href,
                          Ref<Error>* error) const;
    Ref<XMLDocument> findInFolder(const String& href, Ref<Error>* error) const;
    bool resolve(XMLDocument* document, const QXXMLDocumentMapping& includer, std::size_t number,
                 Ref<Error>* error);

    const String _folder;
    MergedClasses _classes;
    std::vector<Ref<QXXMLDocumentMapping>> _included;
    std::vector<Missing> _missing;
    std::vector<const String*> _open; // the names of the documents that are being loaded
    std::size_t _count = 0;           // of the documents asked for
};

} // namespace qx::detail
