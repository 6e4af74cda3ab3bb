#include <QXXMLMarshalling/model/Dictionary.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Array.h>

#include "model/LibraryClass.h"
#include "model/NameIndex.h"
#include "model/Printing.h"

#include <algorithm>
#include <atomic>
#include <utility>

namespace qx {

Dictionary::~Dictionary() { removeAll(); }

void* Dictionary::operator new(std::size_t size) { return detail::ObjectMemory::allocate(size); }

void Dictionary::operator delete(void* memory) noexcept { detail::ObjectMemory::release(memory); }

void Dictionary::checkUnchanged(std::size_t changes) const {
    if (changes != _changes)
        throw Exception(Exception::generic, "a dictionary was changed while it was walked");
}

inline std::size_t Dictionary::positionOf(const String& key) const noexcept {
    if (key.isNull())
        return nameindex::none;
    const auto keyOf = [this](std::size_t i) -> const String& { return _entries[i].key; };
    return _index ? nameindex::lookUp(*_index, key, keyOf)
                  : nameindex::scan(_entries.size(), key, keyOf);
}

const Value* Dictionary::find(const String& key) const noexcept {
    const std::size_t position = positionOf(key);
    const bool isThere = position != nameindex::none && !_entries[position].value.isNull();
    return isThere ? &_entries[position].value : nullptr;
}

Value Dictionary::get(const String& key) const {
    const Value* value = find(key);
    return value != nullptr ? *value : Value();
}

const Value& Dictionary::at(const String& key) const {
    if (const Value* value = find(key))
        return *value;
    throw Exception(Exception::undefinedKey, "a dictionary has no key " + Value(key).description());
}

namespace {

[[noreturn, gnu::cold]] void raiseNull(const String& key) {
    throw Exception(
        Exception::invalidArgument,
        String::concat({"a dictionary takes no null for its key ", Value(key).description()}));
}

inline void refuseNull(const String& key, const Value& value) {
    if (key.isNull() || value.isNull())
        raiseNull(key);
}

} // namespace

void Dictionary::set(const String& key, Value value) {
    refuseNull(key, value);
    changed();
    if (const std::size_t position = positionOf(key); position != nameindex::none) {
        // The replaced value ends last: it may lead back to this dictionary.
        const Value replaced = std::exchange(_entries[position].value, std::move(value));
        if (replaced.isNull()) {
            ++_count;
            _firstLive = std::min(_firstLive, static_cast<std::uint32_t>(position));
        }
        return;
    }
    append(key, std::move(value));
}

bool Dictionary::add(const String& key, Value&& value) {
    refuseNull(key, value);
    const std::size_t position = positionOf(key);
    if (position == nameindex::none) [[likely]] {
        changed();
        append(key, std::move(value));
        return true;
    }
    if (!_entries[position].value.isNull())
        return false;
    set(key, std::move(value));
    return true;
}

void Dictionary::appendToMany(const String& key, Value&& value) {
    static_assert(fewEntries == nameindex::scanLimit);
    if (_index == nullptr || nameindex::isFull(*_index, _entries.size()))
        makeRoom();
    _entries.emplace_back(key, std::move(value));
    if (_index)
        nameindex::add(*_index, key, _entries.size() - 1);
    ++_count;
}

// Gives the index twice the room, and drops the places of removed keys where they are too many.
void Dictionary::makeRoom() {
    // How many more keys than there are keep their places after their removal.
    constexpr std::size_t emptyPlaces = 1000;
    const bool drops = _entries.size() - _count > _count + emptyPlaces;
    Index index = nameindex::tableFor((drops ? _count : _entries.size()) + 1);
    auto room = index.empty() ? nullptr : std::make_unique<Index>(std::move(index));
    if (drops) {
        std::erase_if(_entries, [](const Entry& entry) { return entry.value.isNull(); });
        _firstLive = 0;
    }
    _index = std::move(room);
    if (!_index)
        return;
    for (std::size_t i = 0; i < _entries.size(); ++i)
        nameindex::add(*_index, _entries[i].key, i);
}

void Dictionary::remove(const String& key) {
    const std::size_t position = positionOf(key);
    if (position == nameindex::none || _entries[position].value.isNull())
        return;
    changed();
    --_count;
    const Value removed = std::exchange(_entries[position].value, {});
    passRemoved();
}

// Each removed entry is passed over once, so that removing the first key again and again is linear.
void Dictionary::passRemoved() noexcept {
    while (_firstLive < _entries.size() && _entries[_firstLive].value.isNull())
        ++_firstLive;
}

// What ends with its last count may lead back to this dictionary, and finds it empty.
void Dictionary::removeAll() {
    const Entries removed = std::exchange(_entries, {});
    changed();
    _count = 0;
    _firstLive = 0;
    _index.reset();
}

Ref<Array> Dictionary::allKeys() const {
    auto keys = make<Array>();
    for (const Entry& entry : *this)
        keys->add(entry.key);
    return keys;
}

Ref<Array> Dictionary::allValues() const {
    auto values = make<Array>();
    for (const Entry& entry : *this)
        values->add(entry.value);
    return values;
}

Ref<Dictionary> Dictionary::mutableCopy() const {
    auto copy = make<Dictionary>();
    for (const Entry& entry : *this)
        copy->set(entry.key, entry.value);
    return copy;
}

namespace {

std::atomic<Dictionary::DeepCopyFunction> installedDeepCopy{nullptr};

} // namespace

Dictionary::DeepCopyFunction Dictionary::deepCopyFunction() noexcept {
    return installedDeepCopy.load();
}

void Dictionary::setDeepCopyFunction(DeepCopyFunction function) noexcept {
    installedDeepCopy.store(function);
}

String Dictionary::description() const { return descriptionWithLocale(nullptr, 0); }

String Dictionary::descriptionWithLocale(const Object* locale, std::size_t indent) const {
    const Printing printing(*this);
    if (!printing.mayDescend())
        return Printing::cutShort;
    std::string text = indentation(indent) + "{\n";
    // NOLINTNEXTLINE(modernize-loop-convert): a value may change the dictionary meanwhile
    for (std::size_t i = 0; i < _entries.size(); ++i) {
        const Entry entry = _entries[i]; // NOLINT(performance-unnecessary-copy-initialization)
        if (entry.value.isNull())
            continue;
        text += indentation(indent + 1);
        text += entry.key.view();
        text += " = ";
        const String value = entry.value.descriptionWithLocale(locale, indent + 1);
        // A nested list begins on the key's own line.
        const std::size_t blanks = value.view().find_first_not_of(' ');
        const bool nested = entry.value.isObject() && blanks != std::string_view::npos;
        text += nested ? value.view().substr(blanks) : value.view();
        text += ";\n";
    }
    return text + indentation(indent) + "}";
}

bool Dictionary::isEqual(const Object& other) const {
    const auto* dictionary = dynamic_cast<const Dictionary*>(&other);
    if (dictionary == nullptr || dictionary->_count != _count)
        return false;
    // NOLINTNEXTLINE(modernize-loop-convert): as above
    for (std::size_t i = 0; i < _entries.size(); ++i) {
        const Entry entry = _entries[i]; // NOLINT(performance-unnecessary-copy-initialization)
        if (!entry.value.isNull() && !dictionary->get(entry.key).isEqual(entry.value))
            return false;
    }
    return true;
}

Value Dictionary::valueForKey(Key key) const {
    if (!key.view().starts_with('@'))
        return get(key.string());
    return Object::valueForKey(key.view().substr(1));
}

SetOutcome Dictionary::trySetValueForKey(const Value& value, Key key) {
    if (value.isNull())
        remove(key.string());
    else
        set(key.string(), value);
    return SetOutcome::set;
}

const Class& Dictionary::describedClass() const {
    using detail::memberProperty;
    return libraryClass<Dictionary>(
        "qx::Dictionary", {memberProperty<Dictionary, &Dictionary::count>("count"),
                           memberProperty<Dictionary, &Dictionary::allKeys>("allKeys"),
                           memberProperty<Dictionary, &Dictionary::allValues>("allValues")});
}

} // namespace qx
