#pragma once

// What an error of reading knows beside its texts: the entry of the document and the field or class
// of the mapping. Taken down where a reading fails, and worked out when somebody asks.

#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>

#include "model/ErrorDetails.h"
#include "plan/ClassPlan.h"
#include "xml/IndexedXML.h"

namespace qx::detail {

// Where a reading stands; what is not known is null or none.
struct ReadingSpot {
    IndexedXML::Number number = IndexedXML::none; // of an element, or of what stands in one
    const FieldPlan* field = nullptr;
    const ClassPlan* classPlan = nullptr; // of the object
};

class ReadingContext final : public ErrorContext {
public:
    // Of an error of that code.
    ReadingContext(int code, IndexedXML& document, const QXXMLMarshallingMapping* mapping,
                   const ReadingSpot& spot);
    // Tells the error in the slot, which knows no place of its own yet.
    static void tell(const Ref<Error>& error, IndexedXML& document,
                     const QXXMLMarshallingMapping* mapping, const ReadingSpot& spot);

    SourcePlace source() const override { return _places->placeOf(_number); }
    MappingNote mapping() const override;
    String suggestion() const override;
    IndexedXML::Number order() const { return _places->orderOf(_number); }

private:
    const int _code;
    const std::shared_ptr<const DocumentPlaces> _places;
    const IndexedXML::Number _number;
    const Ref<const QXXMLMarshallingMapping> _mapping;
    const Ref<const QXXMLFieldMapping> _field;
    const Ref<const QXXMLClassMapping> _class;  // that has the field, or is alone concerned
    const Ref<const QXXMLClassMapping> _object; // that of the object
};

} // namespace qx::detail
