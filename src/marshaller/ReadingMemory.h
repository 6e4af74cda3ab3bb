#pragma once

// What a marshaller keeps from one reading to the next, which mostly reads documents of the same
// kind. Small documents take as long to begin with as to read without it.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "xml/XMLParser.h"

namespace qx::detail {

class ReadingMemory {
public:
    static ReadingMemory& of(QXXMLMarshaller& marshaller) {
        if (!marshaller._memory)
            marshaller._memory = std::make_shared<ReadingMemory>();
        return *marshaller._memory;
    }

    XMLParser::Names names;
};

} // namespace qx::detail
