#pragma once

// The mapping document that nodes were read from: its name, and the include that led there. One is
// shared by all nodes of a document; it keeps those of the documents around it. It is set up while
// the mapping is made, and only read then.

#include <QXXMLMarshalling/QXXMLDocumentMapping.h>
#include <QXXMLMarshalling/QXXMLFinding.h>

#include "model/ErrorDetails.h"

namespace qx::detail {

class MappingSource final : public Object {
public:
    static MappingSource& of(const QXXMLMapping& node) { return *node._source; }
    static const XMLElement& elementOf(const QXXMLMapping& node) { return *node._element; }
    // Of an element that is to be read, by its document's name.
    static Ref<MappingSource> of(const XMLElement* element);
    // Of the document that the include of that number names.
    static Ref<MappingSource> included(const QXXMLDocumentMapping& includer, std::size_t number,
                                       const XMLDocument* document);

    // The document's nodes, which have this source. Where faults are collected, it is never null
    // and lacks what is faulty.
    Ref<QXXMLDocumentMapping> read(XMLElement* root, Ref<Error>* error);

    // What an error says of a field, or else of a class; null for none.
    static MappingNote noteOf(const QXXMLFieldMapping* field, const QXXMLClassMapping* type);

    const String& name() const noexcept { return _name; }
    // The places of the includes, the nearest first.
    std::vector<QXXMLMappingPlace> chain() const;

    // Faults are collected there from now on, until null is set. Documents that are included from
    // here inherit it.
    void collectFaults(std::vector<QXXMLFinding>* faults) noexcept { _faults = faults; }
    bool collectsFaults() const noexcept { return _faults != nullptr; }
    // The fault knows its place.
    void addFault(Ref<Error> fault) const;

    // Tells the error, if any, that it is about this element, unless it knows its place already.
    void locate(const Ref<Error>& error, const XMLElement& element) const;
    // Tells the error, if any, that it is about the document which the include names, or about the
    // include itself.
    static void locate(const Ref<Error>& error, const QXXMLDocumentMapping& includer,
                       std::size_t number);

protected:
    const Class& describedClass() const override;

private:
    class FaultContext;

    String _name;
    Ref<MappingSource> _includer; // null for the outermost document
    QXXMLMappingPlace _place;     // of the include
    std::vector<QXXMLFinding>* _faults = nullptr;
};

} // namespace qx::detail
