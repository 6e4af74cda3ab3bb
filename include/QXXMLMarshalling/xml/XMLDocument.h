#pragma once

// A document: one root element, with comments and processing instructions around it.
//
//     qx::Ref<qx::Error> error;
//     auto document = qx::XMLDocument::initWithContentsOfFile("order.xml", {}, &error);
//     if (!document) std::cerr << error->localizedDescription().view();
//
// Parsing reads the given bytes and nothing else: no other file, no network, whatever the document
// says. Internal entities and attribute defaults of the internal subset work, an entity that stands
// elsewhere is an error; CDATA and entities become text. A parameter entity that stands elsewhere
// is left out; unless the document says standalone="yes", what is declared behind it is left out
// too. Limits bound depth, text size, what is declared, what entities bring in (1 MB and five times
// the document), an element's attributes and declarations (4,096), the declarations in force
// (1,000), different names (100,000), and the whole (2 GB); in a DOCTYPE, attribute defaults
// (2,000), the depth of entities (32) and the attributes of a tag inside one (512). Beyond one, and
// for anything that is no well-formed XML, the result is null and the error says what, where:
// domain qx::Error::parserDomain, the parser's code and text, line() and column(). Where memory
// lacks, std::bad_alloc comes out. Any number of threads may parse at the same time.
//
// Codes, texts in English and the last few columns of what is no well-formed XML are those of the
// libxml2 in use, and differ among its versions; limits and all else do not, with one exception: in
// documents with a DOCTYPE, and in those that are no UTF-8, elements never nest deeper than 2,048
// from 2.12 on, whatever the host says. In no version a value or a comment is larger than 1 GB.
//
// What is parsed is kept as text, with an index of a few bytes for each node; the nodes are made
// when the first one is asked for, by whatever thread, and the text goes then. Parsing takes at
// most 64 MiB and eight times the bytes; a tree of nodes takes some 70 bytes for each text or
// comment and 110 for each element.
//
// A document's short texts share memory, a kilobyte each time: whoever keeps single ones of very
// many documents saves memory with copies, qx::String(text.view()).

#include <QXXMLMarshalling/model/Data.h>
#include <QXXMLMarshalling/model/Error.h>
#include <QXXMLMarshalling/xml/XMLElement.h>

#include <concepts>
#include <iosfwd>
#include <memory>

namespace qx {

struct XMLParseOptions {
    // Keep texts of white space only. Without it a text that is white space with a line break, in
    // an element with no other text, is layout and dropped, unless xml:space="preserve" is in
    // force.
    bool keepWhiteSpace = false;
    // How deep elements may nest.
    std::size_t maximumDepth = 256;
    // The largest text, comment, attribute value or name in bytes.
    std::size_t maximumTextSize = 10'000'000;
    // How many bytes a DOCTYPE may declare in the document itself, with what parameter entities
    // bring in. The parser's work grows with the square of it.
    std::size_t maximumSubsetSize = 64 * 1024;
    // Refuse any document that has a DOCTYPE.
    bool refuseDoctype = false;
};

// The bytes of a document, lent for the time of a call, which copies them.
class XMLBytes {
public:
    XMLBytes(std::string_view bytes) noexcept : _view(bytes) {}
    XMLBytes(const char* bytes, std::size_t size) noexcept : _view(bytes, size) {}
    // Any other text, such as a host's own strings.
    template <class Text>
    requires std::convertible_to<const Text&, std::string_view> XMLBytes(const Text& text)
    noexcept : _view(text) {}
    XMLBytes(const Data& data) noexcept : _view(data.view()) {}
    // A null pointer gives no bytes.
    XMLBytes(const char* text) noexcept : _view(text != nullptr ? text : "") {}

