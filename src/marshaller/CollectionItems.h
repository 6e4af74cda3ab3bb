#pragma once

// The nodes that a collection's items are made from: those that there are before the first item is.
//
// The siblings are walked as they stand while nothing can change them: each is bound at once, while
// it is still in the cache (a tenth of the time of reading). Before a host's code runs, what is
// left of them is listed and held.

#include "marshaller/ChildLookup.h"

namespace qx::detail {

class CollectionItems;

// The collections that one reading is binding, an inner one inside an item of the one around it.
class OpenCollections {
public:
    explicit OpenCollections(bool hostActs) noexcept : _hostActs(hostActs) {}
    // To be called before any code of the host's may run: from then on items are held.
    void hostActs() {
        if (!_hostActs)
            holdAll();
    }

private:
    friend class CollectionItems;
    void holdAll();

    CollectionItems* _innermost = nullptr;
    bool _hostActs; // whether any code of the host's may have run
};

class CollectionItems {
public:
    explicit CollectionItems(OpenCollections& open) noexcept
        : _open(open), _outer(open._innermost) {
        open._innermost = this;
    }
    ~CollectionItems() { _open._innermost = _outer; }
    CollectionItems(const CollectionItems&) = delete;
    CollectionItems& operator=(const CollectionItems&) = delete;

    // The child elements of that name, which must outlive the items.
    void setNamed(ChildLookup& source, const String& name);
    void setChildren(ChildLookup& source);
    void setChildren(const XMLElement& wrapper) { setFirst(wrapper.firstChild(), nullptr); }

    bool isEmpty() const noexcept { return _first == nullptr && _list.empty(); }
    // Null behind the last.
    XMLNode* next() {
        if (_isListed)
            return _position < _list.size() ? _list[_position++].get() : nullptr;
        _current = _current != nullptr ? matching(_current->nextSibling()) : _first;
        _first = nullptr;
        return _current;
    }

    bool areCounted = false; // as a whole, by their bind name or their wrapper's

private:
    friend class OpenCollections;

    void setList(ChildLookup::Nodes nodes) noexcept {
        _list = std::move(nodes);
        _isListed = true;
    }
    void setFirst(XMLNode* first, const String* name);
    XMLNode* matching(XMLNode* node) const noexcept {
        while (node != nullptr && _name != nullptr &&
               !(node->isElement() && node->name() == *_name))
            node = node->nextSibling();
        return node;
    }
    // Lists and holds the one that is being bound and those that follow.
    void hold();

    OpenCollections& _open;
    CollectionItems* _outer;
    const String* _name = nullptr;
    XMLNode* _first = nullptr;   // where nothing was bound yet
    XMLNode* _current = nullptr; // what is being bound
    ChildLookup::Nodes _list;
    std::size_t _position = 0;
    bool _isListed = false;
};

} // namespace qx::detail
