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
// 4. Work and memory grow with the text alone: a repeated attribute is found by the element
//    that had its name last (ScannedNames.h).
// 5. Layout gets no entries (a third of them otherwise, and a seventh of the time of reading large
//    documents). Where it turns out to be content, since text stands beside it, the document is
//    scanned again with entries for all of it.
// 6. A scanner lives for one call, on one thread. The index that it fills borrows the text.

#include "xml/ScannedNames.h"
#include "xml/XMLIndex.h"

#include <QXXMLMarshalling/xml/XMLDocument.h>

namespace qx {

class XMLScanner {
public:
    // What one document leaves for the next, which mostly is like it.
    struct Kept {
        ScannedNames::Kept names;
        bool hasMixedLayout = false; // white space turned out to be content
    };
    // Fills the index, which is empty, from its text; a zero byte follows that. False where the
    // text is refused: the index is empty then.
    static bool scan(XMLIndex& index, const XMLParseOptions& options, Kept* kept = nullptr);

private:
    using Number = XMLIndex::Number;
    using Refused = ScannedNames::Refused;
    using Name = ScannedNames::Name;
    using Meaning = ScannedNames::Meaning;
    // Thrown where white space that got no entry is content.
    struct MixedLayout {};
    struct Open {
        Number number;
        std::uint32_t namespaces; // how many declarations are in force
        bool keepsLayout;         // so far; see XMLIndexEntry
        bool leavesOutLayout;     // some of it has no entry
        bool preservesSpace;      // so do the elements inside
    };

    XMLScanner(XMLIndex& index, const XMLParseOptions& options, ScannedNames names,
               bool hasMixedLayout);

    static void scan(XMLIndex& index, const XMLParseOptions& options, Kept& kept);

    // Each is given the place where it begins, which is there, and answers where it ends.
    using Place = const char*;
    void scanDocument();
    Place scanDeclaration(Place at);
    Place scanMisc(Place at);
    Place scanRoot(Place at);
    Place scanElementStart(Place at);
    Place scanAttributes(Place at);
    Place scanAttribute(Place at);
    Place scanEndTag(Place at);
    Place scanText(Place at);
    Place scanIndent(Place at);
    void addLayout(Place begin, Place end);
    std::pair<Place, bool> scanBlanks(Place at);
    Place scanMarkup(Place at);
    Place scanCData(Place at);
    Place scanComment(Place at);
    Place scanInstruction(Place at);
    Place scanBehind(std::string_view closing, Place at);
    Place scanReference(Place at);
    Place scanCharacterReference(Place at);
    Place scanBeyondASCII(Place at);
    // Moves the place.
    Name& scanName(Place& at);
    Name& findName(Place at);
    Name& findNameByBytes(Place at);

    void takeMeaning(XMLIndexEntry& entry, const Name& name);
    void takeDeclaration(XMLIndexEntry& entry, const Name& name);
    void endElement(Place end);

    XMLIndexEntry& add(const XMLIndexEntry& entry);
    XMLIndexEntry& addLeaf(XMLNodeKind kind, Number name, Place begin, Place end);
    Number entryCount() const noexcept { return static_cast<Number>(_next - _first); }
    void makeRoom(std::size_t entries);
    void makeMoreRoom(std::uint32_t place);
    std::uint32_t offset(Place at) const noexcept {
        return static_cast<std::uint32_t>(at - _text.data());
    }
    bool startsWith(Place at, std::string_view markup) const noexcept {
        return static_cast<std::size_t>(_end - at) >= markup.size() &&
               std::string_view(at, markup.size()) == markup;
    }
    void require(bool condition) const {
        if (!condition) [[unlikely]]
            throw Refused();
    }
    Place expect(Place at, char c) const {
        require(*at == c);
        return at + 1;
    }

    const std::string_view _text;
    const char* const _end; // a zero byte stands there
    const std::size_t _maximumDepth;
    const std::size_t _maximumSize;
    const bool _keepsWhiteSpace;
    const bool _hasMixedLayout;
    XMLIndex& _index;
    XMLIndexEntry* _first = nullptr;
    XMLIndexEntry* _next = nullptr;
    XMLIndexEntry* _last = nullptr;
    std::vector<Open> _open;
    ScannedNames _names;
    Number _latestName = ScannedNames::none;
    std::uint32_t _element;  // counts the start tags
    bool _needsWork = false; // of the value that is being scanned
};

} // namespace qx
