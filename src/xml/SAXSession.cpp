#include "xml/SAXSession.h"

#include "xml/CParserText.h"
#include "xml/XMLCharacters.h"
#include "xml/XMLLimits.h"

#include <algorithm>
#include <climits>
#include <libxml/SAX2.h>
#include <libxml/parserInternals.h>
#include <mutex>
#include <new>

namespace qx {

namespace {

std::uintptr_t addressOf(const void* place) { return reinterpret_cast<std::uintptr_t>(place); }

// What the parser says, on one line.
ParseFailure failureOf(const xmlError& error, std::size_t offset) {
    std::string message(withoutTrailingWhite(error.message != nullptr ? error.message : ""));
    std::replace(message.begin(), message.end(), '\n', ' ');
    return {error.code, message, offset};
}

// Older parsers without memory for the URI of a namespace say that it is empty.
bool hidesMemory([[maybe_unused]] const xmlError& error) {
#if LIBXML_VERSION < 21200
    if (error.code != XML_NS_ERR_XML_NAMESPACE || error.str1 == nullptr || error.ctxt == nullptr)
        return false;
    const xmlParserInput& input = *static_cast<xmlParserCtxt*>(error.ctxt)->input;
    const std::string_view read = viewOf(input.base, input.cur);
    if (read.size() < 2)
        return false;
    // The parser stands behind the closing quote.
    const std::size_t opening = read.rfind(read.back(), read.size() - 2);
    const std::string_view value = read.substr(opening + 1, read.size() - opening - 2);
    return !isWhite(value) && value.find('&') == std::string_view::npos;
#else
    return false;
#endif
}

// The parser keeps some state for each thread, and does not survive when it cannot.
void requireThreadState() {
#if LIBXML_VERSION >= 21200
    const bool isThere = xmlCheckThreadLocalStorage() == 0;
#else
    const bool isThere = xmlGetGlobalState() != nullptr;
#endif
    if (!isThere)
        throw std::bad_alloc();
}

} // namespace

// The C parser's side. No exception leaves one of these; entity declarations go into the parser's
// own table, where its look-ups expect them.
struct SAXSession::Callbacks {
    static SAXSession& session(void* user) { return *static_cast<SAXSession*>(user); }

    template <class Body>
    static void guarded(void* user, Body body) noexcept {
        SAXSession& self = session(user);
        if (self.hasFailed())
            return;
        try {
            body(self);
        } catch (ParseFailure& failure) {
            self.stop(std::move(failure));
        } catch (...) {
            self._exception = std::current_exception();
            self.stop();
        }
    }

