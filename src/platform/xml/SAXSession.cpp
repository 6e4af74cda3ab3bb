#include "platform/xml/SAXSession.h"

#include "platform/xml/XMLCharacters.h"
#include "platform/xml/XMLLimits.h"

#include <algorithm>
#include <cstring>
#include <libxml/SAX2.h>
#include <libxml/hash.h>
#include <libxml/parserInternals.h>
#include <mutex>
#include <new>
#include <utility>

namespace qx {

namespace {

// What entities and attribute defaults may add to a document.
constexpr std::size_t freeExpansion = 1'000'000;
constexpr std::size_t expansionFactor = 5;

// The parser compares each default of an element with its other attributes, at each such element.
constexpr std::size_t maximumAttributeDefaults = 2000;
constexpr std::size_t comparisonsPerByte = 64; // in the account of expansions

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

// Without memory the parser has nothing where a text starts.
std::string_view viewOf(const xmlChar* from, const xmlChar* to) {
    if (from == nullptr)
        throw std::bad_alloc();
    return {reinterpret_cast<const char*>(from), static_cast<std::size_t>(to - from)};
}

// What the parser says, on one line.
ParseFailure failureOf(const xmlError& error, std::size_t offset) {
    std::string message = error.message != nullptr ? error.message : "";
    while (!message.empty() && isWhite(message.back()))
        message.pop_back();
    std::replace(message.begin(), message.end(), '\n', ' ');
    return {error.code, message, offset};
}

bool isParameter(int type) {
    return type == XML_INTERNAL_PARAMETER_ENTITY || type == XML_EXTERNAL_PARAMETER_ENTITY;
}

xmlEntityPtr declared(xmlDoc* document, const xmlChar* name, int type) {
    return isParameter(type) ? xmlGetParameterEntity(document, name)
                             : xmlGetDocEntity(document, name);
}

// Older parsers without memory for the URI of a namespace say that it is empty.
bool hidesMemory(const xmlError& error) {
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
                self._builder.addProcessingInstruction(self._names.named(target, nullptr),
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
    requireThreadState();
    _function = xmlStructuredError;
    _user = xmlStructuredErrorContext;
    // The error's constness differs among the parser's versions.
    xmlSetStructuredErrorFunc(&session, [](void* user, auto* error) {
        if (error != nullptr)
            Callbacks::guarded(user, [&](SAXSession& self) { self.report(*error); });
    });
    static std::once_flag initialized;
    std::call_once(initialized, xmlInitParser);
}

SAXSession::ErrorChannel::~ErrorChannel() { xmlSetStructuredErrorFunc(_user, _function); }

SAXSession::SAXSession(std::string_view text, XMLDocument& document, const XMLParseOptions& options)
    : _text(text), _refusesDoctype(options.refuseDoctype), _document(document),
      _builder(document, options), _position(text), _subset(options.maximumSubsetSize),
      _texts(text), _channel(*this) {
    _context.reset(xmlNewParserCtxt());
    if (_context == nullptr || _lacksMemory)
        throw std::bad_alloc();
    pushInput();
    xmlCtxtUseOptions(_context.get(),
                      XML_PARSE_NOENT | XML_PARSE_NONET | XML_PARSE_IGNORE_ENC | XML_PARSE_HUGE);
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
    _document.setVersion(viewOf(_context->version));
    if (standalone == 0 || standalone == 1)
        _document.setStandalone(standalone == 1 ? "yes" : "no");
}

// The parser stands at the bracket, if there is one.
void SAXSession::startSubset(const xmlChar* name, const xmlChar* publicID,
                             const xmlChar* systemID) {
    if (_refusesDoctype)
        throw ParseFailure(parseErrors::doctypeRefused);
    _subset.read(_text.substr(offset()));
    xmlSAX2InternalSubset(_context.get(), name, publicID, systemID);
    if (_context->myDoc->intSubset == nullptr)
        throw std::bad_alloc();
}

// Also called for a document that has no external subset.
void SAXSession::endSubset() {
    _context->sax2 = 1;
#if LIBXML_VERSION < 21200
    const int known = _context->attsSpecial != nullptr ? xmlHashSize(_context->attsSpecial) : 0;
    if (static_cast<std::size_t>(known) != _attributes.size())
        throw std::bad_alloc();
#endif
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
        if (_texts.isMarked(value)) {
            _builder.addAttribute(_names.named(attribute[0], attribute[1]),
                                  _texts.unmarked(value, ' '));
            continue;
        }
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
    if (_texts.isMarked(piece))
        return _builder.addText(_texts.unmarked(piece, '\r'), false, false);
    const bool isOwn = addressOf(piece.data()) - addressOf(_text.data()) < _text.size();
    try {
        _builder.addText(piece, isOwn || !isInsideReference(), isOwn);
    } catch (ParseFailure& failure) {
        // Versions of the parser differ in where they stand meanwhile.
        if (isOwn)
            failure.offset = addressOf(piece.data()) - addressOf(_text.data());
        throw;
    }
}

void SAXSession::addCDATA(std::string_view piece) {
    if (_texts.isMarked(piece))
        return _builder.addText(_texts.unmarked(piece, '\r'), false, false);
    _builder.addText(piece, false, false);
}

// The first declaration of a name counts.
void SAXSession::declareEntity(const xmlChar* name, int type, const xmlChar* publicID,
                               const xmlChar* systemID, const xmlChar* content) {
    xmlDoc* const document = _context->myDoc;
    const bool isNew = declared(document, name, type) == nullptr;
    std::string text(viewOf(content));
    if (type == XML_INTERNAL_GENERAL_ENTITY)
        text = _texts.prepared(text);
    xmlSAX2EntityDecl(_context.get(), name, type, publicID, systemID,
                      content != nullptr ? reinterpret_cast<xmlChar*>(text.data()) : nullptr);
    const xmlEntity* const made = declared(document, name, type);
    if (made == nullptr || (isNew && viewOf(made->content) != text))
        throw std::bad_alloc();
    if (isNew && _hasUnread)
        _uncertain.insert(made);
    if (content != nullptr)
        _justDeclared = name;
}

// The parser looks an entity up once more after it has declared it.
bool SAXSession::isJustDeclared(const xmlChar* name) noexcept {
    return std::exchange(_justDeclared, nullptr) == name;
}

xmlEntityPtr SAXSession::entity(const xmlChar* name) {
    const bool isInSubset = _context->inSubset != 0;
    xmlEntityPtr found = xmlGetDocEntity(_context->myDoc, name);
    if (isJustDeclared(name))
        return found;
    if (found == nullptr || _uncertain.contains(found)) {
        if (isInSubset && _hasUnread) // of a default that does not count either
            return nullptr;
        throw ParseFailure(parseErrors::undeclaredEntity, {viewOf(name)});
    }
    if (found->etype == XML_EXTERNAL_GENERAL_PARSED_ENTITY && !isInSubset)
        throw ParseFailure(parseErrors::externalEntity, {viewOf(name)});
    if (found->etype != XML_INTERNAL_GENERAL_ENTITY)
        return found;
    _texts.requireFlat(_context->myDoc, *found);
    countExpansion(static_cast<std::size_t>(found->length) + referenceCost);
    return found;
}

// An external one is left out, as a parser that does not validate may. Unless the document stands
// alone, what is declared behind it does not count then; to the parser itself defaults and types of
// attributes belong to the way in which it reports elements.
xmlEntityPtr SAXSession::parameterEntity(const xmlChar* name) {
    xmlEntityPtr found = xmlGetParameterEntity(_context->myDoc, name);
    if (isJustDeclared(name))
        return found;
    if (found == nullptr || _uncertain.contains(found))
        return nullptr;
    if (found->etype == XML_EXTERNAL_PARAMETER_ENTITY) {
        if (_context->standalone != 1) {
            _hasUnread = true;
            _context->sax2 = 0;
        }
        return emptyEntity();
    }
    _subset.expand(static_cast<std::size_t>(found->length) + referenceCost);
    return found;
}

// Stands in for one that is not read: what the parser makes of none differs among its versions.
xmlEntityPtr SAXSession::emptyEntity() {
    const auto* const name = reinterpret_cast<const xmlChar*>(" "); // that no reference can have
    xmlEntityPtr empty = xmlGetParameterEntity(_context->myDoc, name);
    if (empty == nullptr)
        empty = xmlAddDocEntity(_context->myDoc, name, XML_INTERNAL_PARAMETER_ENTITY, nullptr,
                                nullptr, reinterpret_cast<const xmlChar*>(""));
    if (empty == nullptr || empty->content == nullptr)
        throw std::bad_alloc();
    return empty;
}

// What is declared behind an unread entity leaves no trace in the parser.
void SAXSession::declareAttribute(std::string_view element, std::string_view name,
                                  const xmlChar* defaultValue) {
    if (_context->sax2 == 0)
        return;
    _attributes.insert(std::string(element).append(1, ' ').append(name));
    if (defaultValue == nullptr)
        return;
    if (++_attributeDefaults > maximumAttributeDefaults)
        throw ParseFailure(parseErrors::tooManyDefaults, {maximumAttributeDefaults});
    provide(element);
    provide(name);
    provide(viewOf(defaultValue));
}

// Older parsers do not notice that they find no memory for a part of a default: they have each in
// their table beforehand.
void SAXSession::provide(std::string_view name) {
    const std::size_t colon = name.find(':');
    for (const std::string_view part : {name, name.substr(0, colon), name.substr(colon + 1)})
        if (xmlDictLookup(_context->dict, reinterpret_cast<const xmlChar*>(part.data()),
                          static_cast<int>(part.size())) == nullptr)
            throw std::bad_alloc();
}

void SAXSession::countDefaulted(int namespaceCount, const xmlChar** namespaces, int defaultedCount,
                                const xmlChar** defaulted) {
    const auto defaults = static_cast<std::size_t>(defaultedCount);
    std::size_t bytes = defaults * defaults / comparisonsPerByte;
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
