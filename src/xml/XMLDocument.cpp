#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <QXXMLMarshalling/base/Exception.h>

#include "files/AtomicWrite.h"
#include "files/Files.h"
#include "files/Paths.h"
#include "model/ErrorDetails.h"
#include "model/Errors.h"
#include "xml/Encoding.h"
#include "xml/XMLDocumentContent.h"
#include "xml/XMLParser.h"
#include "xml/XMLSerializer.h"
#include "xml/XMLSiblings.h"

#include <ostream>

namespace qx {

namespace {

Ref<XMLDocument> documentOf(Ref<Data> data, const XMLParseOptions& options, Ref<Error>* error) {
    return data ? XMLDocumentContent::document(XMLParser::parse(std::move(data), options, error))
                : nullptr;
}

} // namespace

Ref<XMLDocument> XMLDocument::initWithContentsOfURL(const String& URL,
                                                    const XMLParseOptions& options,
                                                    Ref<Error>* error) {
    const String path = pathOfURL(URL);
    if (!path.isNull())
        return initWithContentsOfFile(path, options, error);
    return fail(error, errors::noLocalURL, URL);
}

Ref<XMLDocument> XMLDocument::initWithContentsOfFile(const String& path,
                                                     const XMLParseOptions& options,
                                                     Ref<Error>* error) {
    auto document = documentOf(readFile(path, error), options, error);
    if (document)
        document->setDocumentName(path);
    else
        detail::ErrorDetails::nameDocument(error, path);
    return document;
}

Ref<XMLDocument> XMLDocument::initWithData(XMLBytes bytes, const XMLParseOptions& options,
                                           Ref<Error>* error) {
    return XMLDocumentContent::document(XMLParser::parseCopy(bytes, options, error));
}

Ref<XMLDocument> XMLDocument::initWithStream(std::istream& stream, const XMLParseOptions& options,
                                             Ref<Error>* error) {
    return documentOf(readStream(stream, error), options, error);
}

Ref<XMLDocument> XMLDocument::initWithRootElement(Ref<XMLElement> root) {
    auto document = Ref<XMLDocument>::adopt(new XMLDocument);
    if (root)
        document->addChild(std::move(root));
    return document;
}

XMLNode* XMLDocument::firstChild() const {
    makeNodes();
    return _firstChild;
}

XMLElement* XMLDocument::rootElement() const {
    for (XMLNode& node : children())
        if (node.isElement())
            return node.asElement();
    return nullptr;
}

void XMLDocument::addChild(Ref<XMLNode> child) {
    const auto refuse = [](const char* reason) {
        throw Exception(Exception::invalidArgument, reason);
    };
    if (!child)
        refuse("a null node cannot be added to a document");
    if (child->parent() != nullptr)
        refuse("a node that has a parent cannot be added to a document");
    switch (child->kind()) {
    case XMLNodeKind::element:
        if (rootElement() != nullptr)
            refuse("a document cannot have two root elements");
        break;
    case XMLNodeKind::comment:
    case XMLNodeKind::processingInstruction:
        break;
    default:
        refuse("a document holds an element, comments and processing instructions only");
    }
    makeNodes();
    XMLSiblings::append(*this, _firstChild, child.detach());
}

void XMLDocument::unlink(XMLNode& node) noexcept { XMLSiblings::remove(_firstChild, node); }

// Calls use(bytes) with the document's bytes in its encoding.
template <class Use>
auto XMLDocument::withBytes(XMLOptions options, const XMLParseOptions& reading, Use use) const {
    TextBuffer text;
    if (_encoding.isEmpty() || isUTF8Name(_encoding)) {
        XMLSerializer(text, options, XMLChecks::on, nullptr, &reading).write(*this);
        return use(text.view());
    }
    TextEncoder encoder(_encoding);
    XMLSerializer(text, options, XMLChecks::on, &encoder, &reading).write(*this);
    return use(encoder.encoded(text.view()));
}

std::string XMLDocument::XMLData(XMLOptions options, const XMLParseOptions& reading) const {
    return withBytes(options, reading, [](auto&& bytes) {
        return std::string(std::forward<decltype(bytes)>(bytes));
    });
}

String XMLDocument::XMLString(XMLOptions options, const XMLParseOptions& reading) const {
    TextBuffer text;
    XMLSerializer(text, options, XMLChecks::on, nullptr, &reading).write(*this);
    return text.take();
}

bool XMLDocument::writeToFile(const String& path, XMLOptions options, Ref<Error>* error,
                              const XMLParseOptions& reading) const {
    return withBytes(options, reading, [&](std::string_view bytes) {
        return writeFileAtomically(path, bytes, error);
    });
}

bool XMLDocument::writeToStream(std::ostream& stream, XMLOptions options, Ref<Error>* error,
                                const XMLParseOptions& reading) const {
    return withBytes(options, reading, [&](std::string_view bytes) {
        return qx::writeToStream(stream, bytes, error);
    });
}

String XMLDocument::stringValue() const {
    const XMLElement* root = rootElement();
    return root != nullptr ? root->stringValue() : String("");
}

void XMLDocument::setStringValue(const String& value) {
    if (XMLElement* root = rootElement())
        root->setStringValue(value);
}

Ref<XMLNode> XMLDocument::copy() const {
    auto document = Ref<XMLDocument>::adopt(new XMLDocument);
    document->_documentName = _documentName;
    document->_version = _version;
    document->_encoding = _encoding;
    document->_standalone = _standalone;
    for (const XMLNode& node : children())
        XMLSiblings::append(*document, document->_firstChild, node.copy().detach());
    return document;
}

} // namespace qx
