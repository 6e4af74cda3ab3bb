#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>

#include "platform/object/LibraryClass.h"
#include "platform/system/Errors.h"
#include "resolved/MappingIndex.h"

using qx::Error;
using qx::Ref;
using qx::String;

QXXMLMarshallingMapping::QXXMLMarshallingMapping()
    : _mappingByClass(std::make_unique<Index>()), _mappingByElementName(std::make_unique<Index>()) {
}

QXXMLMarshallingMapping::~QXXMLMarshallingMapping() = default;

Ref<QXXMLMarshallingMapping> QXXMLMarshallingMapping::initWithDocument(qx::XMLDocument* document,
                                                                       Ref<Error>* error) {
    auto mapping = qx::make<QXXMLMarshallingMapping>();
    return mapping->init(document, nullptr, error) ? mapping : nullptr;
}

bool QXXMLMarshallingMapping::init(qx::XMLDocument* document, const Loading* loading,
                                   Ref<Error>* error) {
    qx::XMLElement* root = document != nullptr ? document->rootElement() : nullptr;
    _mapping = QXXMLDocumentMapping::initWithXML(root, error);
    // A slot that held an error before fails the construction too.
    if (!_mapping || (error != nullptr && *error))
        return false;
    _document = Ref<qx::XMLDocument>(document);
    if (!loadIncludedDocuments(loading, error) || !populateLookupCaches(error))
        return false;
    // An included mapping is merged into another and never worked from.
    if (loading == nullptr)
        _plan = std::make_unique<MappingPlan>(*_mapping);
    return true;
}

bool QXXMLMarshallingMapping::populateLookupCaches(Ref<Error>* error) {
    if (_plan != nullptr)
        return true;
    for (const auto& mapping : _mapping->classMappings()) {
        const String& className = mapping->className();
        const String elementName = MappingPlan::elementNameOf(*mapping);
        if (_mappingByClass->mappings.contains(className))
            return qx::fail(error, qx::errors::classRedefined, className);
        if (_mappingByElementName->mappings.contains(elementName))
            return qx::fail(error, qx::errors::elementRedefined, elementName, className);
        _mappingByClass->mappings.emplace(className, mapping);
        _mappingByElementName->mappings.emplace(elementName, mapping);
    }
    return true;
}

QXXMLClassMapping* QXXMLMarshallingMapping::mappingForClassName(const String& className) const {
    return _mappingByClass->find(className);
}

QXXMLClassMapping* QXXMLMarshallingMapping::mappingForElementName(const String& elementName) const {
    return _mappingByElementName->find(elementName);
}

QXXMLClassMapping* QXXMLMarshallingMapping::mappingForNode(const qx::XMLNode* node) const {
    return node != nullptr ? mappingForElementName(node->name()) : nullptr;
}

const qx::Class& QXXMLMarshallingMapping::describedClass() const {
    return qx::libraryClass<QXXMLMarshallingMapping>("QXXMLMarshallingMapping");
}
