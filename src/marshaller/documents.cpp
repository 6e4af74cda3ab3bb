// Reading objects from files, texts and streams, and writing them.

#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/platform/Exception.h>

#include "platform/system/Errors.h"

#include <algorithm>

using qx::Error;
using qx::Ref;
using qx::String;
using qx::XMLDocument;

namespace {

constexpr qx::XMLOptions layout = qx::XMLPrettyPrint;

qx::XMLParseOptions parseOptions(const QXXMLMarshaller& marshaller) {
    qx::XMLParseOptions options;
    // An object may stand in a wrapper, and hold a last element with text.
    options.maximumDepth = std::max(options.maximumDepth, 2 * marshaller.maximumDepth() + 1);
    return options;
}

// A name or a text that no XML document can hold raises while the tree is written.
template <class Result, class Write>
Result written(Write write, Ref<Error>* error) {
    try {
        return write();
    } catch (const qx::Exception& exception) {
        return qx::fail(error, qx::errors::textCannotBeWritten, exception.reason());
    }
}

} // namespace

Ref<qx::Object> QXXMLMarshaller::readString(qx::XMLBytes xml, Ref<Error>* error) {
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
    if (!document)
        return nullptr;
    return written<String>([&] { return document->XMLString(layout); }, error);
}

bool QXXMLMarshaller::writeFile(const qx::Value& object, const String& path, Ref<Error>* error) {
    const auto document = marshall(object, error);
    return document &&
           written<bool>([&] { return document->writeToFile(path, layout, error); }, error);
}

bool QXXMLMarshaller::writeStream(const qx::Value& object, std::ostream& stream,
                                  Ref<Error>* error) {
    const auto document = marshall(object, error);
    return document &&
           written<bool>([&] { return document->writeToStream(stream, layout, error); }, error);
}
