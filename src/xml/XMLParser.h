#pragma once

// Parses a document into a tree. The C parser reports to it through its SAX interface and builds no
// tree of its own. It reads nothing but the bytes that it is given, sets nothing global, and lets
// no exception through the C parser's frames: one is caught, the parser stopped, and the exception
// thrown again when its last frame is gone. Any thread may parse; nothing is shared.

#include <QXXMLMarshalling/xml/XMLDocument.h>

namespace qx {

class XMLParser {
public:
    // Null with an error for what is no well-formed XML, cannot be decoded, or exceeds a limit.
    static Ref<XMLDocument> parse(XMLBytes bytes, const XMLParseOptions& options,
                                  Ref<Error>* error);
};

} // namespace qx
