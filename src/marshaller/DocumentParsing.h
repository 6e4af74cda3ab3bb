#pragma once

// What reading and writing in one step share.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include <algorithm>

namespace qx::detail {

// Their slots serve many calls.
inline void reset(Ref<Error>* error) {
    if (error != nullptr)
        error->reset();
}

// How a marshaller parses a document. What it writes is meant to be read so, too.
inline XMLParseOptions parsingOf(const QXXMLMarshaller& marshaller) {
    XMLParseOptions options = marshaller.parseOptions();
    // An object may stand in a wrapper, and hold a last element with text.
    options.maximumDepth = std::max(options.maximumDepth, 2 * marshaller.maximumDepth() + 1);
    return options;
}

} // namespace qx::detail