    std::string_view view() const noexcept { return _view; }

private:
    std::string_view _view;
};

class QX_API XMLDocument final : public XMLNode {
public:
    // Reads a file: a path or a file: URL. An unreadable one is an error of qx::Error::cocoaDomain
    // with code 260 (no such file), 257 (not permitted) or 256.
    static Ref<XMLDocument> initWithContentsOfURL(const String& URL,
                                                  const XMLParseOptions& options = {},
                                                  Ref<Error>* error = nullptr);
    static Ref<XMLDocument> initWithContentsOfFile(const String& path,
                                                   const XMLParseOptions& options = {},
                                                   Ref<Error>* error = nullptr);
    static Ref<XMLDocument> initWithData(XMLBytes bytes, const XMLParseOptions& options = {},
                                         Ref<Error>* error = nullptr);
    // Reads to the stream's end.
    static Ref<XMLDocument> initWithStream(std::istream& stream,
                                           const XMLParseOptions& options = {},
                                           Ref<Error>* error = nullptr);
    // A null element gives a document without a root; one that has a parent raises
    // NSInvalidArgumentException.
    static Ref<XMLDocument> initWithRootElement(Ref<XMLElement> root);
    ~XMLDocument() override;

    // Null in a document that holds no element.
    XMLElement* rootElement() const;
    XMLNode* firstChild() const override;
    // Appends an element (only one), a comment or a processing instruction.
    void addChild(Ref<XMLNode> child);

    // What messages call the document: the path of the file that it was read from, until the host
    // says something else; null for one that was read from anything else, or made by hand.
    const String& documentName() const noexcept { return _documentName; }
    void setDocumentName(const String& name) { _documentName = name; }

    // The XML declaration's parts as read or set; null where not given.
    const String& version() const noexcept { return _version; }
    void setVersion(const String& version) { _version = version; }
    const String& characterEncoding() const noexcept { return _encoding; }
    void setCharacterEncoding(const String& encoding) { _encoding = encoding; }
    const String& standalone() const noexcept { return _standalone; }
    void setStandalone(const String& standalone) { _standalone = standalone; }

    // The document as bytes, with an XML declaration when a version or an encoding is set, in that
    // encoding (UTF-8 without one); characters that the encoding lacks, or that would be read back
    // as others, go as character references.
    // Raises NSInvalidArgumentException as XMLString does, for an unknown encoding, and for what
    // could not be read again with the options `reading`: a document that was read with higher
    // limits than the default ones is written with the same.
    std::string XMLData(XMLOptions options = XMLNoOptions,
                        const XMLParseOptions& reading = {}) const;
    // The same as text. XMLString(options), as of any node, heeds no limit.
    using XMLNode::XMLString;
    String XMLString(XMLOptions options, const XMLParseOptions& reading) const;
    // Writes XMLData to a file atomically: to a temporary file beside it, which then takes its
    // place and its permissions. What a symbolic link leads to is replaced, other hard links keep
    // the old bytes, pipes and devices are refused. False with an error that says what and where
    // (512, 513, 640, 642); raises as XMLData does. The old file is then untouched.
    bool writeToFile(const String& path, XMLOptions options = XMLNoOptions,
                     Ref<Error>* error = nullptr, const XMLParseOptions& reading = {}) const;
    // False with an error when the stream fails. Raises as XMLData does, with nothing written.
    bool writeToStream(std::ostream& stream, XMLOptions options = XMLNoOptions,
                       Ref<Error>* error = nullptr, const XMLParseOptions& reading = {}) const;

    String stringValue() const override;
    void setStringValue(const String& value) override;
    Ref<XMLNode> copy() const override;

private:
    friend class XMLNode;
    friend class XMLNodeMaker;
    friend struct XMLDocumentContent;

    XMLDocument() noexcept;
    template <class Use>
    auto withBytes(XMLOptions options, const XMLParseOptions& reading, Use use) const;
    void unlink(XMLNode& node) noexcept;
    void makeNodes() const;

    struct Pending;
    std::unique_ptr<Pending> _pending; // of a document that was parsed
    XMLNode* _firstChild = nullptr;
    String _documentName;
    String _version;
    String _encoding;
    String _standalone;
};

} // namespace qx
