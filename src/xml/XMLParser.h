#pragma once

// Parses a document into its text and an index over it. Most documents are read by the scanner
// (XMLScanner.h); whatever it refuses, faults included, is read by the C parser (SAXSession.h), so
// every error is that one's. Any thread may parse; nothing is shared.

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "xml/ParseFailure.h"
#include "xml/ParsedDocument.h"
#include "xml/XMLScanner.h"

#include <memory>

namespace qx {

class XMLParser {
public:
    // For tests that hold the two ways against each other.
    enum class Way : std::uint8_t { fastest, cParserOnly };
    using Parsed = std::shared_ptr<const ParsedDocument>;
    // What somebody who parses many documents keeps from one to the next; one thread uses it at a
    // time.
    using Kept = XMLScanner::Kept;

    // Both give null with an error for what is no well-formed XML, cannot be decoded, or exceeds a
    // limit. What is parsed holds the data, or a copy of the bytes: whoever lent them may be a
    // setter's host, which changes them while objects are read.
    static Parsed parse(Ref<const Data> data, const XMLParseOptions& options, Ref<Error>* error,
                        Kept* kept = nullptr);
    static Parsed parseCopy(XMLBytes bytes, const XMLParseOptions& options, Ref<Error>* error,
                            Kept* kept = nullptr, Way way = Way::fastest);
    // Of one piece of a document, which is UTF-8. Throws ParseFailure.
    static Parsed parsePiece(std::string text, const TextOrigin& origin,
                             const XMLParseOptions& options, Kept* kept);
    static Ref<Error> errorOf(const ParseFailure& failure, std::string_view text,
                              const TextOrigin& origin = {});

private:
    // Copies the bytes where they have no owner.
    static Parsed run(std::string_view bytes, Ref<const Data> owner, const XMLParseOptions& options,
                      Ref<Error>* error, Kept* kept, Way way);
    static void fill(XMLIndex& index, const XMLParseOptions& options, Kept* kept, Way way);
};

} // namespace qx
