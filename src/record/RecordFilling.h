#pragma once

// Puts values straight into the contents of a record that is being read: it is new, and mostly
// nobody could hear of a change. Then none is announced and no value is copied.
//
//     record        | … tracking: no undo manager, no cache | contents | _isCacheBehind |
//                                                                |
//     contents      | key 1, value 1 | key 2, value 2 | …  <-----+
//     change cache  made when it is asked for: | key 1, null | key 2, null | …
//
// 1. Only where the record has no undo manager and no change cache, nobody observes it or refers
//    to it weakly, and its class is QXGenericRecord itself.
// 2. An announced change notes the former value of its key in the change cache. While
//    `_isCacheBehind` is set, keys of the contents may lack that note: their former value is null.
// 3. It is set when the contents are made under condition 1. It is taken back when the cache is
//    asked for, which receives what it lacks, and when the contents or the cache are replaced.
//
// Without it, records whose values are looked up field by field take 40 % more instructions; those
// of elements of the usual form (plan/UsualForm.h) have theirs appended, without a search.

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/model/Class.h>

#include "model/DictionaryFilling.h"
#include "model/LentText.h"

namespace qx::detail {

class RecordFilling {
public:
    // False when the value has to be set by key-value access; it is left alone then.
    static bool add(QXGenericRecord& record, Key key, Value&& value) {
        return !namesProperty(record, key) && addContent(record, key, std::move(value));
    }
    // The same for a key that is known to be no property of the record.
    static bool addContent(QXGenericRecord& record, Key key, Value&& value);
    // Of a record that is new and that nobody has heard of: under a key that it has not, and that
    // is no property. The value may not be null; about so many are to come in all.
    static void append(QXGenericRecord& record, Key key, Value&& value, std::size_t count) {
        if (!record._contents) [[unlikely]]
            makeContents(record, count);
        LentText::keep(value);
        DictionaryFilling::append(*record._contents, key.string(), std::move(value));
    }
    // Made when there are none.
    static const Ref<Dictionary>& contents(QXGenericRecord& record) {
        if (!record._contents) [[unlikely]]
            makeContents(record);
        return record._contents;
    }
    // Gives the change cache the notes that it lacks.
    static void completeCache(const QXGenericRecord& record, Dictionary& cache);

private:
    static bool namesProperty(const QXGenericRecord& record, Key key) {
        return key.namesProperty() && record.isa().property(key) != nullptr;
    }
    static void makeContents(QXGenericRecord& record, std::size_t count = 0);
};

} // namespace qx::detail
