#include <QXXMLMarshalling/QXXMLFieldMapping.h>

#include <QXXMLMarshalling/QXXMLClassMapping.h>

#include "mapping/MappingWords.h"
#include "model/Errors.h"
#include "model/LibraryClass.h"

using qx::Error;
using qx::Ref;
using qx::String;
using qx::XMLElement;

QXXMLFieldMapping::~QXXMLFieldMapping() = default;

Ref<QXXMLFieldMapping> QXXMLFieldMapping::initWithXML(XMLElement* element, Ref<Error>* error) {
    return initialized<QXXMLFieldMapping>(element, error);
}

// The order of the steps decides which error a document with several faults gets.
bool QXXMLFieldMapping::initXML(XMLElement& element, Ref<Error>* error) {
    const auto& words = qx::detail::mappingWords();
    return QXXMLMapping::initXML(element, error) &&
           goesOn(extractStringAttribute(words.name, element, true, _name, error), error) &&
           extractStringAttribute(words.type, element, false, _type, error) &&
           extractStringAttribute(words.handler, element, false, _handler, error) &&
           extractStringAttribute(words.getMethod, element, false, _getMethod, error) &&
           extractStringAttribute(words.setMethod, element, false, _setMethod, error) &&
           extractStringAttribute(words.createMethod, element, false, _createMethod, error) &&
           extractStringAttribute(words.collection, element, false, _collection, error) &&
           readFlag(words.required, Flag::required, false, error) &&
           readFlag(words.container, Flag::container, true, error) &&
           readFlag(words.lazy, Flag::lazy, false, error) &&
           readFlag(words.direct, Flag::direct, false, error) &&
           readFlag(words.transient, Flag::transient, false, error) &&
           goesOn(readBindings(error), error);
}

bool QXXMLFieldMapping::readFlag(qx::Key name, Flag flag, bool defaultValue, Ref<Error>* error) {
    bool value = false;
    const bool isRead = extractBooleanAttribute(name, element(), false, value, defaultValue, error);
    if (!goesOn(isRead, error))
        return false;
    if (value)
        _flags |= static_cast<std::uint32_t>(flag);
    return true;
}

bool QXXMLFieldMapping::readBindings(Ref<Error>* error) {
    const auto& words = qx::detail::mappingWords();
    const auto bindings = element().elementsForName(words.bindXML);
    if (bindings.size() > 1 &&
        !goesOn(qx::fail(error, qx::errors::tooManyBindXMLElements, &element()), error))
        return false;
    if (!bindings.empty()) {
        _bindToMapping = QXXMLBindToMapping::initWithXML(bindings.front(), error);
        if (!_bindToMapping)
            return false;
        _bindToMappings.push_back(_bindToMapping);
    }
    const auto alternatives = element().elementsForName(words.altXML);
    if (alternatives.empty())
        return true;
    if (bindings.empty())
        return qx::fail(error, qx::errors::alternativesWithoutBindXML, &element());
    return processAlternateBindTos(alternatives, error);
}

bool QXXMLFieldMapping::processAlternateBindTos(const std::vector<XMLElement*>& elements,
                                                Ref<Error>* error) {
    for (XMLElement* alternative : elements) {
        auto binding = QXXMLBindToMapping::initWithMinimalXML(alternative, error);
        if (!binding)
            return false;
        _bindToMappings.push_back(std::move(binding));
    }
    return true;
}

String QXXMLFieldMapping::bindTo() const {
    return _bindToMapping ? _bindToMapping->bindTo() : String();
}

String QXXMLFieldMapping::node() const {
    return _bindToMapping ? _bindToMapping->node() : String();
}

QXXMLNodeType QXXMLFieldMapping::nodeType() const {
    return _bindToMapping ? _bindToMapping->nodeType() : QXXMLNodeTypeAttribute;
}

String QXXMLFieldMapping::location() const {
    return _bindToMapping ? _bindToMapping->location() : String();
}

Ref<QXXMLClassMapping> QXXMLFieldMapping::classMapping() const { return _classMapping.lock(); }

void QXXMLFieldMapping::setClassMapping(QXXMLClassMapping* mapping) { _classMapping = mapping; }

String QXXMLFieldMapping::descriptionWithLocale(const qx::Object* locale,
                                                std::size_t indent) const {
    std::string text = QXXMLMapping::descriptionWithLocale(locale, indent).str();
    append(text, "name", _name);
    append(text, "type", _type);
    append(text, "handler", _handler);
    append(text, "get-method", _getMethod);
    append(text, "set-method", _setMethod);
    append(text, "create-method", _createMethod);
    append(text, "collection", _collection);
    constexpr std::pair<const char*, Flag> flags[] = {{"required", Flag::required},
                                                      {"direct", Flag::direct},
                                                      {"lazy", Flag::lazy},
                                                      {"container", Flag::container},
                                                      {"transient", Flag::transient}};
    for (const auto& [name, flag] : flags)
        if (hasFlag(flag))
            append(text, name, "true");
    append(text, "bindTo", locale, indent, {_bindToMappings.begin(), _bindToMappings.end()});
    return text;
}

Ref<QXXMLMapping> QXXMLFieldMapping::newInstance() const { return qx::make<QXXMLFieldMapping>(); }

const qx::Class& QXXMLFieldMapping::describedClass() const {
    return qx::libraryClass<QXXMLFieldMapping, QXXMLMapping>("QXXMLFieldMapping");
}
