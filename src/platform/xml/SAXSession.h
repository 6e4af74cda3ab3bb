#pragma once

// One run of the C parser over one document's text, from its first callback to its last. It
// translates callbacks for the tree builder and keeps the first failure; after that one it ignores
// whatever still comes.

#include "platform/xml/ParseFailure.h"
#include "platform/xml/TextPosition.h"
#include "platform/xml/XMLNames.h"
#include "platform/xml/XMLTreeBuilder.h"

#include <exception>
#include <libxml/parser.h>
#include <memory>
#include <optional>

namespace qx {

class SAXSession {
public:
    // The text must outlive the session; a zero byte follows it.
    SAXSession(std::string_view text, XMLDocument& document, const XMLParseOptions& options);
    ~SAXSession();
    SAXSession(const SAXSession&) = delete;
    SAXSession& operator=(const SAXSession&) = delete;

    // Throws what a callback threw, and std::bad_alloc; throws ParseFailure, whose offset is set,
    // for a document that cannot be read.
    void run();

private:
    // Called by the C parser, each with a session as its first argument.
    struct Callbacks;

    void pushInput();
    void startDocument();
    void startElement(XMLNames::Name local, XMLNames::Name prefix, int namespaceCount,
                      const xmlChar** namespaces, int attributeCount, int defaultedCount,
                      const xmlChar** attributes);
    void endElement();
    void addText(std::string_view piece);
    xmlEntityPtr entity(const xmlChar* name);
    xmlEntityPtr parameterEntity(const xmlChar* name);
    void countDeclaration();
    void countAttributeDefault();
    void countDefaulted(int namespaceCount, const xmlChar** namespaces, int defaultedCount,
                        const xmlChar** defaulted);
    void report(const xmlError& error);

    // Counts bytes that the document brings in without holding them.
    void countExpansion(std::size_t bytes);
    // Where the C parser stands in the text; behind the reference while it reads an entity.
    std::size_t offset() const noexcept;
    bool isInsideReference() const noexcept;
    bool hasFailed() const noexcept { return _failure || _exception; }
    void stop(ParseFailure failure) noexcept;

    struct ContextDeleter {
        void operator()(xmlParserCtxt* context) const noexcept;
    };

    std::string_view _text;
    XMLDocument& _document;
    XMLTreeBuilder _builder;
    XMLNames _names;
    TextPosition _position;
    std::unique_ptr<xmlParserCtxt, ContextDeleter> _context;
    const xmlChar* _space;                       // the name "space", as the C parser keeps it
    const xmlChar* _xml;                         // likewise
    std::size_t _tagOffset = ParseFailure::here; // of the start tag that is being reported
    std::size_t _expanded = 0;
    std::size_t _declarations = 0;
    std::size_t _attributeDefaults = 0;
    std::optional<ParseFailure> _failure;
    std::exception_ptr _exception;
};

} // namespace qx
