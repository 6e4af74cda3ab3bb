#pragma once

// The fast way from a document's text to its index, in one pass: UTF-8 without a document type
// declaration. What it refuses, a DOCTYPE as well as a fault, the C parser reads from the start.
//
// 1. A zero byte stands behind the text, and no class of bytes has it: every loop over bytes stops
//    there at the latest, and to look one byte ahead is always safe. Longer look-ahead is bounded
//    (startsWith).
// 2. It is strict: each name, character, reference and limit is checked. It may refuse what the C
//    parser takes, but what both take, they read alike (fuzz/xml/scanner.cpp holds them together).
// 3. It knows no errors: any doubt ends it (Refused). So every error is the C parser's.
// 4. Work and memory grow with the text alone. Names are found in a hash table whose seed differs
//    from process to process; repeated attributes are found by what the name was used for last.
// 5. A scanner lives for one call, on one thread. The index that it fills borrows the text.
//
//     _slots         | 0 | 2 | 0 | 1 | ...   by hash: the number of a name plus one, 0 where free;
//                                            open addressing, half full at most
//     _names         | "b" | "a:b" | ...     place in the text and last use as an attribute; the
//                                            local name of a prefixed one has an entry, too
//     _index._names  | "b" | "a:b" | ...     the texts, interned where some code knows them

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
