#pragma once

// Writes nodes as XML text, appending to a buffer. Works without recursion: a tree may be of any
// depth. With checks on it raises NSInvalidArgumentException, naming the place, rather than write
// what would not be XML, or what the encoding to come cannot hold; without, it writes all as it is.
// Given the options that the text will be read with, it raises for what goes beyond their limits
// too.

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "base/TextBuffer.h"

#include <array>
#include <string>
#include <unordered_set>
#include <vector>

namespace qx {

class TextEncoder;

enum class XMLChecks : bool { off, on };

class XMLSerializer {
public:
    // Characters that the encoder lacks, where one is given, become character references.
    XMLSerializer(TextBuffer& output, XMLOptions options, XMLChecks checks,
                  TextEncoder* encoder = nullptr, const XMLParseOptions* reading = nullptr)
        : _output(output), _options(options), _checks(checks), _encoder(encoder),
          _reading(reading) {}

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
    // The namespace declarations of an open element that has some.
    struct Declarations {
        std::size_t depth;
        std::size_t count;
    };
    struct Hash {
        std::size_t operator()(const String& text) const noexcept { return text.hash(); }
    };

    void writeDocument(const XMLDocument& document);
    void writeDeclaration(const XMLDocument& document);
    void writeTree(const XMLNode& top);
    void writeLeaf(const XMLNode& node);
    void startElement(const XMLElement& element);
    void endElement(const XMLElement& element);
    void startTag(const XMLElement& element);
    void endTag(const XMLElement& element);
    void writeAttribute(const String& name, const String& value, const XMLElement* parent,
                        const Place& place);
    void writeNamespace(const XMLNode& declaration);
    void writeText(const XMLNode& text);
    void writeEscaped(std::string_view text, Where where, bool escapesBreaks, const Place& place);
    // Text that nothing can be escaped in.
    void writeLiteral(std::string_view text, const Place& place);
    bool isEncodable(char32_t c, std::string_view character) const;
    void writeName(const String& name, const Place& place);
    void checkName(const String& name, const Place& place);

    // The limits of reading.
    void enter(const XMLElement& element, std::size_t attributes, std::size_t declarations);
    void leave() noexcept;
    void requireSize(std::size_t size, std::string_view what, const Place& place) const;
    void countName(const String& name, const Place& place);
    void countURI(const String& URI, const Place& place);
    void requireFewNames(const Place& place) const;
    void startLine(const XMLNode& child);
    void breakLine(std::size_t depth);
    Level levelOf(const XMLElement& element) const;

    bool has(XMLOptions option) const noexcept { return (_options & option) != 0; }
    bool isChecked() const noexcept { return _checks == XMLChecks::on; }
    static bool isDeclaration(const String& attribute) noexcept;
    [[noreturn]] static void refuse(std::string_view what, const Place& place);
    [[noreturn]] static void refuseBeyond(std::string_view what, std::size_t limit,
                                          const Place& place);

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

    // Null: there are no limits, and what follows is not kept.
    const XMLParseOptions* _reading;
    std::size_t _depth = 0;
    std::size_t _textSize = 0;   // of the text nodes that stand side by side
    std::size_t _namespaces = 0; // in force
    std::vector<Declarations> _declarations;
    std::unordered_set<String, Hash> _names;
    std::unordered_set<String, Hash> _URIs;
};

// Where the node stands, such as /order/item[2]/@name.
std::string placeOf(const XMLNode& node);

} // namespace qx
