#pragma once

// Fills a dictionary that is new: about so many values, each under a key that is not there. Neither
// may be null. And goes over the keys of one, those of values that were removed, too.

#include <QXXMLMarshalling/model/Dictionary.h>

namespace qx::detail {

struct DictionaryFilling {
    static void begin(Dictionary& dictionary, std::size_t count) {
        dictionary._entries.reserve(count);
    }
    static void append(Dictionary& dictionary, const String& key, Value&& value) {
        dictionary.append(key, std::move(value));
    }
    // Whether one of them is such a key.
    template <class Matches>
    static bool hasKey(const Dictionary& dictionary, Matches matches) {
        for (const Dictionary::Entry& entry : dictionary._entries)
            if (matches(entry.key))
                return true;
        return false;
    }
};

} // namespace qx::detail
