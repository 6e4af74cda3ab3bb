#include "platform/xml/SAXSession.h"

#include "platform/xml/XMLCharacters.h"

#include <algorithm>
#include <cstring>
#include <libxml/SAX2.h>
#include <libxml/parserInternals.h>
#include <mutex>
#include <new>

namespace qx {

namespace {

// Up to these the C parser keeps its own, stricter checks; beyond, ours alone hold.
constexpr std::size_t parsersDepth = 256;
constexpr std::size_t parsersTextSize = 10'000'000;

// What entities and attribute defaults may add to a document.
constexpr std::size_t freeExpansion = 1'000'000;
constexpr std::size_t expansionFactor = 10;

// The parser compares each default of an element with its other attributes, at each such element.
constexpr std::size_t maximumAttributeDefaults = 2000;

// Declarations bring names into the parser's table, which gets slow with very many.
constexpr std::size_t maximumDeclarations = 20'000;

// What a node and a reference cost beside their text, in the account of expansions.
constexpr std::size_t nodeCost = 16;
constexpr std::size_t referenceCost = 32;

std::uintptr_t addressOf(const void* place) { return reinterpret_cast<std::uintptr_t>(place); }

std::size_t lengthOf(const xmlChar* text) {
    return text != nullptr ? std::string_view(reinterpret_cast<const char*>(text)).size() : 0;
}

std::string_view viewOf(const xmlChar* text) {
    return text != nullptr ? std::string_view(reinterpret_cast<const char*>(text)) : "";
}

std::string_view viewOf(const xmlChar* from, const xmlChar* to) {
    return {reinterpret_cast<const char*>(from), static_cast<std::size_t>(to - from)};
}

// What the parser says, on one line.
ParseFailure failureOf(const xmlError& error, std::size_t offset) {
    std::string message = error.message != nullptr ? error.message : "";
    while (!message.empty() && isWhite(message.back()))
        message.pop_back();
    std::replace(message.begin(), message.end(), '\n', ' ');
    if (error.code == XML_ERR_ENTITY_LOOP)
        return ParseFailure(parseErrors::loopOrExpansion, {message}, offset);
    return {error.code, message, offset};
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
            xmlStopParser(self._context.get());
        }
    }

    static void startDocument(void* user) {
        guarded(user, [](SAXSession& self) { self.startDocument(); });
    }
    static void internalSubset(void* user, const xmlChar* name, const xmlChar* publicID,
                               const xmlChar* systemID) {
        xmlSAX2InternalSubset(session(user)._context.get(), name, publicID, systemID);
    }
    static void entityDeclaration(void* user, const xmlChar* name, int type,
                                  const xmlChar* publicID, const xmlChar* systemID,
                                  xmlChar* content) {
        guarded(user, [](SAXSession& self) { self.countDeclaration(); });
        xmlSAX2EntityDecl(session(user)._context.get(), name, type, publicID, systemID, content);
    }
    static void unparsedEntityDeclaration(void* user, const xmlChar* name, const xmlChar* publicID,
                                          const xmlChar* systemID, const xmlChar* notation) {
        guarded(user, [](SAXSession& self) { self.countDeclaration(); });
        xmlSAX2UnparsedEntityDecl(session(user)._context.get(), name, publicID, systemID, notation);
    }
    static void attributeDeclaration(void* user, const xmlChar*, const xmlChar*, int, int,
                                     const xmlChar* defaultValue, xmlEnumerationPtr values) {
        xmlFreeEnumeration(values);
        guarded(user, [&](SAXSession& self) {
            self.countDeclaration();
            if (defaultValue != nullptr)
                self.countAttributeDefault();
        });
    }
    static void elementDeclaration(void* user, const xmlChar*, int, xmlElementContentPtr) {
        guarded(user, [](SAXSession& self) { self.countDeclaration(); });
    }
    static void notationDeclaration(void* user, const xmlChar*, const xmlChar*, const xmlChar*) {
        guarded(user, [](SAXSession& self) { self.countDeclaration(); });
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
        guarded(user, [&](SAXSession& self) {
            self._builder.addText(viewOf(text, text + length), false, false);
        });
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
                self._builder.addProcessingInstruction(self._names.named(target, nullptr),
                                                       viewOf(data));
        });
    }

    static xmlSAXHandler handler() {
        xmlSAXHandler handler{};
        handler.initialized = XML_SAX2_MAGIC;
        handler.startDocument = startDocument;
        handler.internalSubset = internalSubset;
        handler.entityDecl = entityDeclaration;
        handler.unparsedEntityDecl = unparsedEntityDeclaration;
        handler.attributeDecl = attributeDeclaration;
        handler.elementDecl = elementDeclaration;
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
        // The error's constness differs among the parser's versions.
        handler.serror = [](void* user, auto* error) {
            if (error != nullptr)
                guarded(user, [&](SAXSession& self) { self.report(*error); });
        };
        return handler;
    }
};

