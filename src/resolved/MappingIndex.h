#pragma once

// Class mappings by name: the two look-up caches of a resolved mapping, and the chain of documents
// that are being loaded while it is made.

#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>

#include "resolved/MappingPlan.h"

struct QXXMLMarshallingMapping::Index {
    QXXMLClassMapping* find(const qx::String& name) const {
        const auto found = mappings.find(name);
        return found != mappings.end() ? found->second.get() : nullptr;
    }

    StringMap<qx::Ref<QXXMLClassMapping>> mappings;
};

// One included document that is being loaded, and those further up that led to it.
struct QXXMLMarshallingMapping::Loading {
    const qx::String& href;
    const Loading* parent;
    std::size_t depth;
    std::size_t& count; // of the documents loaded so far for one mapping
};
