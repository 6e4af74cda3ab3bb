#include "record/RecordFilling.h"

#include <QXXMLMarshalling/model/Null.h>

namespace qx::detail {

bool RecordFilling::addContent(QXGenericRecord& record, Key key, Value&& value) {
    const bool isUnheard = (record._isCacheBehind || !record._contents) &&
                           record.tracking().isIdle() && !record.hasObserversOrWeakRefs() &&
                           &record.isa() == &QXGenericRecord::classObject();
    if (!isUnheard || value.isNull() || key.view().starts_with('@'))
        return false;
    LentText::keep(value);
    return contents(record)->add(key.string(), std::move(value));
}

void RecordFilling::makeContents(QXGenericRecord& record, std::size_t count) {
    record._contents = make<Dictionary>();
    DictionaryFilling::begin(*record._contents, count);
    record._isCacheBehind = record.tracking().isIdle();
}

void RecordFilling::completeCache(const QXGenericRecord& record, Dictionary& cache) {
    if (record._isCacheBehind)
        for (const auto& entry : *record._contents)
            cache.add(entry.key, Value(Null::marker()));
    record._isCacheBehind = false;
}

} // namespace qx::detail