void SAXSession::ContextDeleter::operator()(xmlParserCtxt* context) const noexcept {
    xmlFreeDoc(context->myDoc);
    context->myDoc = nullptr;
    xmlFreeParserCtxt(context);
}

SAXSession::SAXSession(std::string_view text, XMLDocument& document, const XMLParseOptions& options)
    : _text(text), _document(document), _builder(document, options), _position(text) {
    static std::once_flag initialized;
    std::call_once(initialized, xmlInitParser);
    _context.reset(xmlNewParserCtxt());
    if (_context == nullptr)
        throw std::bad_alloc();
    pushInput();
    int flags = XML_PARSE_NOENT | XML_PARSE_NONET | XML_PARSE_IGNORE_ENC;
    if (options.maximumDepth > parsersDepth || options.maximumTextSize > parsersTextSize)
        flags |= XML_PARSE_HUGE;
    xmlCtxtUseOptions(_context.get(), flags);
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
    input->length = static_cast<int>(_text.size());
    if (inputPush(_context.get(), input) >= 0)
        return;
    xmlFreeInputStream(input);
    throw std::bad_alloc();
}

void SAXSession::run() {
    xmlParseDocument(_context.get());
    if (_exception)
        std::rethrow_exception(_exception);
    if (!_failure && _context->wellFormed == 0)
        _failure = failureOf(_context->lastError, offset());
    if (_failure)
        throw ParseFailure(*_failure);
}

void SAXSession::startDocument() {
    xmlSAX2StartDocument(_context.get());
    const int standalone = _context->standalone;
    if (!_text.starts_with("<?xml") || _text.size() == 5 || !isWhite(_text[5]))
        return;
    _document.setVersion(viewOf(_context->version));
    if (standalone == 0 || standalone == 1)
        _document.setStandalone(standalone == 1 ? "yes" : "no");
}

// The parser stands behind the tag's last attribute. Inside a tag there is no other "<"; where the
// tag comes from an entity, the parser stands behind the reference.
void SAXSession::startElement(XMLNames::Name local, XMLNames::Name prefix, int namespaceCount,
                              const xmlChar** namespaces, int attributeCount, int defaultedCount,
                              const xmlChar** attributes) {
    const void* start = ::memrchr(_text.data(), isInsideReference() ? '&' : '<', offset());
    _tagOffset = start != nullptr ? static_cast<const char*>(start) - _text.data() : 0;
    _position.moveTo(_tagOffset);
    if (_attributeDefaults != 0)
        countDefaulted(namespaceCount, namespaces, defaultedCount,
                       attributes + 5 * (attributeCount - defaultedCount));
    _builder.startElement(_names.named(local, prefix), static_cast<std::size_t>(attributeCount),
                          _position.line(), _position.column());
    for (int i = 0; i < namespaceCount; ++i) {
        const xmlChar* declared = namespaces[2 * i];
        const String name = declared != nullptr ? _names.named(declared, nullptr) : String("");
        _builder.addNamespace(name, _names.named(namespaces[2 * i + 1], nullptr));
    }
    for (int i = 0; i < attributeCount; ++i) {
        const xmlChar** const attribute = attributes + 5 * i;
        const std::string_view value = viewOf(attribute[3], attribute[4]);
        if (attribute[0] == _space && attribute[1] == _xml)
            _builder.setPreservesSpace(value == "preserve");
        _builder.addAttribute(_names.named(attribute[0], attribute[1]), value);
    }
    _tagOffset = ParseFailure::here;
}

