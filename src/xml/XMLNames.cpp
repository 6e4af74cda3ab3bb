#include "xml/XMLNames.h"

#include "base/KnownName.h"
#include "xml/CParserText.h"
#include "xml/ParseFailure.h"

#include <new>

namespace qx {

XMLNames::Number XMLNames::add(Name local, Name prefix) {
    if (local == nullptr) // the parser had no memory for it
        throw std::bad_alloc();
    if (_count >= maximumNames)
        throw ParseFailure(parseErrors::tooManyNames, {maximumNames});
    const String name = prefix != nullptr ? String::concat({viewOf(prefix), ":", viewOf(local)})
                                          : String(viewOf(local));
    if (_count * 2 >= _entries.size()) {
        std::vector<Entry> old(_entries.size() * 2);
        old.swap(_entries);
        for (Entry& entry : old)
            if (entry.local != nullptr)
                freeEntry(entry.local, entry.prefix).number = entry.number;
    }
    const auto number = static_cast<Number>(_names.size());
    _names.push_back(knownName(name));
    freeEntry(local, prefix).number = number;
    ++_count;
    return number;
}

XMLNames::Number XMLNames::numberOfNoPrefix() {
    if (!_noPrefix) {
        _names.emplace_back("");
        _noPrefix = static_cast<Number>(_names.size() - 1);
    }
    return *_noPrefix;
}

XMLNames::Entry& XMLNames::freeEntry(Name local, Name prefix) noexcept {
    std::size_t at = slot(local, prefix);
    while (_entries[at].local != nullptr)
        at = (at + 1) & (_entries.size() - 1);
    _entries[at].local = local;
    _entries[at].prefix = prefix;
    return _entries[at];
}

} // namespace qx
