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

template <class Visit>
void ElementSource::forEachNamed(const String& name, Visit visit) {
    indexIfWorthIt();
    if (_children && _children->indexed) {
        const auto run = _children->runs.find(name);
        if (run == _children->runs.end())
            return;
        auto& list = _children->list;
        for (std::uint32_t i = run->second.first; i != none; i = list[i].next)
            if (!visit(static_cast<XMLElement&>(*list[i].node)))
                return;
        return;
    }
    const auto matches = [&](const XMLNode& node) {
        return node.isElement() && node.name() == name;
    };
    if (_children) {
        for (const Child& child : _children->list)
            if (!child.taken && matches(*child.node) &&
                !visit(static_cast<XMLElement&>(*child.node)))
                return;
    } else {
        for (XMLNode& child : _element.children())
            if (matches(child) && !visit(static_cast<XMLElement&>(child)))
                return;
    }
}

ElementSource::Found ElementSource::find(const String& name) {
    Found found;
    forEachNamed(name, [&](XMLElement& child) {
        found.several = found.first != nullptr;
        if (!found.several)
            found.first = &child;
        return !found.several;
    });
    return found;
}

XMLElement* ElementSource::last(const String& name) {
    XMLElement* last = nullptr;
    forEachNamed(name, [&](XMLElement& child) {
        last = &child;
        return true;
    });
    return last;
}

std::vector<XMLElement*> ElementSource::all(const String& name) {
    std::vector<XMLElement*> all;
    forEachNamed(name, [&](XMLElement& child) {
        all.push_back(&child);
        return true;
    });
    return all;
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