// White space counts as layout only where it stands in the document itself: not when it comes from
// a reference. Most pieces are parts of the document's text; the parser hands others out while it
// stands behind them, or behind the reference.
void SAXSession::addText(std::string_view piece) {
    const bool isOwn = addressOf(piece.data()) - addressOf(_text.data()) < _text.size();
    _builder.addText(piece, isOwn || !isInsideReference(), isOwn);
}

xmlEntityPtr SAXSession::entity(const xmlChar* name) {
    xmlEntityPtr found = xmlGetDocEntity(_context->myDoc, name);
    if (found == nullptr || found->etype == XML_INTERNAL_PREDEFINED_ENTITY)
        return found;
    if (found->etype == XML_EXTERNAL_GENERAL_PARSED_ENTITY) {
        if (_context->inSubset != 0)
            return nullptr;
        throw ParseFailure(parseErrors::externalEntity, {viewOf(name)});
    }
    countExpansion(static_cast<std::size_t>(found->length) + referenceCost);
    return found;
}

// An external one is left out, as a parser that does not validate may. The parser then goes on as
// for any document that it has not read all declarations of.
xmlEntityPtr SAXSession::parameterEntity(const xmlChar* name) {
    xmlEntityPtr found = xmlGetParameterEntity(_context->myDoc, name);
    if (found == nullptr)
        return nullptr;
    if (found->etype == XML_EXTERNAL_PARAMETER_ENTITY) {
        _context->hasPErefs = 1;
        return nullptr;
    }
    countExpansion(static_cast<std::size_t>(found->length) + referenceCost);
    return found;
}

void SAXSession::countDeclaration() {
    if (++_declarations > maximumDeclarations)
        throw ParseFailure(parseErrors::tooManyDeclarations, {maximumDeclarations});
}

void SAXSession::countAttributeDefault() {
    if (++_attributeDefaults > maximumAttributeDefaults)
        throw ParseFailure(parseErrors::tooManyDefaults, {maximumAttributeDefaults});
}

void SAXSession::countDefaulted(int namespaceCount, const xmlChar** namespaces, int defaultedCount,
                                const xmlChar** defaulted) {
    std::size_t bytes = 0;
    for (int i = 0; i < namespaceCount; ++i)
        bytes += lengthOf(namespaces[2 * i]) + lengthOf(namespaces[2 * i + 1]) + nodeCost;
    for (int i = 0; i < defaultedCount; ++i)
        bytes += lengthOf(defaulted[5 * i]) + nodeCost +
                 viewOf(defaulted[5 * i + 3], defaulted[5 * i + 4]).size();
    countExpansion(bytes);
}

void SAXSession::countExpansion(std::size_t bytes) {
    const std::size_t limit = freeExpansion + expansionFactor * _text.size();
    _expanded += bytes;
    if (_expanded > limit)
        throw ParseFailure(parseErrors::expansionTooLarge, {limit});
}

// The parser goes on after an error to find more; only the first one counts. Undeclared prefixes
// and the like are errors too, but leave the document well-formed. An entity that may be declared
// where we do not look must be refused: its text would be missing.
void SAXSession::report(const xmlError& error) {
    if (error.code == XML_ERR_NO_MEMORY)
        throw std::bad_alloc();
    if (error.level == XML_ERR_FATAL ||
        (error.level == XML_ERR_ERROR && error.code == XML_WAR_UNDECLARED_ENTITY))
        _failure = failureOf(error, offset());
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
    xmlStopParser(_context.get());
}

} // namespace qx
