#include <QXXMLMarshalling/model/CountedSet.h>

#include "model/LibraryClass.h"
#include "model/NameIndex.h"

#include <algorithm>

namespace qx {

CountedSet::CountedSet(std::initializer_list<std::string_view> names) {
    for (const auto name : names)
        add(name);
}

CountedSet::~CountedSet() = default;

std::size_t CountedSet::positionOf(const String& name) const noexcept {
    const auto nameOf = [this](std::size_t i) -> const String& { return _entries[i].name; };
    return _index.empty() ? nameindex::scan(_entries.size(), name, nameOf)
                          : nameindex::lookUp(_index, name, nameOf);
}

void CountedSet::add(const String& name, std::size_t times) {
    if (times == 0)
        return;
    std::size_t position = positionOf(name);
    if (position == nameindex::none) {
        if (nameindex::isFull(_index, _entries.size()))
            makeRoom();
        position = _entries.size();
        _entries.push_back({name, 0});
        if (!_index.empty())
            nameindex::add(_index, name, position);
    }
    if (_entries[position].count == 0)
        ++_count;
    _entries[position].count += times;
}

void CountedSet::makeRoom() {
    // The table first: without it nothing has changed.
    std::vector<std::uint32_t> table = nameindex::tableFor(_count + 1);
    std::erase_if(_entries, [](const Entry& entry) { return entry.count == 0; });
    _index = std::move(table);
    if (_index.empty())
        return;
    for (std::size_t i = 0; i < _entries.size(); ++i)
        nameindex::add(_index, _entries[i].name, i);
}

void CountedSet::remove(const String& name) { remove(name, 1); }

void CountedSet::remove(const String& name, std::size_t times) {
    const std::size_t position = positionOf(name);
    if (position == nameindex::none || _entries[position].count == 0)
        return;
    std::size_t& count = _entries[position].count;
    count -= std::min(count, times);
    if (count == 0)
        --_count;
}

bool CountedSet::take(const String& name) {
    const std::size_t position = positionOf(name);
    if (position == nameindex::none || _entries[position].count == 0)
        return false;
    if (--_entries[position].count == 0)
        --_count;
    return true;
}

void CountedSet::removeAll() noexcept {
    _entries.clear();
    _index.clear();
    _count = 0;
}

Ref<CountedSet> CountedSet::mutableCopy() const {
    auto copy = make<CountedSet>();
    for (const Entry& entry : _entries)
        copy->add(entry.name, entry.count);
    return copy;
}

std::size_t CountedSet::countFor(const String& name) const noexcept {
    const std::size_t position = positionOf(name);
    return position != nameindex::none ? _entries[position].count : 0;
}

std::vector<String> CountedSet::names() const {
    std::vector<String> names;
    for (const Entry& entry : _entries)
        if (entry.count != 0)
            names.push_back(entry.name);
    return names;
}

String CountedSet::description() const {
    std::string text = "(";
    for (const Entry& entry : _entries) {
        if (entry.count == 0)
            continue;
        if (text.size() > 1)
            text += ", ";
        text += entry.name.view();
        text += " [" + std::to_string(entry.count) + "]";
    }
    return text + ")";
}

bool CountedSet::isEqual(const Object& other) const {
    const auto* set = dynamic_cast<const CountedSet*>(&other);
    return set != nullptr && set->_count == _count &&
           std::all_of(_entries.begin(), _entries.end(), [&](const Entry& entry) {
               return entry.count == 0 || set->countFor(entry.name) == entry.count;
           });
}

const Class& CountedSet::describedClass() const {
    return libraryClass<CountedSet>("qx::CountedSet");
}

} // namespace qx
