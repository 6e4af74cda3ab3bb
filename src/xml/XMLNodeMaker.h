#pragma once

// Makes nodes from an index: those of a whole document, or those of one entry.

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "base/MemoryBlocks.h"
#include "xml/TextPosition.h"
#include "xml/XMLIndex.h"

#include <vector>

namespace qx {

// The elements that have been made of an index, by the numbers of their entries.
class XMLElementTable {
public:
    virtual ~XMLElementTable() = default;
    // Null where there is none. One that has been made is put to use, not made again.
    virtual Ref<XMLElement> find(XMLIndex::Number number) const = 0;
    virtual void add(XMLIndex::Number number, XMLElement& element) = 0;
};

class XMLNodeMaker {
public:
    using Number = XMLIndex::Number;

    // Used on the thread that makes it; the index and the table, if any, must outlive it.
    explicit XMLNodeMaker(const XMLIndex& index, XMLElementTable* table = nullptr)
        : _index(index), _table(table), _position(index.text()), _blocks(MemoryBlocks::ofNodes()) {}

    // All nodes of the document, which has none.
    void fill(XMLDocument& document);
    // The element of an entry with all that is inside. It stands alone.
    Ref<XMLElement> element(Number number);

private:
    // An element that is being filled.
    struct Open {
        XMLElement* element;
        const XMLIndexEntry* entry;
    };

    void fill(std::vector<Open>& open, Number from, Number end);
    Ref<XMLElement> start(Number number);
    void addContent(XMLElement& element, const XMLIndexEntry& entry, Number number);
    void addAttribute(XMLElement& element, const XMLIndexEntry& entry);
    XMLNode* newNode(XMLNodeKind kind, const XMLIndexEntry& entry);

    const XMLIndex& _index;
    XMLElementTable* const _table;
    TextPosition _position;
    MemoryBlocks& _blocks;
    std::string _room;
};

} // namespace qx
