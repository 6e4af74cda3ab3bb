#pragma once

// A document as its UTF-8 text and a flat array over it: one entry for each element, attribute,
// namespace declaration, text, comment and processing instruction, in the order in which they
// begin. The attributes and declarations of an element follow it, then what it contains:
//
//     <a x="1">hi<b/></a>           kind       begin  end  next
//     0         1                   element a      0   19     4
//     0123456789012345678           attribute x    6    7     2
//                                   text           9   11     3
//                                   element b     11   15     4
//
//     element                  begin: its "<"             end: behind its last ">"
//     attribute, declaration   begin, end: its value between the quotes
//     text                     begin, end: with the references and CDATA marks in it
//     comment, instruction     begin: its "<"             end: behind its ">"
//
// `next` is the entry after everything inside; that of an element's last descendant is the
// element's own. An entry holds no value: most are the span's bytes as they stand, the rest is
// worked out when somebody asks. What has no span of its own (what an entity or an attribute's
// default brings) lies aside, in a buffer of the index. The index lends its text and never changes
// once it stands: any number of threads may read it.
//
// The index of a tree (XMLTreeIndexer.h) has the same entries, but level by level: an element's
// begin and end are those of the run of entries that are its content, `next` is the next sibling's,
// and all values lie aside.
//
// White space between elements is layout, which is no content and mostly has no entry. Whether it
// is layout shows when the element around it ends: a blank text that has an entry counts only where
// its element keeps layout.

#include <QXXMLMarshalling/base/String.h>
#include <QXXMLMarshalling/xml/XMLNode.h>

#include "base/BulkArray.h"
#include "xml/TextPosition.h"

#include <span>
#include <utility>
#include <vector>

namespace qx {

struct XMLIndexEntry {
    std::uint32_t begin;
    std::uint32_t end;
    std::uint32_t next;
    // The name (see XMLIndex::name; of texts and comments nothing) above the flags and the kind:
    // one word, which is written at once. Bit fields are written one by one, and the next read
    // waits.
    std::uint32_t bits;

    enum Flag : std::uint32_t {
        // The value is not the span as it stands: references, line ends to be normalised, CDATA.
        needsWork = 1U << 3U,
        // Begin and end are places in the buffer beside the text.
        isAside = 1U << 4U,
        // A text of white space with a line break, and nothing but the document's own characters.
        isBlank = 1U << 5U,
        // An element in which blank texts are content: other text stands beside them, xml:space
        // says
        // so, or the caller.
        keepsLayout = 1U << 6U,
    };
    static constexpr std::uint32_t kindMask = 7;
    static constexpr std::uint32_t nameShift = 8;

    static XMLIndexEntry of(XMLNodeKind kind, std::uint32_t name, std::uint32_t begin) noexcept {
        return {begin, begin, 0, name << nameShift | static_cast<std::uint32_t>(kind)};
    }
    XMLNodeKind nodeKind() const noexcept { return static_cast<XMLNodeKind>(bits & kindMask); }
    std::uint32_t name() const noexcept { return bits >> nameShift; }
    bool has(Flag flag) const noexcept { return (bits & flag) != 0; }
    void setIf(bool condition, Flag flag) noexcept { bits |= condition ? flag : 0U; }
    bool isAttributeOrNamespace() const noexcept {
        return nodeKind() == XMLNodeKind::attribute ||
               nodeKind() == XMLNodeKind::namespaceDeclaration;
    }
};
static_assert(sizeof(XMLIndexEntry) == 16);

class XMLIndex {
public:
    using Number = std::uint32_t; // of an entry
    static constexpr std::uint32_t mostNames = 1U << 24U;

    explicit XMLIndex(std::string_view text, TextOrigin origin = {}) noexcept
        : _text(text), _origin(std::move(origin)) {}

    std::string_view text() const noexcept { return _text; }
    const TextOrigin& origin() const noexcept { return _origin; }
    std::span<const XMLIndexEntry> entries() const noexcept {
        return {_entries.data(), _entries.size()};
    }
    const XMLIndexEntry& operator[](Number number) const noexcept { return _entries[number]; }

    // The entries inside an element: attributes and declarations, then, from firstChild on, its
    // children, which siblingOf leads through. Empty runs end where they begin.
    Number content(Number element) const noexcept {
        return _isLevelled ? _entries[element].begin : element + 1;
    }
    Number contentEnd(Number element) const noexcept {
        return _isLevelled ? _entries[element].end : _entries[element].next;
    }
    Number firstChild(Number element) const noexcept {
        Number at = content(element);
        for (const Number end = contentEnd(element);
             at < end && _entries[at].isAttributeOrNamespace();)
            ++at;
        return at;
    }
    Number siblingOf(Number number) const noexcept { return _entries[number].next; }

    // As the XML declaration says; null where it doesn't.
    const String& version() const noexcept { return _version; }
    const String& standalone() const noexcept { return _standalone; }

    // The qualified name of an element or attribute, the target of an instruction, the prefix of a
    // declaration.
    const String& name(const XMLIndexEntry& entry) const noexcept { return _names[entry.name()]; }
    std::span<const String> names() const noexcept { return _names; }
    // The span of a text, attribute or declaration; the inside of a comment; an instruction's data.
    std::string_view span(const XMLIndexEntry& entry) const noexcept;
    // The value: the span, or, where that needs work, `room` filled with what it stands for.
    std::string_view value(const XMLIndexEntry& entry, std::string& room) const {
        const XMLNodeKind kind = entry.nodeKind();
        const bool isPlain = kind == XMLNodeKind::attribute || kind == XMLNodeKind::text;
        if (isPlain && (entry.bits & (XMLIndexEntry::needsWork | XMLIndexEntry::isAside)) == 0)
            return {_text.data() + entry.begin, entry.end - entry.begin};
        return workedOut(entry, room);
    }
    // Whether the entry, inside the element, is layout and no content.
    static bool isLayout(const XMLIndexEntry& entry, const XMLIndexEntry& element) noexcept {
        return entry.has(XMLIndexEntry::isBlank) && !element.has(XMLIndexEntry::keepsLayout);
    }

private:
    friend class XMLScanner;
    friend class XMLIndexBuilder;
    friend class XMLTreeIndexer;

    std::string_view workedOut(const XMLIndexEntry& entry, std::string& room) const;

    std::string_view _text;
    TextOrigin _origin;
    BulkArray<XMLIndexEntry> _entries;
    std::vector<String> _names;
    std::string _aside;
    bool _isLevelled = false;
    String _version;
    String _standalone;
};

} // namespace qx
