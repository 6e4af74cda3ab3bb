#pragma once

// Makes the index of a tree, so that what reads documents reads trees too. An element's content
// follows when somebody asks for it; from then on the index shows it as it stood, whatever
// becomes of the tree. Nodes are not made for that, and elements are held.

#include <QXXMLMarshalling/xml/XMLElement.h>

#include "xml/XMLIndex.h"

#include <unordered_map>

namespace qx {

class XMLTreeIndexer {
public:
    using Number = XMLIndex::Number;

    // The root's entry is the first one.
    explicit XMLTreeIndexer(XMLElement& root);
    XMLTreeIndexer(const XMLTreeIndexer&) = delete;
    XMLTreeIndexer& operator=(const XMLTreeIndexer&) = delete;

    const XMLIndex& index() const noexcept { return _index; }
    // The element of an entry, wherever it stands by now.
    XMLElement& element(Number number) const noexcept { return *_elements[number]; }

    // Makes the entries inside an element, unless they are there already; references to entries
    // are no good afterwards.
    void expand(Number element) {
        if (_isExpanded[element] == 0)
            addContent(element);
    }
    // Those of everything inside, too.
    void expandAll(Number element);

private:
    void addContent(Number element);
    void add(XMLNodeKind kind, const String& name, std::string_view value);
    void addChild(XMLNode& child);
    std::uint32_t numberOf(const String& name);

    XMLIndex _index;
    std::vector<Ref<XMLElement>> _elements; // by entry; null for other kinds
    std::vector<std::uint8_t> _isExpanded;  // likewise
    std::unordered_map<String, std::uint32_t> _numbers;
};

} // namespace qx
