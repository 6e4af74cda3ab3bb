#pragma once

// The names of an element's children or attributes that no field took, with how many there are of
// each, as they are matched and as they stand in the document.

#include <QXXMLMarshalling/model/CountedSet.h>

#include "marshaller/ConsumedNames.h"
#include "xml/IndexedXML.h"

#include <vector>

namespace qx::detail {

class UnknownNames {
public:
    // Adds the node's name, unless that was consumed, which uses up a count.
    void see(const IndexedXML& document, IndexedXML::Number node, ConsumedNames& bound) {
        const String& name = document.name(node);
        if (!name.isNull() && !bound.take(name))
            add(document, node);
    }
    void add(const IndexedXML& document, IndexedXML::Number node) {
        if (!_names) {
            _names = make<CountedSet>();
            _written = document.isMatched() ? make<CountedSet>() : _names;
        }
        const std::size_t known = _names->count();
        _names->add(document.name(node));
        if (_names->count() != known)
            _firsts.push_back(node);
        if (_written != _names)
            _written->add(document.writtenName(node));
    }
    // Null where no name is left.
    const Ref<CountedSet>& names() const noexcept { return _names; }
    const Ref<CountedSet>& written() const noexcept { return _written; }
    // The first node that is left of each name.
    const std::vector<IndexedXML::Number>& firsts() const noexcept { return _firsts; }
    std::size_t countOf(const IndexedXML& document, IndexedXML::Number node) const {
        return _names->countFor(document.name(node));
    }

private:
    Ref<CountedSet> _names;
    Ref<CountedSet> _written;
    std::vector<IndexedXML::Number> _firsts;
};

} // namespace qx::detail
