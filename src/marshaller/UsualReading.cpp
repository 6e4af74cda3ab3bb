#include "marshaller/UsualReading.h"

#include <QXXMLMarshalling/detail/StructPlacing.h>
#include <QXXMLMarshalling/model/Array.h>

#include "marshaller/FieldBinding.h"
#include "model/ObjectExtras.h"

#include <algorithm>
#include <bit>

namespace qx::detail {

using Place = UsualForm::Place;
using Slot = UsualForm::Slot;
using Form = ReadingTrace::Form;

namespace {

// What a binding tells its reading's trace, if there is one. In this namespace, so that either
// binding is as much the compiler's own as one that is no template: it inlines more of it.
class Untraced {
public:
    static constexpr bool isOn = false;

    explicit Untraced(ReadingTrace*) noexcept {}
    void take(Form, const Slot&, IndexedXML::Number, std::size_t = 0) const noexcept {}
    std::size_t uses() const noexcept { return 0; }
    void forget(std::size_t) const noexcept {}
};

class Traced {
public:
    static constexpr bool isOn = true;

    explicit Traced(ReadingTrace* trace) noexcept : _trace(*trace) {}
    void take(Form form, const Slot& slot, IndexedXML::Number entry, std::size_t item = 0) const {
        _trace.take(form, *slot.field, entry, 0, item);
    }
    std::size_t uses() const noexcept { return _trace.uses().size(); }
    void forget(std::size_t uses) const { _trace.forget(uses); }

private:
    ReadingTrace& _trace;
};

} // namespace

// One object that is bound.
template <class Tracing>
class UsualReading::Binding {
public:
    Binding(Unmarshalling& reading, const Source& source, Object& object, ErrorSlot error)
        : _reading(reading), _document(reading.document()), _source(source),
          _slots(source.plan.usualForm->slots().data()),
          _setters(reading.classUses().settersOf(source.plan, object)), _object(object),
          _error(error), _isUnheard(_setters.appends), _trace(reading.trace()) {}

    bool run() {
        for (std::uint32_t left = slotsToRead(); left != 0; left &= left - 1)
            if (!readField(static_cast<std::size_t>(std::countr_zero(left))))
                return false;
        return Tracing::isOn && _reading.isExact(&_source.plan) && hasLeft()
                   ? keepLeft()
                   : _reading.mayEnd(_source.plan, _source.number, _source.element.attributeCount(),
                                     _error);
    }

private:
    // The items of a list.
    struct Items {
        Number first;
        Number end;
        std::size_t most; // how many there may be
    };

    // Where errors are collected an object that failed is left out, as if it had never been.
    bool isPlaced(const ClassUses::Setter& setter) const noexcept {
        return setter.placed != nullptr && !_reading.isCollecting();
    }
    std::uint32_t slotsToRead() const noexcept;
    bool readField(std::size_t slot);
    [[gnu::noinline, gnu::cold]] bool passOver(const FieldPlan& field);
    bool hasLeft() const;
    [[gnu::noinline, gnu::cold]] bool keepLeft();
    // Apart, so that a level of nested objects takes the stack of one of them.
    [[gnu::noinline]] bool readValue(std::size_t slot, ErrorSlot error);
    [[gnu::noinline]] bool readItems(std::size_t slot);
    [[gnu::noinline]] bool placeItems(std::size_t slot, const Items& items);
    Items itemsOf(std::size_t slot) const;
    template <class Visit>
    bool forEach(const Items& items, const Slot& slot, Visit visit) const;
    bool hasFailed(const Slot& slot, Number item);
    bool adopt(const Value& value, ErrorSlot error);
    bool set(std::size_t slot, Value&& value, ErrorSlot error);

