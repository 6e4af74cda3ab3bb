#include "marshaller/ChildLookup.h"

namespace qx::detail {

namespace {

// Look-ups times children up to which scanning costs no more than an index.
constexpr std::size_t scanLimit = 256;

} // namespace

std::unique_ptr<ChildLookup> ChildLookup::copyOf(const ChildLookup& other) {
    auto copy = std::make_unique<ChildLookup>(other._element, nullptr, other._lookups);
    copy->_ownCopies = std::make_unique<KeptCopies>(other._element);
    copy->_copies = copy->_ownCopies.get();
    copy->_children = std::make_unique<Children>();
    copy->_children->list.reserve(other._element.childCount());
    other.forEachChild(
        [&](XMLNode& child) { copy->_children->list.push_back({Ref<XMLNode>(&child)}); });
    return copy;
}

void ChildLookup::list() {
    _children = std::make_unique<Children>();
    _children->list.reserve(_element.childCount());
    for (XMLNode& child : _element.children())
        _children->list.push_back({Ref<XMLNode>(&child)});
}

void ChildLookup::index() {
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

void ChildLookup::indexIfWorthIt() {
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
void ChildLookup::forEachNamed(const String& name, Visit visit) {
    indexIfWorthIt();
    const auto isOne = [&](const XMLNode& node) { return node.isElement() && node.name() == name; };
    if (!_children) {
        for (XMLNode& child : _element.children())
            if (isOne(child) && !visit(static_cast<XMLElement&>(child)))
                return;
        return;
    }
    const auto& list = _children->list;
    if (_children->indexed) {
        const auto run = _children->runs.find(name);
        std::uint32_t at = run != _children->runs.end() ? run->second.first : none;
        while (at != none && visit(static_cast<XMLElement&>(*list[at].node)))
            at = list[at].next;
        return;
    }
    for (const Child& child : list)
        if (!child.taken && isOne(*child.node) && !visit(static_cast<XMLElement&>(*child.node)))
            return;
}

ChildLookup::Found ChildLookup::find(const String& name) {
    Found found;
    forEachNamed(name, [&](XMLElement& child) {
        found.several = found.first != nullptr;
        if (!found.several)
            found.first = &child;
        return !found.several;
    });
    return found;
}

XMLElement* ChildLookup::last(const String& name) {
    XMLElement* last = nullptr;
    forEachNamed(name, [&](XMLElement& child) { return (last = &child) != nullptr; });
    return last;
}

ChildLookup::Nodes ChildLookup::all(const String& name) {
    Nodes nodes;
    forEachNamed(name, [&](XMLElement& child) {
        nodes.emplace_back(&child);
        return true;
    });
    return nodes;
}

ChildLookup::Nodes ChildLookup::all() const {
    Nodes nodes;
    forEachChild([&](XMLNode& child) { nodes.emplace_back(&child); });
    return nodes;
}

String ChildLookup::stringValue() const {
    if (!_ownCopies)
        return _element.stringValue();
    std::string text;
    forEachChild([&](const XMLNode& child) {
        if (child.isElement() || child.kind() == XMLNodeKind::text)
            text += child.stringValue().view();
    });
    return text;
}

// An index is dropped with a child of the element itself, which it lists no longer truly.
void ChildLookup::take(XMLElement& child) {
    if (!_ownCopies) {
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
        if (listed.node.get() == &child)
            listed.taken = true;
}

Ref<XMLNode> ChildLookup::keep(XMLNode& node, ReadingBudget& budget,
                               ReadingBudget::ErrorSlot error) const {
    // Of an element's attributes the objects flattened into it keep the same copies: these count
    // once, when they are made.
    const bool isShared = _copies != nullptr && (node.kind() == XMLNodeKind::attribute ||
                                                 node.kind() == XMLNodeKind::namespaceDeclaration);
    if (!isShared && !budget.takeKept(1, _element, error))
        return nullptr;
    return _copies != nullptr ? _copies->counterpart(node, budget, error) : Ref<XMLNode>(&node);
}

} // namespace qx::detail
