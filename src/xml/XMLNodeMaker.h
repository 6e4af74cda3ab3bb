#pragma once

// Makes nodes from an index: those of a whole document, or those of one entry.

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "base/MemoryBlocks.h"
#include "xml/TextPosition.h"
#include "xml/XMLTreeIndexer.h"

namespace qx {

// The nodes that have been made of an index, by the numbers of their entries: elements, and perhaps
// attributes and declarations.
class XMLNodeTable {
public:
    virtual ~XMLNodeTable() = default;
    // Null where there is none. One that has been made is put to use, not made again.
    virtual Ref<XMLNode> find(XMLIndex::Number number) const = 0;
    // An element that was made.
    virtual void add(XMLIndex::Number number, XMLElement& element) = 0;
};

class XMLNodeMaker {
public:
    using Number = XMLIndex::Number;

    // Used on the thread that makes it; the index must outlive it, as must the table and the tree
    // that the index shows, if any.
    explicit XMLNodeMaker(const XMLIndex& index, XMLNodeTable* table = nullptr,
                          const XMLTreeIndexer* tree = nullptr)
        : _index(index), _table(table), _tree(tree), _position(index.text(), index.origin()),
          _blocks(MemoryBlocks::ofNodes()) {}

    // All nodes of the document, which has none.
    void fill(XMLDocument& document);
    // The element of an entry with all that is inside. It stands alone.
    Ref<XMLElement> element(Number number);

    // The node of an entry of any other kind.
    Ref<XMLNode> node(Number number);
    // The element's attribute or declaration of that name; null where it is there no more.
    static Ref<XMLNode> attributeOf(const XMLElement& element, XMLNodeKind kind,
                                    const String& name);

private:
    // An element whose children are being made: those from `at` to `end` are left.
    struct Open {
        XMLElement* element;
        Number number;
        Number at;
        Number end;
    };

    Open opened(XMLElement& element, Number number) const noexcept;
    Ref<XMLElement> start(Number number);
    void addAttribute(XMLElement& element, Number number);
    // The element that is to be filled; null where there is nothing to do.
    XMLElement* addElement(XMLElement& parent, Number number);
    void addContent(const Open& parent, Number number);
    XMLNode* newNode(const XMLIndexEntry& entry);
    void place(XMLElement& element, Number number);

    const XMLIndex& _index;
    XMLNodeTable* const _table;
    const XMLTreeIndexer* const _tree;
    TextPosition _position;
    MemoryBlocks& _blocks;
    std::string _room;
};

} // namespace qx
