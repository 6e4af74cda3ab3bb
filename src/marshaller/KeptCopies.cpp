#include "marshaller/KeptCopies.h"

namespace qx::detail {

Ref<XMLNode> KeptCopies::find(const XMLNode& node) const {
    const auto found = _copied.find(&node);
    return found != _copied.end() ? found->second.copy : nullptr;
}

void KeptCopies::add(XMLNode& original, XMLNode& copy) {
    _copied.try_emplace(&original, Copied{Ref<XMLNode>(&original), Ref<XMLNode>(&copy)});
}

// The child, attribute or namespace of the element that the node stands in; the node itself where
// it stands in the element no more.
XMLNode& KeptCopies::topOf(XMLNode& node) const {
    XMLNode* top = &node;
    while (top->parent() != nullptr && top->parent() != &_element)
        top = top->parent();
    return top->parent() != nullptr ? *top : node;
}

bool KeptCopies::copyWhole(XMLNode& top, ReadingBudget& budget, ReadingBudget::ErrorSlot error) {
    XMLElement* element = top.asElement();
    if (element == nullptr) {
        if (!budget.takeKept(1, _element, error))
            return false;
        add(top, *top.copy());
        return true;
    }
    if (!budget.takeKept(element->extent().nodes, *element, error))
        return false;
    element->copy([this](XMLElement& original, XMLElement& copy) { add(original, copy); });
    return true;
}

// Attributes and namespaces are paired as they stand, while both elements are as they were copied.
void KeptCopies::pairAttributes(const XMLElement& original, const XMLElement& copy) {
    const auto pair = [this](XMLNodeRange originals, XMLNodeRange copies) {
        auto at = copies.begin();
        for (XMLNode& node : originals) {
            if (at == copies.end() || at->name() != node.name())
                return;
            add(node, *at);
            ++at;
        }
    };
    pair(original.attributes(), copy.attributes());
    pair(original.namespaces(), copy.namespaces());
}

Ref<XMLNode> KeptCopies::counterpart(XMLNode& node, ReadingBudget& budget,
                                     ReadingBudget::ErrorSlot error) {
    if (auto known = find(node))
        return known;
    if (_copied.empty())
        _copied.reserve(_element.childCount());
    const XMLElement* holder = node.parent() != nullptr ? node.parent()->asElement() : nullptr;
    if (holder == nullptr || !find(*holder)) {
        XMLNode& top = topOf(node);
        if (!find(top) && !copyWhole(top, budget, error))
            return nullptr;
    }
    if (holder != nullptr && !node.isElement())
        if (const auto copy = find(*holder))
            pairAttributes(*holder, *copy->asElement());
    if (!find(node) && !copyWhole(node, budget, error)) // a host has put it there since
        return nullptr;
    return find(node);
}

} // namespace qx::detail
