#pragma once

// One run of the C parser over one document's text, from its first callback to its last. It
// translates callbacks for the index builder and keeps the first failure: with that one the parser
// is stopped, and what still comes is ignored. The parser's own limits, which differ among its
// versions, are off; those of the builder, of EntityTexts and of InternalSubset hold instead.

#include "xml/EntityTexts.h"
#include "xml/InternalSubset.h"
#include "xml/ParseFailure.h"
#include "xml/XMLIndexBuilder.h"

#include <exception>
#include <libxml/parser.h>
#include <memory>
#include <optional>
#include <unordered_set>

namespace qx {

class SAXSession {
public:
    // Fills the index, which is empty, from its text; a zero byte follows that.
    SAXSession(XMLIndex& index, const XMLParseOptions& options);
    ~SAXSession();
    SAXSession(const SAXSession&) = delete;
    SAXSession& operator=(const SAXSession&) = delete;

    // Throws what a callback threw, and std::bad_alloc; throws ParseFailure, whose offset is set,
    // for a document that cannot be read.
    void run();

private:
    // Called by the C parser, each with a session as its first argument.
    struct Callbacks;

    // Makes the session hear of the parser's errors on this thread, as long as it stands: of its
    // channels the thread's alone has the same user data for every error, and hears that memory
    // lacks where no context is at hand. What the host has set is put back.
    class ErrorChannel {
    public:
        explicit ErrorChannel(SAXSession& session);
        ~ErrorChannel();
        ErrorChannel(const ErrorChannel&) = delete;
        ErrorChannel& operator=(const ErrorChannel&) = delete;

    private:
        xmlStructuredErrorFunc _function;
        void* _user;
    };

    void pushInput();
    void setLine(xmlParserInput& input, std::size_t addedTags);
    void startDocument();
    void startSubset(const xmlChar* name, const xmlChar* publicID, const xmlChar* systemID);
    void endSubset();
    void startElement(XMLNames::Name local, XMLNames::Name prefix, int namespaceCount,
                      const xmlChar** namespaces, int attributeCount, int defaultedCount,
                      const xmlChar** attributes);
    void addText(std::string_view piece);
    void addCDATA(std::string_view piece);
    void declareEntity(const xmlChar* name, int type, const xmlChar* publicID,
                       const xmlChar* systemID, const xmlChar* content);
    xmlEntityPtr entity(const xmlChar* name);
    xmlEntityPtr parameterEntity(const xmlChar* name);
    xmlEntityPtr emptyEntity();
    bool isJustDeclared(const xmlChar* name) noexcept;
    void declareAttribute(std::string_view element, std::string_view name,
                          const xmlChar* defaultValue);
    void provide(std::string_view name);
    void countDefaulted(int namespaceCount, const xmlChar** namespaces, int defaultedCount,
                        const xmlChar** defaulted);
    void report(const xmlError& error);

    // Counts bytes that the document brings in without holding them.
    void countExpansion(std::size_t bytes);
    // Where the C parser stands in the text; behind the reference while it reads an entity.
    std::size_t offset() const noexcept;
    bool isInsideReference() const noexcept;
    bool hasFailed() const noexcept { return _failure || _exception || _lacksMemory; }
    void stop(ParseFailure failure) noexcept;
    void stop() noexcept;

    struct ContextDeleter {
        void operator()(xmlParserCtxt* context) const noexcept;
    };

    std::string_view _text;
    const TextOrigin _origin;
    std::size_t _addedTags = 0; // seen so far
    const bool _refusesDoctype;
    XMLIndexBuilder _builder;
    XMLNames& _names;
    InternalSubset _subset;
    EntityTexts _texts;
    std::unique_ptr<xmlParserCtxt, ContextDeleter> _context;
    const xmlChar* _space;                       // the name "space", as the C parser keeps it
    const xmlChar* _xml;                         // likewise
    std::size_t _tagOffset = ParseFailure::here; // of the start tag that is being reported
    std::size_t _expanded = 0;
    std::size_t _attributeDefaults = 0;
    std::unordered_set<std::string> _attributes; // those declared, with their elements
    const xmlChar* _justDeclared = nullptr; // the entity that the parser still looks up for itself
    // From the first parameter entity on that is not read, declarations may not be the ones that
    // count.
    bool _hasUnread = false;
    std::unordered_set<const xmlEntity*> _uncertain; // declared behind it
    bool _lacksMemory = false;
    std::optional<ParseFailure> _failure;
    std::exception_ptr _exception;
    ErrorChannel _channel; // the last: it uses what stands above
};

} // namespace qx
