#pragma once

// How often the fields of one element consumed each name. Documents mostly hold their children in
// the order of the fields: then taking the names in document order only compares each with the next
// one that was added. The first name out of order has the rest counted.

#include <QXXMLMarshalling/model/CountedSet.h>

namespace qx::detail {

class ConsumedNames {
public:
    ConsumedNames() = default;
    explicit ConsumedNames(const CountedSet& set) : _rest(set.mutableCopy()) {}
    ConsumedNames(const ConsumedNames& other)
        : _added(other._added), _next(other._next),
          _rest(other._rest ? other._rest->mutableCopy() : nullptr) {}
    ConsumedNames(ConsumedNames&& other) noexcept = default;
    ConsumedNames& operator=(ConsumedNames other) noexcept {
        _added.swap(other._added);
        std::swap(_next, other._next);
        std::swap(_rest, other._rest);
        return *this;
    }

    // Not once the first was taken.
    void add(const String& name) { _added.push_back(name); }
    // Lowers the name's count by one; false where it is none.
    bool take(const String& name) {
        if (_next < _added.size() && _added[_next].isSameAs(name)) {
            ++_next;
            return true;
        }
        return countRest().take(name);
    }
    void clear() noexcept {
        _added.clear();
        _next = 0;
        _rest.reset();
    }
    // Adds the counts to the set: all of them, or none where memory fails.
    void addTo(CountedSet& set) const {
        std::size_t added = 0;
        try {
            for (; added < _added.size(); ++added)
                set.add(_added[added]);
        } catch (...) {
            takeFrom(set, added);
            throw;
        }
    }
    void takeFrom(CountedSet& set) const { takeFrom(set, _added.size()); }

private:
    void takeFrom(CountedSet& set, std::size_t count) const {
        for (std::size_t i = 0; i < count; ++i)
            set.remove(_added[i]);
    }
    CountedSet& countRest() {
        if (!_rest)
            _rest = make<CountedSet>();
        for (; _next < _added.size(); ++_next)
            _rest->add(_added[_next]);
        return *_rest;
    }

    std::vector<String> _added;
    std::size_t _next = 0; // of those that were neither taken nor counted
    Ref<CountedSet> _rest;
};

} // namespace qx::detail
