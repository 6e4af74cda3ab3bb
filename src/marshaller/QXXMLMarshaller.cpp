#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "files/Paths.h"
#include "marshaller/Unmarshalling.h"
#include "model/Errors.h"
#include "model/LibraryClass.h"

using qx::Error;
using qx::Ref;
using qx::String;
using qx::XMLDocument;

QXXMLMarshaller::~QXXMLMarshaller() = default;

bool QXXMLMarshaller::init(Ref<QXXMLMarshallingMapping> mapping, Ref<Error>*) {
    _mapping = std::move(mapping);
    return true;
}

Ref<QXXMLMarshaller> QXXMLMarshaller::initWithMapping(Ref<QXXMLMarshallingMapping> mapping,
                                                      Ref<Error>* error) {
    auto marshaller = qx::make<QXXMLMarshaller>();
    return marshaller->init(std::move(mapping), error) ? marshaller : nullptr;
}

Ref<QXXMLMarshaller> QXXMLMarshaller::initWithMappingXML(XMLDocument* document, Ref<Error>* error) {
    auto mapping = QXXMLMarshallingMapping::initWithDocument(document, error);
    if (!mapping || (error != nullptr && *error))
        return nullptr;
    return initWithMapping(std::move(mapping), error);
}

Ref<QXXMLMarshaller> QXXMLMarshaller::initWithMappingURL(const String& URL, Ref<Error>* error) {
    const String path = qx::pathOfURL(URL);
    if (path.isNull())
        return qx::fail(error, qx::errors::noLocalURL, URL);
    return initWithMappingFile(path, error);
}

Ref<QXXMLMarshaller> QXXMLMarshaller::initWithMappingFile(const String& path, Ref<Error>* error) {
    auto mapping = QXXMLMarshallingMapping::initWithContentsOfFile(path, error);
    if (!mapping || (error != nullptr && *error))
        return nullptr;
    return initWithMapping(std::move(mapping), error);
}

const Ref<qx::UndoManager>& QXXMLMarshaller::undoManager() {
    if (!_undoManager)
        _undoManager = qx::make<qx::UndoManager>();
    return _undoManager;
}

Ref<XMLDocument> QXXMLMarshaller::marshall(const qx::Value& object, Ref<Error>* error) {
    auto root = marshallObject(object, error);
    if (!root || (error != nullptr && *error))
        return nullptr;
    auto document = XMLDocument::initWithRootElement(std::move(root));
    document->setVersion("1.0");
    document->setCharacterEncoding("UTF-8");
    return document;
}

Ref<qx::Object> QXXMLMarshaller::unmarshall(XMLDocument* document, Ref<Error>* error) {
    auto read = document != nullptr ? qx::IndexedXML(*document)
                                    : qx::IndexedXML(nullptr, qx::IndexedXML::Content::atOnce);
    return qx::detail::readDocument(*this, read, error);
}

const qx::Class& QXXMLMarshaller::describedClass() const {
    return qx::libraryClass<QXXMLMarshaller>("QXXMLMarshaller");
}
