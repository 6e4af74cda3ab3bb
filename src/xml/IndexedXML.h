#pragma once

// A document, or an element, as one reading sees it: an index, whatever it came from, which shows
// everything as it stood at the start, and the nodes behind its entries where somebody needs one.
// Used by one thread at a time.

#include "model/LentText.h"
#include "xml/DocumentPlaces.h"
#include "xml/XMLDocumentContent.h"
#include "xml/XMLTreeIndexer.h"

#include <optional>
#include <unordered_map>

namespace qx {

class NamespaceTable;
class NodePool;

class IndexedXML {
public:
    using Number = XMLIndex::Number;
    static constexpr Number none = UINT32_MAX;

    // Borrows what was parsed, of nobody's document, which messages call by that name.
    explicit IndexedXML(const ParsedDocument& parsed, String documentName = {});
    // The document's own, without making its nodes, if it has none.
    explicit IndexedXML(XMLDocument& document);
    // Of an element the content is read at once, or, where only some of it may be needed, as it is
    // asked for.
    enum class Content : std::uint8_t { atOnce, asNeeded };
    IndexedXML(XMLElement* element, Content content);
    ~IndexedXML();
    IndexedXML(const IndexedXML&) = delete;
    IndexedXML& operator=(const IndexedXML&) = delete;

    // From here on elements and attributes are matched by namespace (MatchedNames.h), by the first
    // table that is given. A tree is read to its end for that.
    void matchBy(const NamespaceTable& table);
    // From here on as written, whatever table is given.
    void matchAsWritten() noexcept { _isAsWritten = true; }
    bool isMatched() const noexcept { return !_matched.empty(); }

    // The element that is read; none where there is none.
    Number root() const noexcept { return _root; }

    XMLNodeKind kind(Number number) const noexcept { return index()[number].nodeKind(); }
    bool isElement(Number number) const noexcept { return kind(number) == XMLNodeKind::element; }
    // The name to match by: as written, unless matchBy() was called. Null of texts and comments.
    // A name that a mapping knows is the interned one.
    const String& name(Number number) const noexcept {
        const XMLIndexEntry& entry = index()[number];
        const bool hasNone =
            entry.nodeKind() == XMLNodeKind::text || entry.nodeKind() == XMLNodeKind::comment;
        return hasNone             ? _noName
               : _interned.empty() ? index().name(entry)
                                   : _interned[nameNumber(number)];
    }
    const String& writtenName(Number number) const noexcept {
        return isMatched() ? index().name(index()[number]) : name(number);
    }
    // Where an element begins among the bytes of the document's text; 0 in a tree, which has none.
    std::size_t placeOf(Number element) const noexcept {
        return _tree ? 0 : index()[element].begin;
    }
    std::size_t size() const noexcept { return _index != nullptr ? index().text().size() : 0; }
    // The number of an element's name among those of the document.
    std::uint32_t nameNumber(Number element) const noexcept {
        return isMatched() ? _matched[element] : index()[element].name();
    }

