#include <QXXMLMarshalling/QXXMLDocumentMapping.h>

#include "mapping/MappingWords.h"
#include "model/Errors.h"
#include "model/LibraryClass.h"

using qx::Error;
using qx::Ref;
using qx::String;
using qx::XMLElement;

QXXMLDocumentMapping::~QXXMLDocumentMapping() = default;

Ref<QXXMLDocumentMapping> QXXMLDocumentMapping::initWithXML(XMLElement* root, Ref<Error>* error) {
    return initialized<QXXMLDocumentMapping>(root, error);
}

bool QXXMLDocumentMapping::initXML(XMLElement& element, Ref<Error>* error) {
    const auto& words = qx::detail::mappingWords();
    if (!QXXMLMapping::initXML(element, error))
        return false;
    for (XMLElement* include : element.elementsForName(words.include)) {
        String href = include->attributeValue(words.href);
        if (href.isNull())
            continue;
        _includes.push_back(std::move(href));
        _includeElements.emplace_back(include);
    }
    return processClasses(element.elementsForName(words.classes), error);
}

bool QXXMLDocumentMapping::processClasses(const std::vector<XMLElement*>& elements,
                                          Ref<Error>* error) {
    for (XMLElement* element : elements) {
        auto mapping = QXXMLClassMapping::initWithXML(element, error);
        if (!goesOn(mapping != nullptr, error))
            return false;
        if (mapping && !mapping->className().isNull())
            _classMappings.push_back(std::move(mapping));
    }
    return true;
}

QXXMLMappingPlace QXXMLDocumentMapping::includePlace(std::size_t index) const {
    const XMLElement& include = *_includeElements.at(index);
    return {place().documentName, include.line(), include.column()};
}

void QXXMLDocumentMapping::mergeDocumentMapping(const QXXMLDocumentMapping* other) {
    if (other == nullptr)
        return;
    // Indexes, not iterators: a document may be merged with itself.
    const std::size_t count = other->_classMappings.size();
    for (std::size_t i = 0; i < count; ++i)
        _classMappings.push_back(other->_classMappings[i]);
}

String QXXMLDocumentMapping::descriptionWithLocale(const qx::Object* locale,
                                                   std::size_t indent) const {
    std::string text = QXXMLMapping::descriptionWithLocale(locale, indent).str();
    append(text, "includes", locale, indent, {_includes.begin(), _includes.end()});
    append(text, "classes", locale, indent, {_classMappings.begin(), _classMappings.end()});
    return text;
}

Ref<QXXMLMapping> QXXMLDocumentMapping::newInstance() const {
    return qx::make<QXXMLDocumentMapping>();
}

const qx::Class& QXXMLDocumentMapping::describedClass() const {
    return qx::libraryClass<QXXMLDocumentMapping, QXXMLMapping>("QXXMLDocumentMapping");
}
