#pragma once

// Parses a document into its text and an index over it. Most documents are read by the scanner
// (XMLScanner.h); whatever it refuses, faults included, is read by the C parser (SAXSession.h), so
// every error is that one's. Any thread may parse; nothing is shared.

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "xml/ParsedDocument.h"

#include <memory>

namespace qx {

class XMLParser {
public:
    // For tests that hold the two ways against each other.
    enum class Way : std::uint8_t { fastest, cParserOnly };
    using Parsed = std::shared_ptr<const ParsedDocument>;

    // All give null with an error for what is no well-formed XML, cannot be decoded, or exceeds a
    // limit. Lent bytes must outlive what was parsed of them.
    static Parsed parseLent(XMLBytes bytes, const XMLParseOptions& options, Ref<Error>* error);
    static Parsed parse(Ref<const Data> data, const XMLParseOptions& options, Ref<Error>* error);
    // Has a text of its own.
    static Parsed parseCopy(XMLBytes bytes, const XMLParseOptions& options, Ref<Error>* error,
                            Way way = Way::fastest);

private:
    enum class Text : std::uint8_t { lent, copied };
    static std::shared_ptr<ParsedDocument>
    run(XMLBytes bytes, Text text, const XMLParseOptions& options, Ref<Error>* error, Way way);
};

} // namespace qx
