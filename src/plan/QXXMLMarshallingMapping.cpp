#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>

#include "model/LibraryClass.h"
#include "plan/IncludeLoader.h"

using qx::Error;
using qx::Ref;
using qx::String;
using qx::detail::ClassPlan;
using qx::detail::IncludeLoader;
using qx::detail::MappingPlan;

QXXMLMarshallingMapping::QXXMLMarshallingMapping() = default;
QXXMLMarshallingMapping::~QXXMLMarshallingMapping() = default;

Ref<QXXMLMarshallingMapping> QXXMLMarshallingMapping::initWithDocument(qx::XMLDocument* document,
                                                                       Ref<Error>* error) {
    auto mapping = qx::make<QXXMLMarshallingMapping>();
    return mapping->init(document, error) ? mapping : nullptr;
}

bool QXXMLMarshallingMapping::init(qx::XMLDocument* document, Ref<Error>* error) {
    qx::XMLElement* root = document != nullptr ? document->rootElement() : nullptr;
    _mapping = QXXMLDocumentMapping::initWithXML(root, error);
    // A slot that held an error before fails the construction too.
    if (!_mapping || (error != nullptr && *error))
        return false;
    _document = Ref<qx::XMLDocument>(document);
    return loadIncludedDocuments(error) && populateLookupCaches(error);
}

bool QXXMLMarshallingMapping::loadIncludedDocuments(Ref<Error>* error) {
    if (_plan != nullptr)
        return true;
    IncludeLoader loader;
    if (!loader.load(*_mapping, error))
        return false;
    for (const auto& included : loader.included())
        _mapping->mergeDocumentMapping(included.get());
    return true;
}

bool QXXMLMarshallingMapping::populateLookupCaches(Ref<Error>*) {
    if (_plan == nullptr)
        _plan = std::make_unique<MappingPlan>(*_mapping);
    return true;
}

QXXMLClassMapping* QXXMLMarshallingMapping::mappingOf(const ClassPlan* plan) const {
    return plan != nullptr ? _mapping->classMappings()[plan->index].get() : nullptr;
}

QXXMLClassMapping* QXXMLMarshallingMapping::mappingForClassName(const String& className) const {
    return mappingOf(_plan->classNamed(className));
}

QXXMLClassMapping* QXXMLMarshallingMapping::mappingForElementName(const String& elementName) const {
    return mappingOf(_plan->classForElement(elementName));
}

QXXMLClassMapping* QXXMLMarshallingMapping::mappingForNode(const qx::XMLNode* node) const {
    return node != nullptr ? mappingForElementName(node->name()) : nullptr;
}

const qx::Class& QXXMLMarshallingMapping::describedClass() const {
    return qx::libraryClass<QXXMLMarshallingMapping>("QXXMLMarshallingMapping");
}
