#pragma once

// The fast way from a document's text to its index: UTF-8 without a document type declaration. It
// is strict about what it accepts, so that every name, character, reference and limit is checked,
// and knows no errors: whatever is not for it, a fault as well as a DOCTYPE, it refuses, and the C
// parser reads the same text from the start. What both read, they read alike.

#include "xml/XMLIndex.h"

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <array>
#include <optional>

namespace qx {

class XMLScanner {
public:
    // None where the text is refused. A zero byte follows the text, which must outlive the index.
    static std::optional<XMLIndex> scan(std::string_view text, const XMLParseOptions& options);

private:
    using Number = XMLIndex::Number;
    struct Refused {};
    static constexpr std::uint32_t none = UINT32_MAX;

    // What a name means as an attribute's.
    enum class Meaning : std::uint8_t { plain, defaultNamespace, prefixNamespace };
    struct Name {
        std::uint32_t begin;
        std::uint32_t size;
        std::uint32_t hash;
        std::uint32_t usedAt = 0;      // the element that had it last as an attribute
        std::uint32_t local = none;    // with a prefix: the number of the name behind the colon
        std::uint32_t localUsedAt = 0; // the element that had an attribute of this local name last
        Meaning meaning = Meaning::plain;
    };
    struct Open {
        Number number;
        std::uint32_t namespaces; // how many declarations are in force
    };

    XMLScanner(std::string_view text, const XMLParseOptions& options, XMLIndex& index);

    void scanDocument();
    void scanDeclaration();
    void scanMisc();
    void scanRoot();
    void scanElementStart();
    void scanAttributes();
    void scanAttribute();
    void takeDeclaration(XMLIndexEntry& entry, const Name& name);
    void scanEndTag();
    void endElement();
    void scanText();
    void scanBlanks(bool& hasLineEnd);
    bool scanCData();
    void scanMarkup();
    void scanComment();
    void scanInstruction();
    void scanReference();
    void scanCharacterReference();
    void scanBeyondASCII();

    Number scanName();
    Number numberOf(const char* begin, std::size_t size);
    Number addName(const char* begin, std::size_t size, std::uint32_t hash);
    void growNames();
    std::uint32_t hashOf(const char* begin, std::size_t size) const noexcept;

    XMLIndexEntry& add(XMLNodeKind kind, const char* begin, Number name);
    void finish(XMLIndexEntry& entry, const char* end);
    std::uint32_t offset(const char* at) const noexcept {
        return static_cast<std::uint32_t>(at - _text.data());
    }
    bool startsWith(std::string_view markup) const noexcept {
        return static_cast<std::size_t>(_end - _at) >= markup.size() &&
               std::string_view(_at, markup.size()) == markup;
    }
    void require(bool condition) const {
        if (!condition) [[unlikely]]
            throw Refused();
    }
    void expect(char c) {
        require(*_at == c);
        ++_at;
    }
    // Whether any was there.
    bool skipWhite() noexcept;

    const std::string_view _text;
    const char* _at;
    const char* const _end; // a zero byte stands there
    const std::size_t _maximumDepth;
    const std::size_t _maximumSize;
    XMLIndex& _index;
    std::vector<XMLIndexEntry>& _entries;
    std::vector<Open> _open;
    std::vector<Name> _names;
    std::vector<Number> _slots; // an open-addressing table of names: their numbers plus one
    const std::uint32_t _seed;
    std::uint32_t _element = 0;    // counts the start tags
    std::size_t _declarations = 0; // of namespaces, in all
    bool _needsWork = false;       // of the value that is being scanned
};

} // namespace qx
