#include "marshaller/KeptPlacing.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Dictionary.h>

#include <algorithm>

namespace qx::detail {

namespace {

using Nodes = std::vector<Ref<XMLNode>>;

void add(Nodes& nodes, const Value& kept, XMLNodeKind kind) {
    if (const auto list = kept.as<Array>())
        for (const Value& value : *list)
            if (auto node = value.as<XMLNode>(); node && node->kind() == kind)
                nodes.push_back(std::move(node));
}

// Those without a place come last, as they are listed.
void sort(Nodes& nodes) {
    const auto orderOf = [](const Ref<XMLNode>& node) {
        const KeptPlace* const place = KeptPlace::of(*node);
        return place != nullptr ? place->order : UINT32_MAX;
    };
    std::stable_sort(nodes.begin(), nodes.end(),
                     [&](const auto& a, const auto& b) { return orderOf(a) < orderOf(b); });
}

} // namespace

KeptPlacing::KeptPlacing(ElementWriter& output, const Value& children, const Value& attributes)
    : _output(output) {
    Nodes elements;
    if (const auto byName = children.as<Dictionary>())
        for (const auto& entry : *byName)
            add(elements, entry.value, XMLNodeKind::element);
    sort(elements);
    static const Spot nowhere{{nullptr}, true, KeptPlace::all};
    for (Ref<XMLNode>& node : elements) {
        const KeptPlace* const place = KeptPlace::of(*node);
        const Spot spot = place != nullptr
                              ? Spot{identities(place->field), !place->isInside, place->items}
                              : nowhere;
        _elements[spot].push_back(std::move(node));
    }
    Nodes all;
    add(all, attributes, XMLNodeKind::attribute);
    for (Ref<XMLNode>& node : all) {
        const KeptPlace* const place = KeptPlace::of(*node);
        const bool isInside = place != nullptr && place->isInside;
        _attributes[isInside ? identities(place->field) : Field()].push_back(std::move(node));
    }
}

KeptPlacing::Field KeptPlacing::identities(const std::vector<Key>& field) {
    Field identities;
    for (const Key key : field)
        identities.push_back(key.identity());
    return identities;
}

void KeptPlacing::place(const WrittenElement& element, const std::vector<Key>& field, bool isInside,
                        std::uint32_t items) {
    if (_elements.empty())
        return;
    const Field identity = identities(field);
    auto at = _elements.lower_bound({identity, !isInside, 0});
    const auto end = _elements.upper_bound({identity, !isInside, items});
    while (at != end) {
        for (const Ref<XMLNode>& node : at->second) {
            _output.keepChild(element, node);
            _placed.push_back(node);
        }
        at = _elements.erase(at);
    }
}

bool KeptPlacing::needsWrapper() const {
    const Field field = identities(_field);
    const auto inside = _elements.lower_bound({field, false, 0});
    return (inside != _elements.end() && !inside->first.isBehind && inside->first.field == field) ||
           _attributes.contains(field);
}

void KeptPlacing::placeInside(const WrittenElement& wrapper) {
    place(wrapper, _field, true, KeptPlace::all);
    const auto attributes = _attributes.find(identities(_field));
    if (attributes == _attributes.end())
        return;
    for (const Ref<XMLNode>& node : attributes->second)
        _output.keepAttribute(wrapper, node);
    _attributes.erase(attributes);
}

void KeptPlacing::leaveField(const WrittenElement& element) {
    place(element, _field, false, KeptPlace::all);
    _field.pop_back();
}

void KeptPlacing::replaced(const WrittenElement& element) {
    for (const Ref<XMLNode>& node : _placed)
        _output.keepChild(element, node);
}

// Fields that this mapping does not have leave theirs to the end.
void KeptPlacing::finish(const WrittenElement& element) {
    Nodes rest;
    for (auto& [spot, nodes] : _elements)
        rest.insert(rest.end(), nodes.begin(), nodes.end());
    sort(rest);
    for (const Ref<XMLNode>& node : rest)
        _output.keepChild(element, node);
    for (const auto& [field, nodes] : _attributes)
        for (const Ref<XMLNode>& node : nodes)
            _output.keepAttribute(element, node);
}

} // namespace qx::detail
