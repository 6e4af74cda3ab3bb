// What a session makes of a DOCTYPE, and of the entities and defaults that it declares.

#include "xml/SAXSession.h"

#include "xml/CParserText.h"

#include <libxml/SAX2.h>
#include <libxml/hash.h>
#include <libxml/parserInternals.h>
#include <new>
#include <utility>

// For "sax2" newer parsers have nothing else.
#pragma GCC diagnostic ignored "-Wdeprecated-declarations"

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

bool isParameter(int type) {
    return type == XML_INTERNAL_PARAMETER_ENTITY || type == XML_EXTERNAL_PARAMETER_ENTITY;
}

xmlEntityPtr declared(xmlDoc* document, const xmlChar* name, int type) {
    return isParameter(type) ? xmlGetParameterEntity(document, name)
                             : xmlGetDocEntity(document, name);
}

} // namespace

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
        bytes += viewOf(namespaces[2 * i]).size() + viewOf(namespaces[2 * i + 1]).size() + nodeCost;
    for (int i = 0; i < defaultedCount; ++i)
        bytes += viewOf(defaulted[5 * i]).size() + nodeCost +
                 viewOf(defaulted[5 * i + 3], defaulted[5 * i + 4]).size();
    countExpansion(bytes);
}

void SAXSession::countExpansion(std::size_t bytes) {
    const std::size_t limit = freeExpansion + expansionFactor * _text.size();
    _expanded += bytes;
    if (_expanded > limit)
        throw ParseFailure(parseErrors::expansionTooLarge, {limit});
}

} // namespace qx
