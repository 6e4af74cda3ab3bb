#pragma once

// What the author of a document may have meant where a reading failed: the nearest name that the
// mapping has, the text that a value should have been. In a few words of English; null where there
// is nothing to say.

#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>

#include "xml/DocumentPlaces.h"

namespace qx::detail {

// What is known of the failure.
struct Failed {
    int code;
    const DocumentPlaces& places;
    DocumentPlaces::Number number;
    const QXXMLMarshallingMapping* mapping; // null for none, and so are the others
    const QXXMLFieldMapping* field;
    const QXXMLClassMapping* classOfField;
    const QXXMLClassMapping* classOfObject;
};

String suggestionFor(const Failed& failed);

} // namespace qx::detail
