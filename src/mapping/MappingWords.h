#pragma once

// The names of a mapping document's elements and attributes, interned once.

#include <QXXMLMarshalling/base/Key.h>

namespace qx::detail {

struct MappingWords {
    // Of elements.
    const Key altXML{"alt-xml"};
    const Key bindXML{"bind-xml"};
    const Key classes{"class"};
    const Key description{"description"};
    const Key field{"field"};
    const Key include{"include"};
    const Key mapTo{"map-to"};

    // Of attributes.
    const Key autoComplete{"auto-complete"};
    const Key autoNaming{"auto-naming"};
    const Key collection{"collection"};
    const Key container{"container"};
    const Key createMethod{"create-method"};
    const Key direct{"direct"};
    const Key extends{"extends"};
    const Key getMethod{"get-method"};
    const Key handler{"handler"};
    const Key href{"href"};
    const Key lazy{"lazy"};
    const Key location{"location"};
    const Key matches{"matches"};
    const Key name{"name"};
    const Key node{"node"};
    const Key nsPrefix{"ns-prefix"};
    const Key nsURI{"ns-uri"};
    const Key qNamePrefix{"QName-prefix"};
    const Key references{"references"};
    const Key required{"required"};
    const Key selfFirst{"self-first"};
    const Key setMethod{"set-method"};
    const Key transient{"transient"};
    const Key type{"type"};
    const Key xml{"xml"};
};

inline const MappingWords& mappingWords() {
    static const MappingWords words;
    return words;
}

} // namespace qx::detail