    static void startDocument(void* user) {
        guarded(user, [](SAXSession& self) { self.startDocument(); });
    }
    static void internalSubset(void* user, const xmlChar* name, const xmlChar* publicID,
                               const xmlChar* systemID) {
        guarded(user, [&](SAXSession& self) { self.startSubset(name, publicID, systemID); });
    }
    static void externalSubset(void* user, const xmlChar*, const xmlChar*, const xmlChar*) {
        guarded(user, [](SAXSession& self) { self.endSubset(); });
    }
    static void entityDeclaration(void* user, const xmlChar* name, int type,
                                  const xmlChar* publicID, const xmlChar* systemID,
                                  xmlChar* content) {
        guarded(user, [&](SAXSession& self) {
            self.declareEntity(name, type, publicID, systemID, content);
        });
    }
    static void unparsedEntityDeclaration(void* user, const xmlChar* name, const xmlChar* publicID,
                                          const xmlChar* systemID, const xmlChar* notation) {
        guarded(user, [&](SAXSession& self) {
            xmlSAX2UnparsedEntityDecl(self._context.get(), name, publicID, systemID, notation);
        });
    }
    static void attributeDeclaration(void* user, const xmlChar* element, const xmlChar* name, int,
                                     int, const xmlChar* defaultValue, xmlEnumerationPtr values) {
        xmlFreeEnumeration(values);
        guarded(user, [&](SAXSession& self) {
            self.declareAttribute(viewOf(element), viewOf(name), defaultValue);
        });
    }
    // The parser leaves it to this callback to refuse one.
    static void notationDeclaration(void* user, const xmlChar* name, const xmlChar* publicID,
                                    const xmlChar* systemID) {
        guarded(user, [&](SAXSession&) {
            if (publicID == nullptr && systemID == nullptr)
                throw ParseFailure(parseErrors::notationWithoutIdentifier, {viewOf(name)});
        });
    }
    static xmlEntityPtr entity(void* user, const xmlChar* name) {
        xmlEntityPtr found = nullptr;
        guarded(user, [&](SAXSession& self) { found = self.entity(name); });
        return found;
    }
    static xmlEntityPtr parameterEntity(void* user, const xmlChar* name) {
        xmlEntityPtr found = nullptr;
        guarded(user, [&](SAXSession& self) { found = self.parameterEntity(name); });
        return found;
    }
    static void startElement(void* user, const xmlChar* local, const xmlChar* prefix,
                             const xmlChar*, int namespaceCount, const xmlChar** namespaces,
                             int attributeCount, int defaultedCount, const xmlChar** attributes) {
        guarded(user, [&](SAXSession& self) {
            self.startElement(local, prefix, namespaceCount, namespaces, attributeCount,
                              defaultedCount, attributes);
        });
    }
    static void endElement(void* user, const xmlChar*, const xmlChar*, const xmlChar*) {
        guarded(user, [](SAXSession& self) { self._builder.endElement(); });
    }
    static void characters(void* user, const xmlChar* text, int length) {
        guarded(user, [&](SAXSession& self) { self.addText(viewOf(text, text + length)); });
    }
    static void cdata(void* user, const xmlChar* text, int length) {
        guarded(user, [&](SAXSession& self) { self.addCDATA(viewOf(text, text + length)); });
    }
    static void comment(void* user, const xmlChar* text) {
        guarded(user, [&](SAXSession& self) {
            if (self._context->inSubset == 0)
                self._builder.addComment(viewOf(text));
        });
    }
    static void processingInstruction(void* user, const xmlChar* target, const xmlChar* data) {
        guarded(user, [&](SAXSession& self) {
            if (self._context->inSubset == 0)
                self._builder.addProcessingInstruction(self._names.numberOf(target, nullptr),
                                                       viewOf(data));
        });
    }

