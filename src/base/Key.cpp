#include <QXXMLMarshalling/base/Key.h>

#include "base/Immortal.h"

#include <algorithm>
#include <cstring>
#include <mutex>
#include <shared_mutex>
#include <unordered_map>

namespace qx {

// The interned names.
struct NameTable {
    String::Rep* find(std::string_view name) {
        const std::shared_lock lock(mutex);
        const auto found = names.find(name);
        return found != names.end() ? found->second : nullptr;
    }

    String::Rep* intern(std::string_view name) {
        if (String::Rep* known = find(name))
            return known;
        const std::unique_lock lock(mutex);
        if (const auto found = names.find(name); found != names.end())
            return found->second;
        String::Rep* rep = String::allocate(name.size(), String::immortalBit | String::internedBit);
        if (!name.empty())
            std::memcpy(reinterpret_cast<char*>(rep + 1), name.data(), name.size());
        rep->hash.store(String::hashOf(name), std::memory_order_relaxed);
        try {
            names.emplace(std::string_view(String::text(rep), rep->size), rep);
        } catch (...) {
            String::destroy(rep);
            throw;
        }
        return rep;
    }

    std::shared_mutex mutex;
    std::unordered_map<std::string_view, String::Rep*> names;
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
