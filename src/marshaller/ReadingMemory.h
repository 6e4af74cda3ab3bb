#pragma once

// What a marshaller keeps from one reading to the next, which mostly reads documents of the same
// kind. Without it, a document of 1 kB takes a third more instructions to read.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "marshaller/ClassUses.h"
#include "xml/XMLParser.h"

namespace qx::detail {

class ReadingMemory {
public:
    static ReadingMemory& of(QXXMLMarshaller& marshaller) {
        if (!marshaller._memory)
            marshaller._memory = std::make_shared<ReadingMemory>();
        return *marshaller._memory;
    }

    XMLParser::Kept parsing;

    // A reading holds them to its end: one that begins inside it may replace them here.
    std::shared_ptr<ClassUses> classUses(const Ref<const QXXMLMarshallingMapping>& mapping) {
        if (!_classUses || !_classUses->holdFor(mapping.get()))
            _classUses = std::make_shared<ClassUses>(mapping);
        _classUses->beginReading();
        return _classUses;
    }

private:
    std::shared_ptr<ClassUses> _classUses;
};

} // namespace qx::detail
