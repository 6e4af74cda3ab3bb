#pragma once

// Writes nodes as XML text, appending to a buffer. Works without recursion: a tree may be of any
// depth. With checks on it raises NSInvalidArgumentException, naming the place, rather than write
// what would not be XML, or what the encoding to come cannot hold; without, it writes all as it is.

#include <QXXMLMarshalling/platform/XMLDocument.h>

#include "platform/object/TextBuffer.h"

#include <string>
#include <vector>

namespace qx {

class TextEncoder;

enum class XMLChecks : bool { off, on };

class XMLSerializer {
public:
    // Characters that the encoder lacks, where one is given, become character references.
    XMLSerializer(TextBuffer& output, XMLOptions options, XMLChecks checks,
                  TextEncoder* encoder = nullptr)
        : _output(output), _options(options), _checks(checks), _encoder(encoder) {}

    void write(const XMLNode& node);

private:
    // How the children of an open element are laid out.
    struct Level {
        bool preserves; // xml:space="preserve" is in force
        bool isMixed;   // there is text here or around
        bool isInline() const noexcept { return preserves || isMixed; }
    };
    // What is being written, for messages: a node, or what an element holds instead of one.
    struct Place {
        const XMLNode& node;
        bool isItsText = false;
        const String* attributeName = nullptr; // of the node's attribute
        const XMLNode& spelledOut() const;
    };
    enum class Where { text, attribute };

    void writeDocument(const XMLDocument& document);
    void writeDeclaration(const XMLDocument& document);
    void writeTree(const XMLNode& top);
    void writeLeaf(const XMLNode& node);
    void startElement(const XMLElement& element);
    void endElement(const XMLElement& element);
    void startTag(const XMLElement& element);
    void endTag(const XMLElement& element);
    void writeAttribute(const String& name, std::string_view value, const XMLElement* parent,
                        const Place& place);
    void writeNamespace(const XMLNode& declaration);
    void writeText(const XMLNode& text);
    void writeEscaped(std::string_view text, Where where, bool escapesBreaks, const Place& place);
    // Text that nothing can be escaped in.
    void writeLiteral(std::string_view text, const Place& place);
    void writeName(std::string_view name, const Place& place);
    void startLine(const XMLNode& child);
    void breakLine(std::size_t depth);
    Level levelOf(const XMLElement& element) const;

    bool has(XMLOptions option) const noexcept { return (_options & option) != 0; }
    bool isChecked() const noexcept { return _checks == XMLChecks::on; }
    [[noreturn]] static void refuse(std::string_view what, const Place& place);

    TextBuffer& _output;
    XMLOptions _options;
    XMLChecks _checks;
    TextEncoder* _encoder;
    // The open elements, only when pretty printing.
    std::vector<Level> _levels;
};

// Where the node stands, such as /order/item[2]/@name.
std::string placeOf(const XMLNode& node);

} // namespace qx