    // Calls visit(Number) for each child, attribute or declaration of an element.
    template <class Visit>
    void forEachChild(Number element, Visit visit) {
        expand(element);
        forEachChildFrom(index().firstChild(element), element, visit);
    }
    template <class Visit>
    void forEachOfKind(XMLNodeKind kind, Number element, Visit visit) {
        expand(element);
        const Number end = index().firstChild(element);
        for (Number at = index().content(element); at < end; ++at)
            if (index()[at].nodeKind() == kind)
                visit(at);
    }
    // For who goes over whole elements: the entries, those inside an element once it is expanded,
    // and the names to match by, by their numbers.
    const XMLIndex& index() const noexcept { return *_index; }
    void expand(Number element) {
        if (_tree)
            _tree->expand(element);
    }
    const String* names() const noexcept {
        return _interned.empty() ? index().names().data() : _interned.data();
    }
    // Where the attributes and declarations of an element stand.
    struct Attributes {
        Number begin = 0;
        Number end = 0; // where the children begin
        bool haveDeclarations = false;
    };
    Attributes attributesOf(Number element) {
        expand(element);
        Attributes all{index().content(element), index().content(element), false};
        for (const Number end = index().contentEnd(element); all.end < end; ++all.end) {
            const XMLNodeKind kind = this->kind(all.end);
            if (kind != XMLNodeKind::attribute && kind != XMLNodeKind::namespaceDeclaration)
                break;
            all.haveDeclarations |= kind == XMLNodeKind::namespaceDeclaration;
        }
        return all;
    }
    // Calls visit(Number) for each child, which stand from there on.
    template <class Visit>
    void forEachChildFrom(Number first, Number element, Visit visit) const {
        const XMLIndexEntry& parent = index()[element];
        const Number end = index().contentEnd(element);
        for (Number at = first; at < end; at = index().siblingOf(at))
            if (!XMLIndex::isLayout(index()[at], parent))
                visit(at);
    }
    // Calls visit(Number) for each element of that name that stands in no other of that name, until
    // it answers false. Of a parsed document only.
    template <class Visit>
    void forEachOutermost(const String& name, Visit visit) {
        const Number end = static_cast<Number>(index().entries().size());
        for (Number at = 0; at < end;) {
            const bool isFound = isElement(at) && this->name(at) == name;
            if (isFound && !visit(at))
                return;
            at = isFound ? index().siblingOf(at) : at + 1;
        }
    }
    // Of a text, attribute or declaration, good until something else is asked for; a copy is good
    // for ever. Whoever asks for a long one gets the same.
    Value value(Number number) {
        const XMLIndexEntry& entry = index()[number];
        return entry.end - entry.begin <= longestUnshared
                   ? detail::LentText::of(index().value(entry, _room))
                   : sharedValue(number);
    }
    // All text inside an element, concatenated. Likewise.
    Value text(Number element);
    // The text that is all an element holds; none where it holds nothing or anything else.
    Number onlyText(Number element) {
        expand(element);
        const Number first = index().firstChild(element);
        const Number end = index().contentEnd(element);
        const bool isIt = first != end && index().siblingOf(first) == end &&
                          kind(first) == XMLNodeKind::text &&
                          !XMLIndex::isLayout(index()[first], index()[element]);
        return isIt ? first : none;
    }
    // The attribute of that name, which is interned; none where there is none.
    Number attribute(Number element, const String& name) {
        return attribute(element, attributesOf(element), name);
    }
    // Likewise, of the element whose attributes these are.
    Number attribute(Number element, const Attributes& all, const String& name) {
        constexpr Number mostScanned = 64;
        if (all.end - all.begin > mostScanned)
            return attributeOfMany(element, all, name);
        for (Number at = all.begin; at < all.end; ++at)
            if (this->name(at).isSameAs(name) && kind(at) == XMLNodeKind::attribute)
                return at;
        return none;
    }
    // Whether text() finds at most one text without going far.
    bool hasPlainText(Number element);

    // How much an element holds, itself included. The count ends early once there are `enough`
    // nodes in it.
    struct Extent {
        std::size_t elements = 0;
        std::size_t nodes = 0;    // of all kinds, attributes and declarations too
        std::size_t textSize = 0; // the bytes of texts, comments, instructions, attributes
    };
    Extent extent(Number element, std::size_t enough = SIZE_MAX);

    // The nodes of an entry: the document's own, or those of a private copy of it. In a copy
    // each node stands once, inside the copy of whatever else of it is kept. `holder` is the
    // element that has the attribute or declaration.
    enum class Nodes : std::uint8_t { own, copied };
    Ref<XMLNode> element(Nodes nodes, Number number);
    Ref<XMLNode> attribute(Nodes nodes, Number holder, Number number);
    // Any child, to be quoted.
    Ref<XMLNode> quoted(Number number);
    // Whether that node of the pool has been made already.
    bool isMade(Nodes nodes, Number number) const;
    // Takes the element out of the host's tree; nothing where the host has none.
    void detach(Number element);
    // Where its entries stand; good for longer than the reading. Made when first asked for.
    const std::shared_ptr<const DocumentPlaces>& places();

private:
    // Texts up to this are as fast made again as looked up.
    static constexpr std::size_t longestUnshared = 256;

    void expandAll(Number element) {
        if (_tree)
            _tree->expandAll(element);
    }
    void readTree(XMLElement* element, Content content);
    void findRoot() noexcept;
    void internNames();
    template <class Visit>
    void forEachInside(Number element, Visit visit);
    void appendText(Number element, std::string& text);
    Value sharedValue(Number number);
    Number attributeOfMany(Number element, const Attributes& all, const String& name);
    NodePool& pool(Nodes nodes);

    std::optional<XMLDocumentContent::Reader> _reader;
    std::shared_ptr<XMLTreeIndexer> _tree;
    const ParsedDocument* _parsed = nullptr;
    const XMLIndex* _index = nullptr; // what was parsed, or the tree's; null where there is nothing
    const String _noName;
    Number _root = none;
    // The names, where the index has not all that are known by now, or is matched by namespace.
    std::vector<String> _interned;
    bool _isAsWritten = false;
    std::vector<std::uint32_t> _matched; // then: of each entry, its name's number
    std::string _room;
    std::string _joined;
    std::unordered_map<Number, String> _longTexts; // of attributes, texts and elements
    // Of elements with many attributes, by name.
    std::unordered_map<Number, std::unordered_map<const void*, Number>> _attributes;
    std::unique_ptr<NodePool> _own;
    std::unique_ptr<NodePool> _copies;
    String _documentName;
    std::shared_ptr<const DocumentPlaces> _places;
};

} // namespace qx
