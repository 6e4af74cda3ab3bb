#pragma once

// Writes nodes as XML text, appending to a buffer. Works without recursion: a tree may be of any
// depth. With checks on it raises NSInvalidArgumentException, naming the place, rather than write
// what would not be XML, or what the encoding to come cannot hold; without, it writes all as it is.
// Given the options that the text will be read with, it raises for what goes beyond their limits
// too.

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "base/TextBuffer.h"
#include "xml/WritingLimits.h"

#include <array>
#include <string>
#include <vector>

namespace qx {

class TextEncoder;

enum class XMLChecks : bool { off, on };

class XMLSerializer {
public:
    // Characters that the encoder lacks, where one is given, become character references.
    XMLSerializer(TextBuffer& output, XMLOptions options, XMLChecks checks,
                  TextEncoder* encoder = nullptr, const XMLParseOptions* reading = nullptr)
        : _output(output), _options(options), _checks(checks), _encoder(encoder), _limits(reading) {
    }

    void write(const XMLNode& node);

private:
    // How the children of an open element are laid out.
    struct Level {
        bool preserves; // xml:space="preserve" is in force
        bool isMixed;   // there is text here or around
        bool isInline() const noexcept { return preserves || isMixed; }
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
    void writeAttribute(const String& name, const String& value, const XMLElement* parent,
                        const XMLPlace& place);
    void writeNamespace(const XMLNode& declaration);
    void writeText(const XMLNode& text);
    void writeEscaped(std::string_view text, Where where, bool escapesBreaks,
                      const XMLPlace& place);
    // Text that nothing can be escaped in.
    void writeLiteral(std::string_view text, const XMLPlace& place);
    bool isEncodable(char32_t c, std::string_view character) const;
    void writeName(const String& name, const XMLPlace& place);
    void checkName(const String& name, const XMLPlace& place);

    // Of a pretty-printed document.
    void startLine(const XMLNode& child);
    void breakLine(std::size_t depth);
    Level levelOf(const XMLElement& element) const;

    bool has(XMLOptions option) const noexcept { return (_options & option) != 0; }
    bool isChecked() const noexcept { return _checks == XMLChecks::on; }
    static bool isDeclaration(const String& attribute) noexcept;

    TextBuffer& _output;
    XMLOptions _options;
    XMLChecks _checks;
    TextEncoder* _encoder;
    // The open elements, only when pretty printing.
    std::vector<Level> _levels;

    // A direct-mapped cache of names that were checked and counted, by their address: the tree that
    // is written holds them. A new name evicts the one in its slot.
    static constexpr std::size_t nameSlots = 64;
    std::array<const char*, nameSlots> _checked{};

    WritingLimits _limits;
};

} // namespace qx
