#pragma once

// Parses a document into a tree. Most documents are read by the scanner (XMLScanner.h); whatever it
// refuses, faults included, is read by the C parser (SAXSession.h), so every error is that one's.
// Any thread may parse; nothing is shared.

#include <QXXMLMarshalling/xml/XMLDocument.h>

namespace qx {

class XMLIndex;

class XMLParser {
public:
    // For tests that hold the two ways against each other.
    enum class Way : std::uint8_t { fastest, cParserOnly };

    // Null with an error for what is no well-formed XML, cannot be decoded, or exceeds a limit.
    static Ref<XMLDocument> parse(XMLBytes bytes, const XMLParseOptions& options, Ref<Error>* error,
                                  Way way = Way::fastest);

private:
    static void build(const XMLIndex& index, XMLDocument& document, const XMLParseOptions& options);
};

} // namespace qx
