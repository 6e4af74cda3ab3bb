#pragma once

// What a marshaller keeps from one call to the next: its documents and objects mostly are of the
// same kind. Without it, a document of 1 kB takes a third more instructions to read.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "marshaller/ClassUses.h"
#include "xml/XMLParser.h"

namespace qx::detail {

class MarshallerMemory {
public:
    static MarshallerMemory& of(const QXXMLMarshaller& marshaller) {
        if (!marshaller._memory)
            marshaller._memory = std::make_shared<MarshallerMemory>();
        return *marshaller._memory;
    }

    XMLParser::Kept parsing;

    // A call holds them to its end: one that begins inside it may replace them here.
    std::shared_ptr<ClassUses> classUses(const Ref<const QXXMLMarshallingMapping>& mapping) {
        if (!_classUses || !_classUses->holdFor(mapping.get()))
            _classUses = std::make_shared<ClassUses>(mapping);
        return _classUses;
    }

private:
    std::shared_ptr<ClassUses> _classUses;
};

} // namespace qx::detail
