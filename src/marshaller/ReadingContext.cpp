#include "marshaller/ReadingContext.h"

#include "mapping/MappingSource.h"
#include "marshaller/Suggestion.h"

namespace qx::detail {

namespace {

const QXXMLClassMapping* classOf(const ReadingSpot& spot) {
    if (spot.field != nullptr)
        if (const auto holder = spot.field->mapping->classMapping())
            return holder.get();
    return spot.classPlan != nullptr ? spot.classPlan->mapping : nullptr;
}

} // namespace

ReadingContext::ReadingContext(int code, IndexedXML& document,
                               const QXXMLMarshallingMapping* mapping, const ReadingSpot& spot)
    : _code(code), _places(document.places()), _number(spot.number), _mapping(mapping),
      _field(spot.field != nullptr ? spot.field->mapping : nullptr), _class(classOf(spot)),
      _object(spot.classPlan != nullptr ? spot.classPlan->mapping : nullptr) {}

void ReadingContext::tell(const Ref<Error>& error, IndexedXML& document,
                          const QXXMLMarshallingMapping* mapping, const ReadingSpot& spot) {
    if (error && !ErrorDetails::hasContext(*error))
        ErrorDetails::setContext(
            *error, std::make_unique<ReadingContext>(error->code(), document, mapping, spot));
}

String ReadingContext::suggestion() const {
    return suggestionFor(
        {_code, *_places, _number, _mapping.get(), _field.get(), _class.get(), _object.get()});
}

MappingNote ReadingContext::mapping() const {
    return MappingSource::noteOf(_field.get(), _class.get());
}

} // namespace qx::detail
