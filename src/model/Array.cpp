#include <QXXMLMarshalling/model/Array.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Null.h>

#include "model/LibraryClass.h"
#include "model/Printing.h"

#include <algorithm>
#include <iterator>

namespace qx {

Array::Array(std::initializer_list<Value> items) : _items(items) {}

Array::Array(std::vector<Value> items)
    : _items(std::make_move_iterator(items.begin()), std::make_move_iterator(items.end())) {}

Array::~Array() = default;

void* Array::operator new(std::size_t size) { return detail::ObjectMemory::allocate(size); }

void Array::operator delete(void* memory) noexcept { detail::ObjectMemory::release(memory); }

namespace {

[[noreturn]] void raiseRange(std::size_t index, std::size_t count) {
    throw Exception(Exception::range,
                    String::concat({"index ", std::to_string(index), " in an array of ",
                                    std::to_string(count), " items"}));
}

} // namespace

void Array::checkUnchanged(std::size_t changes) const {
    if (changes != _changes)
        throw Exception(Exception::generic, "an array was changed while it was walked");
}

const Value& Array::at(std::size_t index) const {
    if (index >= _items.size())
        raiseRange(index, _items.size());
    return _items[index];
}

Value Array::lastObject() const { return _items.empty() ? Value() : _items.back(); }

bool Array::contains(const Value& value) const {
    // NOLINTNEXTLINE(modernize-loop-convert): an item may change the array meanwhile
    for (std::size_t i = 0; i < _items.size(); ++i)
        if (Value(_items[i]).isEqual(value))
            return true;
    return false;
}

void Array::add(Value value) {
    _items.push_back(std::move(value));
    changed();
}

void Array::insert(std::size_t index, Value value) {
    if (index > _items.size())
        raiseRange(index, _items.size());
    _items.insert(_items.begin() + static_cast<std::ptrdiff_t>(index), std::move(value));
    changed();
}

void Array::replace(std::size_t index, Value value) {
    if (index >= _items.size())
        raiseRange(index, _items.size());
    const Value replaced = std::exchange(_items[index], std::move(value));
    changed();
}

void Array::remove(std::size_t index) {
    if (index >= _items.size())
        raiseRange(index, _items.size());
    const Value removed = std::move(_items[index]);
    _items.erase(_items.begin() + static_cast<std::ptrdiff_t>(index));
    changed();
}

void Array::removeAll() {
    const auto removed = std::exchange(_items, {});
    changed();
}

Ref<Array> Array::mutableCopy() const {
    auto copy = make<Array>();
    copy->_items = _items;
    return copy;
}

String Array::description() const { return descriptionWithLocale(nullptr, 0); }

String Array::descriptionWithLocale(const Object* locale, std::size_t indent) const {
    const Printing printing(*this);
    if (!printing.mayDescend())
        return Printing::cutShort;
    std::string text = indentation(indent) + "(";
    const char* separator = "\n";
    // NOLINTNEXTLINE(modernize-loop-convert): an item may change the array meanwhile
    for (std::size_t i = 0; i < _items.size(); ++i) {
        const Value item = _items[i]; // NOLINT(performance-unnecessary-copy-initialization)
        text += separator;
        // A nested list brings its own indentation along.
        if (!item.as<Array>())
            text += indentation(indent + 1);
        text += item.descriptionWithLocale(locale, indent + 1).view();
        separator = ",\n";
    }
    return text + "\n" + indentation(indent) + ")";
}

bool Array::isEqual(const Object& other) const {
    const auto* array = dynamic_cast<const Array*>(&other);
    if (array == nullptr || array->count() != count())
        return false;
    for (std::size_t i = 0; i < std::min(count(), array->count()); ++i)
        if (!Value(_items[i]).isEqual(Value(array->_items[i])))
            return false;
    return true;
}

Value Array::valueForKey(Key key) const {
    static const Key countKey("@count");
    if (key == countKey)
        return count();
    auto values = make<Array>();
    values->reserve(count());
    for (const Value& each : *this) {
        // NOLINTNEXTLINE(performance-unnecessary-copy-initialization): its getter may take it out
        const Value item(each);
        const Object* object = item.isNullOrMarker() ? nullptr : item.object();
        const Value value = object != nullptr ? object->valueForKey(key) : Value();
        values->add(value.isNull() ? Value(Null::marker()) : value);
    }
    return values;
}

SetOutcome Array::trySetValueForKey(const Value& value, Key key) {
    for (const Value& each : *this) {
        // NOLINTNEXTLINE(performance-unnecessary-copy-initialization): its setter may take it out
        const Value item(each);
        if (item.isNullOrMarker())
            continue;
        Object* object = item.object();
        if (object == nullptr)
            return SetOutcome::unknownKey;
        const SetOutcome outcome = object->trySetValueForKey(value, key);
        if (outcome != SetOutcome::set)
            return outcome;
    }
    return SetOutcome::set;
}

const Class& Array::describedClass() const { return libraryClass<Array>("qx::Array"); }

} // namespace qx