    Unmarshalling& _reading;
    IndexedXML& _document;
    const Source& _source;
    const Slot* const _slots;
    const ClassUses::Setters& _setters;
    Object& _object;
    const ErrorSlot _error;
    bool _isUnheard; // a record, of nobody
    [[no_unique_address]] Tracing _trace;
    std::size_t _attributesTaken = 0; // of a reading with a trace
};

bool UsualReading::readFields(Unmarshalling& reading, const Source& source, Object& object,
                              ErrorSlot error) {
    return Binding<Untraced>(reading, source, object, error).run();
}

bool UsualReading::readFieldsTraced(Unmarshalling& reading, const Source& source, Object& object,
                                    ErrorSlot error) {
    return Binding<Traced>(reading, source, object, error).run();
}

// Whether there is something that no field took: an attribute that did not fit, what else a wrapper
// holds.
template <class Tracing>
bool UsualReading::Binding<Tracing>::hasLeft() const {
    return _attributesTaken != _source.element.attributeCount() ||
           !_source.element.isAllItems(_document, *_source.plan.usualForm);
}

template <class Tracing>
bool UsualReading::Binding<Tracing>::keepLeft() {
    ChildLookup lookup(_document, _source.number, _source.nodes, 0);
    ConsumedNames none;
    return _reading.mayEndExactly(_source.plan, {_object, lookup, {none, none}, false}, _error);
}

// An element's own text is taken by its field also where there is none.
template <class Tracing>
inline std::uint32_t UsualReading::Binding<Tracing>::slotsToRead() const noexcept {
    const std::size_t text = _source.plan.usualForm->textSlot();
    const bool hasText = Tracing::isOn && text != UsualForm::mostSlots;
    return _source.element.slots() | (hasText ? 1U << text : 0U);
}

template <class Tracing>
inline bool UsualReading::Binding<Tracing>::set(std::size_t slot, Value&& value, ErrorSlot error) {
    const Key key = _slots[slot].field->key;
    // A null makes the change cache, which is to hear of what follows.
    _isUnheard = _isUnheard && !value.isNull();
    if (_isUnheard) {
        RecordFilling::append(static_cast<QXGenericRecord&>(_object), key, std::move(value),
                              _source.element.slotCount());
        return true;
    }
    const Property* const property = _setters.slots[slot].property;
    if (_setters.usesProperties && property != nullptr && property->set != nullptr &&
        !ObjectInternals::isHeard(_object))
        return property->set(*property, _object, value) ||
               ObjectAccess::refuse(_object, key, value, error);
    return ObjectAccess::set(_object, key, std::move(value), error);
}

// Who is told of the object that is to hold it has heard of that one.
template <class Tracing>
inline bool UsualReading::Binding<Tracing>::adopt(const Value& value, ErrorSlot error) {
    Object* const object = value.object();
    if (object == nullptr || ObjectAccess::plainRecord(*object) != nullptr)
        return true;
    _isUnheard = _isUnheard && object->isa().isStruct();
    return _reading.adopt(*object, _object, error);
}

template <class Tracing>
bool UsualReading::Binding<Tracing>::readValue(std::size_t slot, ErrorSlot error) {
    const Slot& taking = _slots[slot];
    const Number number = _source.element[slot];
    const bool isElement = _document.isElement(number);
    if (isElement)
        _trace.take(Form::child, taking, number);
    Value value;
    if (!isElement || taking.plan == nullptr) {
        const Number text = isElement ? _document.onlyText(number) : number;
        value = text != IndexedXML::none ? _document.value(text) : _reading.textOf(number, error);
        if (taking.place == Place::text && value.view().empty())
            return true;
    } else if (const auto& setter = _setters.slots[slot]; isPlaced(setter)) {
        StructObject held(*setter.placed, setter.property->placing->begin(_object, 1));
        return static_cast<bool>(_reading.build(*taking.plan, number, _source.nodes, error, &held));
    } else {
        value = _reading.build(*taking.plan, number, _source.nodes, error);
        if (!value.isNull() && !adopt(value, error))
            return false;
    }
    const bool isText =
        !value.isNull() && (!convertsText(*taking.field) ||
                            convertText(*taking.field, value, error, !_reading.isCollecting()));
    if (!isText || !set(slot, std::move(value), error))
        return false;
    // Of one that does not fit nothing came.
    if (Tracing::isOn && !isElement && taking.place != Place::text) {
        _trace.take(Form::attribute, taking, number);
        ++_attributesTaken;
    }
    return true;
}

template <class Tracing>
inline bool UsualReading::Binding<Tracing>::readField(std::size_t slot) {
    const FieldPlan& field = *_slots[slot].field;
    if (_slots[slot].isList())
        return readItems(slot) || passOver(field);
    if (_slots[slot].place == Place::text)
        _trace.take(Form::text, _slots[slot], _source.number);
    if (Tracing::isOn && !_source.element.has(slot))
        return true;
    Ref<Error> problem;
    if (readValue(slot, &problem) || !problem)
        return true;
    // What does not fit as an attribute is left to a child, which is not there.
    if (_slots[slot].place == Place::either && !_document.isElement(_source.element[slot]))
        return true;
    if (_error != nullptr)
        *_error = std::move(problem);
    return passOver(field);
}

template <class Tracing>
bool UsualReading::Binding<Tracing>::passOver(const FieldPlan& field) {
    ChildLookup lookup(_document, _source.number, _source.nodes, 0);
    ConsumedNames none;
    return _reading.passOverField(field, {_object, lookup, {none, none}, false}, _error);
}

template <class Tracing>
typename UsualReading::Binding<Tracing>::Items
UsualReading::Binding<Tracing>::itemsOf(std::size_t slot) const {
    const XMLIndex& index = _document.index();
    const Number number = _source.element[slot];
    if (_slots[slot].place == Place::items)
        return {number, index.contentEnd(_source.number), _source.element.childCount()};
    _document.expand(number);
    Items items{index.firstChild(number), index.contentEnd(number), 0};
    _document.forEachChildFrom(items.first, number, [&](Number) { ++items.most; });
    return items;
}

// Calls visit(Number) for each until it answers false.
template <class Tracing>
template <class Visit>
bool UsualReading::Binding<Tracing>::forEach(const Items& items, const Slot& slot,
                                             Visit visit) const {
    const XMLIndex& index = _document.index();
    const String* const names = _document.names();
    for (Number at = items.first; at < items.end; at = index.siblingOf(at)) {
        if (index[at].nodeKind() != XMLNodeKind::element)
            continue;
        const bool isItem = names[index[at].name()].isSameAs(slot.itemName);
        if (!isItem && slot.place == Place::items)
            break; // they stand one behind the other
        if (isItem && !visit(at))
            return false;
    }
    return true;
}

template <class Tracing>
inline bool UsualReading::Binding<Tracing>::hasFailed(const Slot& slot, Number item) {
    if ((_error == nullptr || !*_error) && !_reading.budget().isSpent())
        return false;
    _reading.locate(_error, item, slot.field, _reading.currentClass());
    return true;
}

template <class Tracing>
bool UsualReading::Binding<Tracing>::readItems(std::size_t slot) {
    const Slot& taking = _slots[slot];
    const Items items = itemsOf(slot);
    if (taking.place == Place::wrapped &&
        !_reading.budget().takeVisits(items.most, _source.element[slot], _error))
        return false;
    if (taking.place == Place::wrapped)
        _trace.take(Form::wrapper, taking, _source.element[slot]);
    if (isPlaced(_setters.slots[slot]))
        return placeItems(slot, items);
    // Few may be made of very many.
    constexpr std::size_t usualSize = 16;
    Ref<Array> array;
    const bool areRead = forEach(items, taking, [&](Number node) {
        if (!array) {
            array = make<Array>();
            array->reserve(std::min(items.most, usualSize));
        }
        const std::size_t before = _trace.uses();
        _trace.take(Form::item, taking, node, array->count());
        Value item = taking.plan != nullptr
                         ? Value(_reading.build(*taking.plan, node, _source.nodes, _error))
                         : itemText(_reading, *taking.field, _object, node, _error);
        if (hasFailed(taking, node))
            return _reading.passOver(_error);
        if (item.isNull()) {
            _trace.forget(before);
            return true;
        }
        if (!adopt(item, _error))
            return false;
        array->add(std::move(item));
        return true;
    });
    return areRead && (!array || set(slot, Value(std::move(array)), _error));
}

// Without a slot for errors an item that fails is left out.
template <class Tracing>
bool UsualReading::Binding<Tracing>::placeItems(std::size_t slot, const Items& items) {
    const ClassUses::Setter& setter = _setters.slots[slot];
    const StructPlacing& placing = *setter.property->placing;
    std::size_t count = 0; // of many children few may be items
    forEach(items, _slots[slot], [&](Number) { return ++count != 0; });
    void* const list = count != 0 ? placing.begin(_object, count) : nullptr;
    std::size_t made = 0;
    return forEach(items, _slots[slot], [&](Number node) {
        const std::size_t before = _trace.uses();
        _trace.take(Form::item, _slots[slot], node, made);
        StructObject held(*setter.placed, placing.add(list));
        const bool isBuilt = static_cast<bool>(
            _reading.build(*_slots[slot].plan, node, _source.nodes, _error, &held));
        if (hasFailed(_slots[slot], node))
            return false;
        if (isBuilt) {
            ++made;
        } else {
            placing.removeLast(list);
            _trace.forget(before);
        }
        return true;
    });
}

} // namespace qx::detail
