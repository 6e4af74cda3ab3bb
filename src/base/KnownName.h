#pragma once

// Names of a document as reading compares them: one that code or a mapping uses is the interned
// text, so that two of them are equal exactly when they are the same text in memory.

#include <QXXMLMarshalling/base/Key.h>

namespace qx {

// Adds nothing to what is interned.
inline String knownName(std::string_view name) {
    const Key known = Key::existing(name);
    return known.isNull() ? String(name) : known.string();
}
inline String knownName(const String& name) {
    if (name.isInterned())
        return name;
    const Key known = Key::existing(name);
    return known.isNull() ? name : known.string();
}

} // namespace qx
