#pragma once

// Fills a dictionary that is new: about so many values, each under a key that is not there. Neither
// may be null. And reads one in the order in which it was filled, as most are read.

#include <QXXMLMarshalling/model/Dictionary.h>

namespace qx::detail {

struct DictionaryFilling {
    static void begin(Dictionary& dictionary, std::size_t count) {
        dictionary._entries.reserve(count);
    }
    static void append(Dictionary& dictionary, const String& key, Value&& value) {
        dictionary.append(key, std::move(value));
    }
    // As Dictionary::find, where the value may be at place `next`, which then moves on.
    static const Value* find(const Dictionary& dictionary, const String& key,
                             std::size_t& next) noexcept {
        if (next < dictionary._entries.size() && dictionary._entries[next].key.isSameAs(key))
            [[likely]] {
            const Value& value = dictionary._entries[next++].value;
            return value.isNull() ? nullptr : &value;
        }
        return dictionary.find(key);
    }
    // Whether isWanted(key) of any key that has a value.
    static bool anyKey(const Dictionary& dictionary, auto isWanted) noexcept {
        for (const Dictionary::Entry& entry : dictionary._entries)
            if (isWanted(entry.key) && !entry.value.isNull())
                return true;
        return false;
    }
};

} // namespace qx::detail
