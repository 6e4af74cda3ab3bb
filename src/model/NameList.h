#pragma once

// Names as class operations return them: a set or an array.

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/CountedSet.h>

namespace qx {

// False for values that are neither.
inline bool listsName(const Value& names, Key key) {
    if (const auto set = names.as<CountedSet>())
        return set->contains(key.string());
    const auto array = names.as<Array>();
    return array && array->contains(key.string());
}

} // namespace qx
