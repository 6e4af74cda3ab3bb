#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>

#include "files/Paths.h"
#include "mapping/MappingSource.h"
#include "model/LibraryClass.h"
#include "plan/IncludeLoader.h"

using qx::Error;
using qx::Ref;
using qx::String;
using qx::detail::ClassPlan;
using qx::detail::IncludeLoader;
using qx::detail::MappingPlan;
using qx::detail::MappingSource;

QXXMLMarshallingMapping::QXXMLMarshallingMapping() = default;
QXXMLMarshallingMapping::~QXXMLMarshallingMapping() = default;

Ref<QXXMLMarshallingMapping> QXXMLMarshallingMapping::initWithDocument(qx::XMLDocument* document,
                                                                       Ref<Error>* error) {
    return initWithDocument(document, {}, error);
}

Ref<QXXMLMarshallingMapping>
QXXMLMarshallingMapping::initWithDocument(qx::XMLDocument* document,
                                          const QXXMLMappingOptions& options, Ref<Error>* error) {
    auto mapping = qx::make<QXXMLMarshallingMapping>();
    return mapping->init(document, options, error) ? mapping : nullptr;
}

Ref<QXXMLMarshallingMapping> QXXMLMarshallingMapping::initWithContentsOfFile(const String& path,
                                                                             Ref<Error>* error) {
    return initWithContentsOfFile(path, {}, error);
}

Ref<QXXMLMarshallingMapping> QXXMLMarshallingMapping::initWithContentsOfFile(
    const String& path, const QXXMLMappingOptions& options, Ref<Error>* error) {
    const auto document = qx::XMLDocument::initWithContentsOfFile(path, {}, error);
    if (!document || (error != nullptr && *error))
        return nullptr;
    QXXMLMappingOptions besideIt = options;
    if (besideIt.includeFolder.isNull())
        besideIt.includeFolder = qx::directoryOf(path);
    return initWithDocument(document.get(), besideIt, error);
}

bool QXXMLMarshallingMapping::init(qx::XMLDocument* document, const QXXMLMappingOptions& options,
                                   Ref<Error>* error) {
    qx::XMLElement* root = document != nullptr ? document->rootElement() : nullptr;
    const auto source = MappingSource::of(root);
    Ref<Error> slot;
    if (options.collectsFaults) {
        source->collectFaults(&_faults);
        slot = error != nullptr ? *error : nullptr;
    }
    Ref<Error>* const step = options.collectsFaults ? &slot : error;
    _mapping = source->read(root, step);
    // A slot that held an error before fails the construction too.
    if (!_mapping || (step != nullptr && *step))
        return false;
    _document = Ref<qx::XMLDocument>(document);
    _includes = std::make_unique<IncludeLoader>(options.includeFolder);
    if (!loadIncludedDocuments(step) || !populateLookupCaches(step))
        return false;
    if (options.collectsFaults)
        endCollecting(error);
    return true;
}

// Later copies of nodes report their faults themselves.
void QXXMLMarshallingMapping::endCollecting(Ref<Error>* error) {
    MappingSource::of(*_mapping).collectFaults(nullptr);
    for (const auto& included : _includes->included())
        MappingSource::of(*included).collectFaults(nullptr);
    if (error != nullptr && !_faults.empty())
        *error = _faults.front().fault;
}

bool QXXMLMarshallingMapping::loadIncludedDocuments(Ref<Error>* error) {
    if (_plan != nullptr)
        return true;
    if (!_includes->load(*_mapping, error))
        return false;
    for (const auto& included : _includes->included())
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
