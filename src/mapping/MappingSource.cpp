#include "mapping/MappingSource.h"

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "model/LibraryClass.h"

namespace qx::detail {

Ref<MappingSource> MappingSource::of(const XMLElement* element) {
    auto source = make<MappingSource>();
    const XMLDocument* const document = element != nullptr ? element->rootDocument() : nullptr;
    if (document != nullptr)
        source->_name = document->documentName();
    return source;
}

Ref<MappingSource> MappingSource::included(const QXXMLDocumentMapping& includer, std::size_t number,
                                           const XMLDocument* document) {
    auto source = make<MappingSource>();
    if (document != nullptr)
        source->_name = document->documentName();
    if (source->_name.isNull())
        source->_name = includer.includes()[number];
    source->_includer = Ref(&of(includer));
    source->_place = includer.includePlace(number);
    source->_faults = source->_includer->_faults;
    return source;
}

Ref<QXXMLDocumentMapping> MappingSource::read(XMLElement* root, Ref<Error>* error) {
    auto mapping = make<QXXMLDocumentMapping>();
    QXXMLMapping& node = *mapping;
    return node.readElement(root, error, Ref(this)) ? mapping : nullptr;
}

void MappingSource::addFault(Ref<Error> fault, const QXXMLMappingPlace& place) const {
    QXXMLFinding finding;
    finding.severity = QXXMLFinding::Severity::error;
    finding.kind = "fault";
    finding.text = fault->localizedDescription();
    finding.place = place;
    finding.includedFrom = chain();
    finding.fault = std::move(fault);
    _faults->push_back(std::move(finding));
}

std::vector<QXXMLMappingPlace> MappingSource::chain() const {
    std::vector<QXXMLMappingPlace> places;
    for (const MappingSource* at = this; at->_includer; at = at->_includer.get())
        places.push_back(at->_place);
    return places;
}

const Class& MappingSource::describedClass() const {
    return libraryClass<MappingSource>("qx::MappingSource");
}

} // namespace qx::detail
