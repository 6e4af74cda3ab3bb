#include "marshaller/ChildLookup.h"

#include <algorithm>

namespace qx::detail {

ChildLookup::ChildLookup(IndexedXML& document, Number element, Nodes nodes, std::size_t lookups)
    : _document(document), _element(element), _attributes(document.attributesOf(element)),
      _nodes(nodes), _lookups(lookups) {
    document.forEachChildFrom(_attributes.end, element, [&](Number child) {
        add(document.isElement(child) ? identity(document.name(child)) : nullptr, child);
    });
}

ChildLookup::ChildLookup(const ChildLookup& other, Nodes nodes)
    : _document(other._document), _element(other._element), _attributes(other._attributes),
      _nodes(nodes), _isCopy(true), _isWhole(other._isWhole), _lookups(other._lookups) {
    for (const Child& child : other.children())
        if (child.number != none)
            add(child.name, child.number);
}

void ChildLookup::makeRoom() {
    std::vector<Child> more(2 * _room);
    std::ranges::copy(children(), more.begin());
    _many.swap(more);
    _children = _many.data();
    _room = _many.size();
}

std::unique_ptr<ChildLookup> ChildLookup::copyOf(const ChildLookup& other) {
    return std::unique_ptr<ChildLookup>(new ChildLookup(other, Nodes::copied));
}

void ChildLookup::makeIndex() {
    _runs = std::make_unique<std::unordered_map<Name, Run>>();
    const auto all = children();
    for (std::uint32_t i = 0; i < all.size(); ++i) {
        const Child& child = all[i];
        if (child.number == none || child.name == nullptr)
            continue;
        Run& run = (*_runs)[child.name];
        if (run.first == none)
            run.first = i;
        else
            all[run.last].next = i;
        run.last = i;
    }
}

template <class Visit>
void ChildLookup::forEachNamed(const String& name, Visit visit) {
    indexIfWorthIt();
    const Name wanted = identity(name);
    if (isIndexed()) {
        const auto run = _runs->find(wanted);
        std::uint32_t at = run != _runs->end() ? run->second.first : none;
        while (at != none && visit(children()[at].number))
            at = children()[at].next;
        return;
    }
    for (const Child& child : children())
        if (child.name == wanted && child.number != none && !visit(child.number))
            return;
}

ChildLookup::Found ChildLookup::find(const String& name) {
    Found found;
    forEachNamed(name, [&](Number child) {
        found.several = found.first != none;
        if (!found.several)
            found.first = child;
        return !found.several;
    });
    return found;
}

ChildLookup::Number ChildLookup::last(const String& name) {
    Number last = none;
    forEachNamed(name, [&](Number child) { return (last = child) != none; });
    return last;
}

std::vector<ChildLookup::Number> ChildLookup::all(const String& name) {
    std::vector<Number> numbers;
    forEachNamed(name, [&](Number child) {
        numbers.push_back(child);
        return true;
    });
    return numbers;
}

std::vector<ChildLookup::Number> ChildLookup::all() const {
    std::vector<Number> numbers;
    numbers.reserve(children().size());
    forEachChild([&](Number child) { numbers.push_back(child); });
    return numbers;
}

Value ChildLookup::stringValue() const {
    if (_isWhole)
        return _document.text(_element);
    std::string text;
    forEachChild([&](Number child) {
        if (_document.isElement(child))
            text += _document.text(child).view();
        else if (_document.kind(child) == XMLNodeKind::text)
            text += _document.value(child).view();
    });
    return text;
}

void ChildLookup::take(Number child) {
    _isWhole = false;
    if (!_isCopy)
        _document.detach(child);
    if (isIndexed()) {
        const auto run = _runs->find(identity(_document.name(child)));
        Child& first = children()[run->second.first];
        first.number = none;
        run->second.first = first.next;
        if (first.next == none)
            _runs->erase(run);
        return;
    }
    for (Child& listed : children())
        if (listed.number == child)
            listed.number = none;
}

Ref<XMLNode> ChildLookup::keepElement(Number child, ReadingBudget& budget,
                                      ReadingBudget::ErrorSlot error) const {
    const bool isNew = _nodes == Nodes::copied && !_document.isMade(_nodes, child);
    const bool fits = budget.takeKept(1, _element, error) &&
                      (!isNew || budget.takeKept(_document.extent(child).nodes, child, error));
    return fits ? _document.element(_nodes, child) : nullptr;
}

// Of an element's attributes the objects flattened into it keep the same copies: these count once,
// when they are made.
Ref<XMLNode> ChildLookup::keepAttribute(Number attribute, Number holder, ReadingBudget& budget,
                                        ReadingBudget::ErrorSlot error) const {
    const bool counts = _nodes == Nodes::own || !_document.isMade(_nodes, attribute);
    return budget.takeKept(counts ? 1 : 0, _element, error)
               ? _document.attribute(_nodes, holder, attribute)
               : nullptr;
}

} // namespace qx::detail
