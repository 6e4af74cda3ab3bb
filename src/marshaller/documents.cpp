// Reading objects from files, texts and streams, and writing them.

#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/base/Exception.h>

#include "files/Files.h"
#include "marshaller/Unmarshalling.h"
#include "model/Errors.h"
#include "xml/XMLParser.h"

#include <algorithm>

using qx::Error;
using qx::Ref;
using qx::String;
using qx::XMLDocument;

namespace {

constexpr qx::XMLOptions layout = qx::XMLPrettyPrint;

// What is written is meant to be read by such a marshaller, too.
qx::XMLParseOptions parseOptions(const QXXMLMarshaller& marshaller) {
    qx::XMLParseOptions options;
    // An object may stand in a wrapper, and hold a last element with text.
    options.maximumDepth = std::max(options.maximumDepth, 2 * marshaller.maximumDepth() + 1);
    return options;
}

// A lenient marshaller gives no object for a root that no class maps to, and no error either:
// whoever reads in one step is told.
Ref<qx::Object> objectOf(QXXMLMarshaller& marshaller, const qx::XMLParser::Parsed& parsed,
                         Ref<Error>* error) {
    if (!parsed)
        return nullptr;
    qx::IndexedXML document(*parsed);
    auto object = qx::detail::readDocument(marshaller, document, error);
    if (object || (error != nullptr && *error))
        return object;
    return qx::fail(error, qx::errors::noDefinitionForElement,
                    [&] { return document.quoted(document.root()); });
}

// What no XML document can hold, or none that could be read again, raises while it is written.
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
    return objectOf(*this, qx::XMLParser::parseLent(xml, parseOptions(*this), error), error);
}

Ref<qx::Object> QXXMLMarshaller::readFile(const String& path, Ref<Error>* error) {
    auto data = qx::readFile(path, error);
    if (!data)
        return nullptr;
    return objectOf(*this, qx::XMLParser::parse(std::move(data), parseOptions(*this), error),
                    error);
}

Ref<qx::Object> QXXMLMarshaller::readStream(std::istream& stream, Ref<Error>* error) {
    auto data = qx::readStream(stream, error);
    if (!data)
        return nullptr;
    return objectOf(*this, qx::XMLParser::parse(std::move(data), parseOptions(*this), error),
                    error);
}

String QXXMLMarshaller::writeString(const qx::Value& object, Ref<Error>* error) {
    const auto options = parseOptions(*this); // the getters may let go of the marshaller
    const auto document = marshall(object, error);
    if (!document)
        return nullptr;
    return written<String>([&] { return document->XMLString(layout, options); }, error);
}

bool QXXMLMarshaller::writeFile(const qx::Value& object, const String& path, Ref<Error>* error) {
    const auto options = parseOptions(*this); // the getters may let go of the marshaller
    const auto document = marshall(object, error);
    const auto write = [&] { return document->writeToFile(path, layout, error, options); };
    return document && written<bool>(write, error);
}

bool QXXMLMarshaller::writeStream(const qx::Value& object, std::ostream& stream,
                                  Ref<Error>* error) {
    const auto options = parseOptions(*this);
    const auto document = marshall(object, error);
    const auto write = [&] { return document->writeToStream(stream, layout, error, options); };
    return document && written<bool>(write, error);
}
