#pragma once

// Sets values of a record that is being read: it is new, and mostly nobody hears of it yet. Then no
// change is announced and the value is not copied.

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/model/Class.h>

namespace qx::detail {

class RecordFilling {
public:
    // False when the value has to be set by key-value access; it is left alone then.
    static bool add(QXGenericRecord& record, Key key, Value&& value) {
        const bool isContent = !key.namesProperty() || record.isa().property(key) == nullptr;
        return isContent && record.addQuietly(key, std::move(value));
    }
};

} // namespace qx::detail