    static xmlSAXHandler handler() {
        xmlSAXHandler handler{};
        handler.initialized = XML_SAX2_MAGIC;
        handler.startDocument = startDocument;
        handler.internalSubset = internalSubset;
        handler.externalSubset = externalSubset;
        handler.entityDecl = entityDeclaration;
        handler.unparsedEntityDecl = unparsedEntityDeclaration;
        handler.attributeDecl = attributeDeclaration;
        handler.notationDecl = notationDeclaration;
        handler.getEntity = entity;
        handler.getParameterEntity = parameterEntity;
        handler.startElementNs = startElement;
        handler.endElementNs = endElement;
        handler.characters = characters;
        handler.ignorableWhitespace = characters;
        handler.cdataBlock = cdata;
        handler.comment = comment;
        handler.processingInstruction = processingInstruction;
        return handler;
    }
};

void SAXSession::ContextDeleter::operator()(xmlParserCtxt* context) const noexcept {
    xmlFreeDoc(context->myDoc);
    context->myDoc = nullptr;
    xmlFreeParserCtxt(context);
}

SAXSession::ErrorChannel::ErrorChannel(SAXSession& session) {
    // Before anything else: what each thread has in the parser takes locks that this makes.
    static std::once_flag initialized;
    std::call_once(initialized, xmlInitParser);
    requireThreadState();
    _function = xmlStructuredError;
    _user = xmlStructuredErrorContext;
    // The error's constness differs among the parser's versions.
    xmlSetStructuredErrorFunc(&session, [](void* user, auto* error) {
        if (error != nullptr)
            Callbacks::guarded(user, [&](SAXSession& self) { self.report(*error); });
    });
}

SAXSession::ErrorChannel::~ErrorChannel() { xmlSetStructuredErrorFunc(_user, _function); }

SAXSession::SAXSession(XMLIndex& index, const XMLParseOptions& options)
    : _text(index.text()), _origin(index.origin()), _refusesDoctype(options.refuseDoctype),
      _builder(index, options), _names(_builder.names()), _subset(options.maximumSubsetSize),
      _texts(_text), _channel(*this) {
    _context.reset(xmlNewParserCtxt());
    if (_context == nullptr || _lacksMemory)
        throw std::bad_alloc();
    pushInput();
    xmlCtxtUseOptions(_context.get(),
                      XML_PARSE_NOENT | XML_PARSE_NONET | XML_PARSE_IGNORE_ENC | XML_PARSE_HUGE);
#if LIBXML_VERSION >= 21300
    xmlCtxtSetMaxAmplification(_context.get(), UINT_MAX);
#endif
    *_context->sax = Callbacks::handler();
    // Were it the context itself, the parser would look up and open external entities on its own.
    _context->userData = this;
    const auto known = [this](const char* name) {
        return xmlDictLookup(_context->dict, reinterpret_cast<const xmlChar*>(name), -1);
    };
    _space = known("space");
    _xml = known("xml");
    if (_space == nullptr || _xml == nullptr)
        throw std::bad_alloc();
}

SAXSession::~SAXSession() = default;

// The parser's own memory inputs copy the text first. One without a buffer is read where it stands,
// up to the zero byte.
void SAXSession::pushInput() {
    xmlParserInput* const input = xmlNewInputStream(_context.get());
    if (input == nullptr)
        throw std::bad_alloc();
    input->base = input->cur = reinterpret_cast<const xmlChar*>(_text.data());
    input->end = input->base + _text.size();
    setLine(*input, 0);
    if (inputPush(_context.get(), input) >= 0)
        return;
    xmlFreeInputStream(input);
    throw std::bad_alloc();
}

// Its messages tell the lines of start tags. The first tag that was added to a piece stands behind
// a prologue, each other behind the one before it; behind the last the piece begins.
void SAXSession::setLine(xmlParserInput& input, std::size_t addedTags) {
    const auto& lines = _origin.tagLines;
    const std::size_t line = addedTags < lines.size() ? lines[addedTags] : _origin.line;
    const char* const prologue = _text.data();
    const char* const tag = prologue + (addedTags == 0 ? _origin.prologue : 0);
    input.line = static_cast<int>(line) - static_cast<int>(std::count(prologue, tag, '\n'));
}

// Where memory lacks the parser may go on without the thing that it could not make. A document that
// it has read to the end has a root, and every element of it has ended.
void SAXSession::run() {
    xmlParseDocument(_context.get());
    if (_exception)
        std::rethrow_exception(_exception);
    if (_lacksMemory)
        throw std::bad_alloc();
    if (_failure)
        throw ParseFailure(*_failure);
    if (_context->wellFormed == 0 || !_builder.isComplete())
        throw std::bad_alloc();
}

void SAXSession::startDocument() {
    xmlSAX2StartDocument(_context.get());
    if (_context->myDoc == nullptr)
        throw std::bad_alloc();
    const int standalone = _context->standalone;
    if (!_text.starts_with("<?xml") || _text.size() == 5 || !isWhite(_text[5]))
        return;
    const std::string_view version = viewOf(_context->version);
    // The parser takes any version that begins with "1.".
    if (!isXMLVersion(version))
        throw ParseFailure(parseErrors::unknownVersion, {version},
                           _text.find(version) + version.size() + 1);
    const bool isGiven = standalone == 0 || standalone == 1;
    _builder.setDeclaration(version, isGiven ? (standalone == 1 ? "yes" : "no") : nullptr);
}

// The parser stands behind the tag's last attribute. Inside a tag there is no other "<"; where the
// tag comes from an entity, the parser stands behind the reference.
void SAXSession::startElement(XMLNames::Name local, XMLNames::Name prefix, int namespaceCount,
                              const xmlChar** namespaces, int attributeCount, int defaultedCount,
                              const xmlChar** attributes) {
    const std::size_t start = _text.substr(0, offset()).rfind(isInsideReference() ? '&' : '<');
    _tagOffset = start != std::string_view::npos ? start : 0;
    if (_tagOffset < _origin.added)
        setLine(*_context->input, ++_addedTags);
    if (_attributeDefaults != 0)
        countDefaulted(namespaceCount, namespaces, defaultedCount,
                       attributes + 5 * (attributeCount - defaultedCount));
    _builder.startElement(_names.numberOf(local, prefix), _tagOffset);
    for (int i = 0; i < namespaceCount; ++i) {
        const xmlChar* declared = namespaces[2 * i];
        const auto name =
            declared != nullptr ? _names.numberOf(declared, nullptr) : _names.numberOfNoPrefix();
        _names.numberOf(namespaces[2 * i + 1], nullptr); // it counts as a name
        _builder.addNamespace(name, viewOf(namespaces[2 * i + 1]));
    }
    for (int i = 0; i < attributeCount; ++i) {
        const xmlChar** const attribute = attributes + 5 * i;
        const std::string_view value = viewOf(attribute[3], attribute[4]);
        if (_texts.isMarked(value)) {
            _builder.addAttribute(_names.numberOf(attribute[0], attribute[1]),
                                  _texts.unmarked(value, ' '));
            continue;
        }
        if (attribute[0] == _space && attribute[1] == _xml)
            _builder.setPreservesSpace(value == "preserve");
        _builder.addAttribute(_names.numberOf(attribute[0], attribute[1]), value);
    }
    _tagOffset = ParseFailure::here;
}

// White space counts as layout only where it stands in the document itself: not when it comes from
// a reference. Most pieces are parts of the document's text; the parser hands others out while it
// stands behind them, or behind the reference.
void SAXSession::addText(std::string_view piece) {
    if (_texts.isMarked(piece))
        return _builder.addText(_texts.unmarked(piece, '\r'), false);
    const bool isOwn = _builder.isOwn(piece);
    try {
        _builder.addText(piece, isOwn || !isInsideReference());
    } catch (ParseFailure& failure) {
        // Versions of the parser differ in where they stand meanwhile.
        if (isOwn)
            failure.offset = addressOf(piece.data()) - addressOf(_text.data());
        throw;
    }
}

void SAXSession::addCDATA(std::string_view piece) {
    _builder.addText(_texts.isMarked(piece) ? _texts.unmarked(piece, '\r') : piece, false);
}

// Undeclared prefixes and the like are errors too, but leave the document well-formed. An error has
// no message where there was no memory for one.
void SAXSession::report(const xmlError& error) {
    if (error.code == XML_ERR_NO_MEMORY || error.message == nullptr || hidesMemory(error)) {
        _lacksMemory = true;
        return stop();
    }
    if (error.level != XML_ERR_FATAL)
        return;
        // Older parsers read the text of an entity in a context of its own.
#if LIBXML_VERSION < 21200
    if (error.ctxt != nullptr)
        static_cast<xmlParserCtxt*>(error.ctxt)->instate = XML_PARSER_EOF;
#endif
    stop(failureOf(error, offset()));
}

std::size_t SAXSession::offset() const noexcept {
    if (_context->inputNr == 0)
        return 0;
    // A parser that has stopped stands nowhere.
    return std::min(addressOf(_context->inputTab[0]->cur) - addressOf(_text.data()), _text.size());
}

bool SAXSession::isInsideReference() const noexcept {
    const std::size_t at = offset();
    return at != 0 && _text[at - 1] == ';';
}

void SAXSession::stop(ParseFailure failure) noexcept {
    if (failure.offset == ParseFailure::here)
        failure.offset = _tagOffset != ParseFailure::here ? _tagOffset : offset();
    _failure = std::move(failure);
    stop();
}

void SAXSession::stop() noexcept {
    if (_context != nullptr)
        xmlStopParser(_context.get());
}

} // namespace qx
