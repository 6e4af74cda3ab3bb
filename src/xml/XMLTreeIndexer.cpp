#include "xml/XMLTreeIndexer.h"

#include <QXXMLMarshalling/base/Exception.h>

#include "base/KnownName.h"

namespace qx {

namespace {

// What the numbers of an entry cannot hold.
void require(bool isPossible) {
    if (!isPossible)
        throw Exception(Exception::invalidArgument, "the tree is too large to be read");
}

} // namespace

XMLTreeIndexer::XMLTreeIndexer(XMLElement& root) : _index({}) {
    _index._isLevelled = true;
    addChild(root);
}

std::uint32_t XMLTreeIndexer::numberOf(const String& name) {
    const auto [at, isNew] =
        _numbers.try_emplace(name, static_cast<std::uint32_t>(_index._names.size()));
    if (isNew) {
        require(_index._names.size() < XMLIndex::mostNames);
        _index._names.push_back(knownName(name));
    }
    return at->second;
}

void XMLTreeIndexer::add(XMLNodeKind kind, const String& name, std::string_view value) {
    require(_index._aside.size() + value.size() <= UINT32_MAX &&
            _index._entries.size() < UINT32_MAX - 1);
    auto entry = XMLIndexEntry::of(kind, name.isNull() ? 0 : numberOf(name),
                                   static_cast<std::uint32_t>(_index._aside.size()));
    _index._aside += value;
    entry.end = static_cast<std::uint32_t>(_index._aside.size());
    entry.next = static_cast<Number>(_index._entries.size()) + 1;
    entry.bits |= XMLIndexEntry::isAside | XMLIndexEntry::keepsLayout;
    _index._entries.push_back(entry);
    _elements.emplace_back();
    _isExpanded.push_back(0);
}

void XMLTreeIndexer::addChild(XMLNode& child) {
    XMLElement* const element = child.asElement();
    if (element == nullptr) {
        add(child.kind(), child.name(), child._value.view());
        _index._entries.back().setIf(child._isLayout, XMLIndexEntry::isBlank);
        return;
    }
    add(XMLNodeKind::element, element->name(), {});
    _elements.back() = Ref<XMLElement>(element);
}

void XMLTreeIndexer::addContent(Number number) {
    const XMLElement& element = *_elements[number];
    const auto begin = static_cast<Number>(_index._entries.size());
    for (const XMLNode& declaration : element.namespaces())
        add(XMLNodeKind::namespaceDeclaration, declaration.name(), declaration._value.view());
    element.forEachAttribute([this](const String& name, const String& value) {
        add(XMLNodeKind::attribute, name, value.view());
    });
    if (element.holdsText())
        add(XMLNodeKind::text, String(), element._value.view());
    else
        for (XMLNode& child : element.children())
            addChild(child);
    _index._entries[number].begin = begin;
    _index._entries[number].end = static_cast<Number>(_index._entries.size());
    _isExpanded[number] = 1;
}

void XMLTreeIndexer::expandAll(Number number) {
    expand(number);
    std::vector<Number> open{number};
    while (!open.empty()) {
        const Number element = open.back();
        open.pop_back();
        for (Number at = _index.content(element); at < _index.contentEnd(element); ++at) {
            if (_index[at].nodeKind() != XMLNodeKind::element)
                continue;
            expand(at);
            open.push_back(at);
        }
    }
}

} // namespace qx
