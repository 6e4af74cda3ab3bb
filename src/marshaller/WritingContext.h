#pragma once

// What an error of writing knows beside its texts: the keys that lead to the value from the object
// that was to be written, and the field or class of the mapping. It is put together while the error
// is passed up, so that writing itself keeps no path.

#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>

#include "model/ErrorDetails.h"

namespace qx::detail {

class WritingContext final : public ErrorContext {
public:
    // Tells the error, which knows no field or class yet, that it is about these; null for none.
    static void tell(const Ref<Error>& error, const QXXMLMarshallingMapping* mapping,
                     const QXXMLFieldMapping* field, const QXXMLClassMapping* type);
    // Tells it that what it is about stands under that key, or is that item.
    static void tellKey(const Ref<Error>& error, std::string_view key);
    static void tellItem(const Ref<Error>& error, std::size_t number);

    SourcePlace source() const override;
    MappingNote mapping() const override;
    String suggestion() const override;

private:
    static void addStep(const Ref<Error>& error, std::string_view step);

    int _code = 0;
    String _path;
    std::size_t _steps = 0;
    Ref<const QXXMLMarshallingMapping> _mapping;
    Ref<const QXXMLFieldMapping> _field;
    Ref<const QXXMLClassMapping> _class; // that has the field, or is alone concerned
};

} // namespace qx::detail
