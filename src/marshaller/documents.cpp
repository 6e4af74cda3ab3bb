// Reading objects from files, texts and streams, and writing them.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include <algorithm>

using qx::Error;
using qx::Ref;
using qx::String;
using qx::XMLDocument;

namespace {

constexpr qx::XMLOptions layout = qx::XMLPrettyPrint;

qx::XMLParseOptions parseOptions(const QXXMLMarshaller& marshaller) {
    qx::XMLParseOptions options;
    options.maximumDepth = std::max(options.maximumDepth, marshaller.maximumDepth());
    return options;
}

} // namespace

Ref<qx::Object> QXXMLMarshaller::readString(std::string_view xml, Ref<Error>* error) {
    const auto document = XMLDocument::initWithData(xml, parseOptions(*this), error);
    return document ? unmarshall(document, error) : nullptr;
}

Ref<qx::Object> QXXMLMarshaller::readFile(const String& path, Ref<Error>* error) {
    const auto document = XMLDocument::initWithContentsOfFile(path, parseOptions(*this), error);
    return document ? unmarshall(document, error) : nullptr;
}

Ref<qx::Object> QXXMLMarshaller::readStream(std::istream& stream, Ref<Error>* error) {
    const auto document = XMLDocument::initWithStream(stream, parseOptions(*this), error);
    return document ? unmarshall(document, error) : nullptr;
}

String QXXMLMarshaller::writeString(const qx::Value& object, Ref<Error>* error) {
    const auto document = marshall(object, error);
    return document ? String(document->XMLData(layout)) : String();
}

bool QXXMLMarshaller::writeFile(const qx::Value& object, const String& path, Ref<Error>* error) {
    const auto document = marshall(object, error);
    return document && document->writeToFile(path, layout, error);
}

bool QXXMLMarshaller::writeStream(const qx::Value& object, std::ostream& stream,
                                  Ref<Error>* error) {
    const auto document = marshall(object, error);
    return document && document->writeToStream(stream, layout, error);
}
