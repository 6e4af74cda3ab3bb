#pragma once

// A mapping document resolved: read, merged with the documents that it includes, and indexed by
// class name and by element name. It never changes after construction and may be shared by
// marshallers on many threads.
//
//     auto mapping = QXXMLMarshallingMapping::initWithDocument(document.get(), &error);

#include <QXXMLMarshalling/QXXMLDocumentMapping.h>
#include <QXXMLMarshalling/QXXMLFinding.h>
#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <memory>

namespace qx::detail {
class ClassPlan;
class IncludeLoader;
class MappingPlan;
} // namespace qx::detail

// How a mapping is made.
struct QXXMLMappingOptions {
    // The folder where an included document is looked for last, when no repository has it; null for
    // nowhere. A name that leads out of the folder finds nothing there, as in the repositories.
    qx::String includeFolder = {};
    // Goes on behind a fault, to find all of them in one run: see faults().
    bool collectsFaults = false;
};

class QX_API QXXMLMarshallingMapping final : public qx::Object {
public:
    // Null with the error of the mapping document (see QXXMLDocumentMapping), of an included one,
    // or
    //   -205  "Class redefined: %@"
    //   -205  "Element redefined: %@ class: %@"
    //   -218  "Unable to load included file: %@"   (an include that leads back to itself too,
    //         includes more than 256 deep, and more than 10,000 of them)
    // What a repository raises when it is asked for a document passes through where this document
    // includes it, and becomes -218 where an included one does. Null, too, without reading anything
    // further when the slot holds an error already. A null document, like one without a root, holds
    // no class. The shared repository manager is made even without an include: for a user without
    // any home (no XDG_DATA_HOME, no HOME, none in the account) that raises
    // NSInternalInconsistencyException, "No application support directories found".
    static qx::Ref<QXXMLMarshallingMapping> initWithDocument(qx::XMLDocument* document,
                                                             qx::Ref<qx::Error>* error = nullptr);
    static qx::Ref<QXXMLMarshallingMapping> initWithDocument(qx::XMLDocument* document,
                                                             const QXXMLMappingOptions& options,
                                                             qx::Ref<qx::Error>* error = nullptr);
    // The same for a file, whose folder is the `includeFolder` unless the options say another.
    // Null, too, with the error of reading the file (XMLDocument.h).
    static qx::Ref<QXXMLMarshallingMapping>
    initWithContentsOfFile(const qx::String& path, qx::Ref<qx::Error>* error = nullptr);
    static qx::Ref<QXXMLMarshallingMapping>
    initWithContentsOfFile(const qx::String& path, const QXXMLMappingOptions& options,
                           qx::Ref<qx::Error>* error = nullptr);
    ~QXXMLMarshallingMapping() override;

    // The document given at construction.
    qx::XMLDocument* document() const noexcept { return _document.get(); }
    // The document mapping, with the class mappings of all included documents.
    QXXMLDocumentMapping* mapping() const noexcept { return _mapping.get(); }

    // All faults, in the order in which they were met; empty where faults were not collected. A
    // mapping that has any holds what is left without the faulty parts: it serves check(), and the
    // error slot has the first fault.
    const std::vector<QXXMLFinding>& faults() const noexcept { return _faults; }
    // What its author may not have wanted: faults(), and what reads or writes other than it looks.
    // In the order of the documents, each document's own before those of its includes. Classes that
    // the program has described are compared with those of the mapping.
    std::vector<QXXMLFinding> check() const;

    // Exact, case-sensitive look-ups; null where nothing is found. The element name is that of
    // "map-to", or the class name in lower case where there is none. A node is looked up under its
    // qualified name as written.
    QXXMLClassMapping* mappingForClassName(const qx::String& className) const;
    QXXMLClassMapping* mappingForElementName(const qx::String& elementName) const;
    QXXMLClassMapping* mappingForNode(const qx::XMLNode* node) const;

    // The steps of construction, in this order. A host has no need to call them: on a mapping that
    // stands they change nothing and return true.
    bool loadIncludedDocuments(qx::Ref<qx::Error>* error = nullptr);
    bool populateLookupCaches(qx::Ref<qx::Error>* error = nullptr);

protected:
    const qx::Class& describedClass() const override;

private:
    friend class qx::detail::MappingPlan;
    friend qx::Ref<QXXMLMarshallingMapping> qx::make<QXXMLMarshallingMapping>();

    QXXMLMarshallingMapping();
    bool init(qx::XMLDocument* document, const QXXMLMappingOptions& options,
              qx::Ref<qx::Error>* error);
    void endCollecting(qx::Ref<qx::Error>* error);
    QXXMLClassMapping* mappingOf(const qx::detail::ClassPlan* plan) const;

    qx::Ref<QXXMLDocumentMapping> _mapping;
    qx::Ref<qx::XMLDocument> _document;
    std::unique_ptr<qx::detail::IncludeLoader> _includes;
    std::vector<QXXMLFinding> _faults;
    std::unique_ptr<qx::detail::MappingPlan> _plan;
};
