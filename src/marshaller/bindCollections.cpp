#include "marshaller/Unmarshalling.h"

#include <QXXMLMarshalling/model/Array.h>

#include "model/Errors.h"

#include <algorithm>

using qx::String;
using qx::XMLElement;
using qx::XMLNode;

// The nodes that a collection's items are made from: those that there are before the first item is.
// The siblings are walked as they stand while nothing can change them, which finds each in memory
// that is at hand when it is bound (a tenth of the time of reading). Before a host's code runs,
// what is left of them is listed and held.
class Unmarshalling::Items {
public:
    explicit Items(Unmarshalling& reading) noexcept : _reading(reading), _outer(reading._items) {
        reading._items = this;
    }
    ~Items() { _reading._items = _outer; }
    Items(const Items&) = delete;
    Items& operator=(const Items&) = delete;

    // The child elements of that name, which must outlive the items.
    void setNamed(ElementSource& source, const String& name) {
        if (source.isListed())
            setList(source.all(name));
        else
            setFirst(source.element().firstChild(), &name);
    }
    void setChildren(ElementSource& source) {
        if (source.isListed())
            setList(source.all());
        else
            setChildren(source.element());
    }
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
    // Lists and holds the one that is being bound and those that follow, here and in all
    // collections around.
    static void holdAll(Items* innermost) {
        for (Items* items = innermost; items != nullptr; items = items->_outer)
            items->hold();
    }

    bool areCounted = false; // as a whole, by their bind name or their wrapper's

private:
    void setList(ElementSource::Nodes nodes) noexcept {
        _list = std::move(nodes);
        _isListed = true;
    }
    void setFirst(XMLNode* first, const String* name) {
        _name = name;
        _first = matching(first);
        _isListed = false;
        if (_reading._hostActs)
            hold();
    }
    XMLNode* matching(XMLNode* node) const noexcept {
        while (node != nullptr && _name != nullptr &&
               !(node->isElement() && node->name() == *_name))
            node = node->nextSibling();
        return node;
    }
    void hold() {
        if (_isListed)
            return;
        XMLNode* node = _current != nullptr ? _current : _first;
        for (; node != nullptr; node = matching(node->nextSibling()))
            _list.emplace_back(node);
        _position = _current != nullptr ? 1 : 0;
        _isListed = true;
    }

    Unmarshalling& _reading;
    Items* _outer; // of the collection whose item this one's owner is, or is inside
    const String* _name = nullptr;
    XMLNode* _first = nullptr;   // where nothing was bound yet
    XMLNode* _current = nullptr; // what is being bound
    ElementSource::Nodes _list;
    std::size_t _position = 0;
    bool _isListed = false;
};

void Unmarshalling::hostActs() {
    if (_hostActs)
        return;
    _hostActs = true;
    Items::holdAll(_items);
}

// Elements of a bind name that a class maps to are the items; of any other bind name the last
// element is a wrapper around them. Without either, all children of the element are.
bool Unmarshalling::findItems(const FieldPlan& field, const Target& target, Items& items,
                              ErrorSlot error) {
    for (const BindingPlan& binding : field.bindings) {
        if (binding.bindTo.isEmpty())
            continue;
        if (binding.classOfBindTo != nullptr) {
            items.setNamed(target.source, binding.bindTo);
        } else if (const XMLElement* wrapper = target.source.last(binding.bindTo)) {
            if (!_budget.takeVisits(wrapper->childCount(), *wrapper, error))
                return false;
            items.setChildren(*wrapper);
        }
        if (!items.isEmpty()) {
            target.bound.fields.add(binding.bindTo);
            items.areCounted = true;
            return true;
        }
    }
    const XMLElement& element = target.source.element();
    if (!_budget.takeVisits(element.childCount(), element, error))
        return false;
    items.setChildren(target.source);
    return true;
}

// Items are the elements of a bind name, whatever class their own name maps to, in the element or
// in the one wrapper that a location names. A wrapper counts instead of its items, and once found
// it is searched by the later bindings too.
bool Unmarshalling::findItemsByType(const FieldPlan& field, const Target& target, Items& items,
                                    ErrorSlot error) {
    std::unique_ptr<ElementSource> wrapper;
    ElementSource* root = &target.source;
    for (const BindingPlan& binding : field.bindings) {
        if (!binding.location.isEmpty()) {
            const auto found = root->find(binding.location);
            if (found.first == nullptr)
                continue;
            if (!found.several) {
                if (!_budget.takeVisits(found.first->childCount(), *found.first, error))
                    return false;
                wrapper = std::make_unique<ElementSource>(*found.first, target.source.scope(),
                                                          field.bindings.size());
                root = wrapper.get();
                items.areCounted = true;
                target.bound.fields.add(binding.location);
            }
        }
        if (!binding.bindTo.isEmpty())
            items.setNamed(*root, binding.bindTo);
        if (!items.isEmpty() || wrapper)
            break;
    }
    return true;
}

// Calls make(XMLNode&) for each item, and sets the list of those that were made.
template <class Make>
bool Unmarshalling::bindItems(const FieldPlan& field, const Target& target, Items& items,
                              ErrorSlot error, Make make) {
    if (items.isEmpty())
        return true;
    // Most collections are short, and alone in their element.
    constexpr std::size_t usualSize = 16;
    auto array = qx::make<qx::Array>();
    array->reserve(std::min(target.source.element().childCount(), usualSize));
    while (XMLNode* node = items.next()) {
        const auto item = make(*node);
        if (endsAfter(error))
            return false;
        if (!item)
            continue;
        if (!items.areCounted)
            target.bound.fields.add(node->name());
        if (!adopt(*item, target.object, error))
            return false;
        array->add(item);
    }
    return ObjectDoor::set(target.object, field.key, array, error);
}

bool Unmarshalling::bindCollection(const FieldPlan& field, const Target& target, ErrorSlot error) {
    if (field.collection == CollectionKind::unknown)
        return qx::fail(error, qx::errors::unknownCollectionClass, field.mapping->collection());
    if (field.hasType())
        return bindArrayByType(field, target, error);
    Items items(*this);
    if (!findItems(field, target, items, error))
        return false;
    return bindItems(field, target, items, error, [&](XMLNode& node) {
        return unmarshallNode(&node, target.source.scope(), error);
    });
}

bool Unmarshalling::bindArrayByType(const FieldPlan& field, const Target& target, ErrorSlot error) {
    if (field.typeClass == nullptr)
        return qx::fail(error, qx::errors::noMappingForClass, field.mapping->type());
    Items items(*this);
    if (!findItemsByType(field, target, items, error))
        return false;
    return bindItems(field, target, items, error, [&](XMLNode& node) {
        return build(*field.typeClass, static_cast<XMLElement&>(node), target.source.scope(),
                     error);
    });
}
