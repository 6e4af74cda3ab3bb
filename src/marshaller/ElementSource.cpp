#include "marshaller/ElementSource.h"

using qx::Ref;
using qx::String;
using qx::XMLElement;
using qx::XMLNode;

namespace {

// Look-ups times children up to which scanning costs no more than an index.
constexpr std::size_t scanLimit = 256;

} // namespace

std::unique_ptr<ElementSource> ElementSource::copyOf(const ElementSource& other) {
    auto copy = std::make_unique<ElementSource>(other._element, nullptr, other._lookups);
    copy->_ownScope = std::make_unique<CopyScope>();
    copy->_scope = copy->_ownScope.get();
    copy->_children = std::make_unique<Children>();
    copy->_children->list.reserve(other._element.childCount());
    other.forEachChild([&](XMLNode& child) { copy->_children->list.push_back({.node = &child}); });
    return copy;
}

void ElementSource::list() {
    _children = std::make_unique<Children>();
    _children->list.reserve(_element.childCount());
    for (XMLNode& child : _element.children())
        _children->list.push_back({.node = &child});
}

void ElementSource::index() {
    _children->indexed = true;
    auto& list = _children->list;
    for (std::uint32_t i = 0; i < list.size(); ++i) {
        if (list[i].taken || !list[i].node->isElement())
            continue;
        Run& run = _children->runs[list[i].node->name()];
        if (run.first == none)
            run.first = i;
        else
            list[run.last].next = i;
        run.last = i;
    }
}

void ElementSource::indexIfWorthIt() {
    if (_children && _children->indexed)
        return;
    const std::size_t children = _children ? _children->list.size() : _element.childCount();
    if (_lookups * children <= scanLimit || _lookups < 2)
        return;
    if (!_children)
        list();
    index();
}

ElementSource::Walk::Walk(ElementSource& source, String name) : _name(std::move(name)) {
    source.indexIfWorthIt();
    if (!source._children) {
        _child = source._element.firstChild();
        return;
    }
    _list = &source._children->list;
    _isIndexed = source._children->indexed;
    if (!_isIndexed)
        return;
    const auto run = source._children->runs.find(_name);
    _position = run != source._children->runs.end() ? run->second.first : none;
}

XMLElement* ElementSource::Walk::nextIndexed() noexcept {
    if (_position == none)
        return nullptr;
    const Child& child = (*_list)[_position];
    _position = child.next;
    return static_cast<XMLElement*>(child.node);
}

XMLElement* ElementSource::Walk::nextListed() noexcept {
    while (_position < _list->size()) {
        const Child& child = (*_list)[_position++];
        if (!child.taken && isOne(*child.node))
            return static_cast<XMLElement*>(child.node);
    }
    return nullptr;
}

ElementSource::Found ElementSource::find(const String& name) {
    Walk walk(*this, name);
    XMLElement* const first = walk.next();
    return {first, first != nullptr && walk.next() != nullptr};
}

XMLElement* ElementSource::last(const String& name) {
    Walk walk(*this, name);
    XMLElement* last = nullptr;
    while (XMLElement* child = walk.next())
        last = child;
    return last;
}

String ElementSource::stringValue() const {
    if (!_ownScope)
        return _element.stringValue();
    std::string text;
    forEachChild([&](const XMLNode& child) {
        if (child.isElement() || child.kind() == qx::XMLNodeKind::text)
            text += child.stringValue().view();
    });
    return text;
}

// An index is dropped with a child of the element itself, which it lists no longer truly.
void ElementSource::take(XMLElement& child) {
    if (!_ownScope) {
        _children.reset();
        child.detach();
        return;
    }
    if (_children->indexed) {
        const auto run = _children->runs.find(child.name());
        Child& first = _children->list[run->second.first];
        first.taken = true;
        run->second.first = first.next;
        if (first.next == none)
            _children->runs.erase(run);
        return;
    }
    for (Child& listed : _children->list)
        if (listed.node == &child)
            listed.taken = true;
}

Ref<XMLNode> ElementSource::keep(XMLNode& node) const {
    if (_scope == nullptr)
        return Ref<XMLNode>(&node);
    Ref<XMLNode>& copy = _scope->copies[&node];
    if (!copy)
        copy = node.copy();
    return copy;
}
