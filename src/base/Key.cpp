#include <QXXMLMarshalling/base/Key.h>

#include "base/Immortal.h"

#include <algorithm>
#include <atomic>
#include <cstring>
#include <memory>
#include <mutex>
#include <vector>

namespace qx {

// The interned names, by hash in a table with open addressing that is at most half full. Documents
// have theirs looked up all the time, so that takes no lock: a name is put into its slot whole, and
// none is ever taken out. A table that has become too small stays for who is reading it.
struct NameTable {
    String::Rep* find(std::string_view name) const noexcept {
        return find(name, String::hashOf(name));
    }

    String::Rep* intern(std::string_view name) {
        const std::uint32_t hash = String::hashOf(name);
        if (String::Rep* known = find(name, hash))
            return known;
        const std::lock_guard lock(mutex);
        if (String::Rep* known = find(name, hash))
            return known;
        if ((count + 1) * 2 > tables.back()->size())
            grow();
        String::Rep* rep = String::allocate(name.size(), String::immortalBit | String::internedBit);
        if (!name.empty())
            std::memcpy(reinterpret_cast<char*>(rep + 1), name.data(), name.size());
        rep->hash.store(hash, std::memory_order_relaxed);
        put(*tables.back(), rep);
        ++count;
        return rep;
    }

private:
    using Slots = std::vector<std::atomic<String::Rep*>>; // a power of two of them

    String::Rep* find(std::string_view name, std::uint32_t hash) const noexcept {
        const Slots& slots = *current.load(std::memory_order_acquire);
        for (std::size_t slot = hash;; ++slot) {
            String::Rep* const rep =
                slots[slot & (slots.size() - 1)].load(std::memory_order_acquire);
            if (rep == nullptr ||
                (rep->hash.load(std::memory_order_relaxed) == hash && rep->view() == name))
                return rep;
        }
    }

    static void put(Slots& slots, String::Rep* rep) noexcept {
        std::size_t slot = rep->hash.load(std::memory_order_relaxed);
        while (slots[slot & (slots.size() - 1)].load(std::memory_order_relaxed) != nullptr)
            ++slot;
        slots[slot & (slots.size() - 1)].store(rep, std::memory_order_release);
    }

    void grow() {
        auto larger = std::make_unique<Slots>(tables.back()->size() * 2);
        for (const auto& slot : *tables.back())
            if (String::Rep* const rep = slot.load(std::memory_order_relaxed))
                put(*larger, rep);
        tables.push_back(std::move(larger));
        current.store(tables.back().get(), std::memory_order_release);
    }

    std::mutex mutex; // of who adds a name
    std::size_t count = 0;
    std::vector<std::unique_ptr<Slots>> tables = [] {
        std::vector<std::unique_ptr<Slots>> first;
        first.push_back(std::make_unique<Slots>(1024));
        return first;
    }();
    std::atomic<const Slots*> current{tables.back().get()};
};

Key::Key(std::string_view name) : _rep(immortal<NameTable>().intern(name)) {}

Key::Key(const String& name) {
    if (name.isInterned())
        _rep = name._rep;
    else if (!name.isNull())
        _rep = immortal<NameTable>().intern(name.view());
}

Key Key::existing(std::string_view name) noexcept {
    Key key;
    key._rep = immortal<NameTable>().find(name);
    return key;
}

std::size_t Selector::argumentCount() const noexcept {
    const std::string_view text = name();
    return static_cast<std::size_t>(std::count(text.begin(), text.end(), ':'));
}

} // namespace qx
