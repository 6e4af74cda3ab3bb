#pragma once

// Writes nodes as XML text, appending to a buffer. Works without recursion: a tree may be of any
// depth. With checks on it raises NSInvalidArgumentException, naming the place, rather than write
// what would not be XML, or what the encoding to come cannot hold; without, it writes all as it is.
// Given the options that the text will be read with, it raises for what goes beyond their limits
// too.

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "base/TextBuffer.h"
#include "xml/WritingLimits.h"
#include "xml/XMLDraft.h"

#include <algorithm>
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
    // The draft as a document of version "1.0" and encoding "UTF-8". What it raises names no place.
    // XMLSerializerDraft.cpp.
    void write(const XMLDraft::Element& root);
    // The draft as one of the elements inside a document's root.
    void writeInside(const XMLDraft::Element& element);

private:
    // How the children of an open element are laid out.
    struct Level {
        bool preserves; // xml:space="preserve" is in force
        bool isMixed;   // there is text here or around
        bool isInline() const noexcept { return preserves || isMixed; }
    };
    enum class Where { text, attribute };

    void writeDocument(const XMLDocument& document);
    void writeDeclaration(std::string_view version, std::string_view encoding,
                          std::string_view standalone);
    void writeTree(const XMLNode& top);
    void writeLeaf(const XMLNode& node);
    void startElement(const XMLElement& element);
    void endElement(const XMLElement& element);
    void startTag(const XMLElement& element);
    // declares(prefix) tells whether the element declares that prefix besides.
    template <class Declares>
    void writeAttribute(const String& name, std::string_view value, const XMLPlace& place,
                        Declares declares);
    void writeNamespace(const String& prefix, const String& URI, const XMLPlace& place);
    void writeText(const XMLNode& text);
    void writeEscaped(std::string_view text, Where where, bool escapesBreaks,
                      const XMLPlace& place);
    // Text that nothing can be escaped in.
    void writeLiteral(std::string_view text, const XMLPlace& place);
    bool isEncodable(char32_t c, std::string_view character) const;
    void writeName(const String& name, const XMLPlace& place);
    // Looks at it once.
    void requireName(const String& name, const XMLPlace& place) {
        const char* const address = name.view().data();
        const auto number = reinterpret_cast<std::uintptr_t>(address) / 16;
        const char*& checked = _checked[(number ^ number / nameSlots) % nameSlots];
        if (isChecked() && (checked != address || address == nullptr)) {
            checkName(name, place);
            checked = address;
        }
    }
    void checkName(const String& name, const XMLPlace& place);

    // Of a pretty-printed document.
    void startLine(const XMLNode& child);
    void breakLine(std::size_t depth);
    // Deeper than documents are by default, blanks would outgrow all else.
    static std::size_t indentOf(std::size_t depth) noexcept {
        constexpr std::size_t deepestIndent = 256;
        return std::min(depth, deepestIndent) * 4;
    }
    Level enclosingLevel() const { return _levels.empty() ? Level{false, false} : _levels.back(); }
    Level levelOf(const XMLElement& element) const;

    bool has(XMLOptions option) const noexcept { return (_options & option) != 0; }
    bool isChecked() const noexcept { return _checks == XMLChecks::on; }
    static bool isDeclaration(const String& attribute) noexcept {
        const std::string_view name = attribute.view();
        return name.starts_with("xmlns") && (name.size() == 5 || name[5] == ':');
    }

    // Of a draft.
    //
    // What begins on a line of its own has that many bytes before it, 0 where it does not.
    std::size_t lineStart(bool isOnLine) const noexcept {
        return isOnLine ? 1 + indentOf(_levels.size()) : 0;
    }
    static void addLineStart(TextBuffer::Piece& piece, std::size_t size) noexcept {
        if (size == 0)
            return;
        piece += '\n';
        piece.addBlanks(size - 1);
    }
    struct DraftTag;
    void writeElement(const XMLDraft::Element& element, bool isOnLine);
    DraftTag startTag(const XMLDraft::Element& element, bool isOnLine);
    void addAttribute(const XMLDraft::Element& element, const String& name, std::string_view value,
                      DraftTag& tag);
    void writeChildren(const XMLDraft::Element& element);
    void writeLeaf(const XMLDraft::Node& leaf, bool isOnLine);
    void endTag(const String& name, bool isOnLine = false);

    TextBuffer& _output;
    XMLOptions _options;
    XMLChecks _checks;
    TextEncoder* _encoder;
    // The open elements, only when pretty printing.
    std::vector<Level> _levels;

    // A direct-mapped cache of names that were checked and counted, by their address: the tree that
    // is written holds them. A new name evicts the one in its slot. Writing orders without it takes
    // 29 % more instructions (bench/orders_bench.cpp, write).
    static constexpr std::size_t nameSlots = 256;
    std::array<const char*, nameSlots> _checked{};

    WritingLimits _limits;
};

// Writes the draft like such a document, into an empty buffer. What cannot be written raises
// NSInvalidArgumentException that names the place: what is kept may then have moved into nodes that
// are gone.
void writeDraft(const XMLDraft::Element& root, XMLOptions options, const XMLParseOptions& reading,
                TextBuffer& output);
// Likewise appends it as one of the elements inside a document's root.
void writeDraftInside(const XMLDraft::Element& element, XMLOptions options,
                      const XMLParseOptions& reading, TextBuffer& output);

template <class Declares>
void XMLSerializer::writeAttribute(const String& name, std::string_view value,
                                   const XMLPlace& place, Declares declares) {
    _limits.requireSize(value.size(), "an attribute's value is larger than", place);
    if (isChecked() && isDeclaration(name)) {
        if (declares(name.view().substr(std::min<std::size_t>(name.size(), 6))))
            refuse("a namespace is declared twice", place);
        _limits.countURI(String(value), place);
    }
    writeName(name, place);
    _output += "=\"";
    writeEscaped(value, Where::attribute, true, place);
    _output += '"';
}

} // namespace qx
