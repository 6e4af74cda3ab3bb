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

void MappingSource::setIncluder(Ref<MappingSource> includer, const QXXMLMappingPlace& place) {
    _includer = std::move(includer);
    _place = place;
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
