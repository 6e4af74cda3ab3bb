#pragma once

// Fills a dictionary that is new: about so many values, each under a key that is not there. Neither
// may be null.

#include <QXXMLMarshalling/model/Dictionary.h>

namespace qx::detail {

struct DictionaryFilling {
    static void begin(Dictionary& dictionary, std::size_t count) {
        dictionary._entries.reserve(count);
    }
    static void append(Dictionary& dictionary, const String& key, Value&& value) {
        dictionary.append(key, std::move(value));
    }
};

} // namespace qx::detail
