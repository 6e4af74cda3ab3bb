#include "marshaller/CollectionItems.h"

namespace qx::detail {

void OpenCollections::holdAll() {
    _hostActs = true;
    for (CollectionItems* items = _innermost; items != nullptr; items = items->_outer)
        items->hold();
}

void CollectionItems::setNamed(ChildLookup& source, const String& name) {
    if (source.isListed())
        setList(source.all(name));
    else
        setFirst(source.element().firstChild(), &name);
}

void CollectionItems::setChildren(ChildLookup& source) {
    if (source.isListed())
        setList(source.all());
    else
        setChildren(source.element());
}

void CollectionItems::setFirst(XMLNode* first, const String* name) {
    _name = name;
    _first = matching(first);
    _isListed = false;
    if (_open._hostActs)
        hold();
}

void CollectionItems::hold() {
    if (_isListed)
        return;
    XMLNode* node = _current != nullptr ? _current : _first;
    for (; node != nullptr; node = matching(node->nextSibling()))
        _list.emplace_back(node);
    _position = _current != nullptr ? 1 : 0;
    _isListed = true;
}

} // namespace qx::detail
