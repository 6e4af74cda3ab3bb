#include <QXXMLMarshalling/detail/EnumNameTable.h>

#include <QXXMLMarshalling/base/Exception.h>

#include "base/Immortal.h"

#include <memory>
#include <mutex>

namespace qx::detail {

namespace {

// Tables that were replaced may still be read.
struct Tables {
    std::mutex mutex;
    std::vector<std::unique_ptr<const EnumNameTable>> all;
};

} // namespace

void nameNumbers(std::initializer_list<NamedNumber> names) {
    if (names.size() == 0)
        return;
    EnumNameSlot* const slot = names.begin()->slot;
    auto table = std::make_unique<EnumNameTable>();
    for (const NamedNumber& row : names) {
        if (row.slot != slot)
            throw Exception(Exception::invalidArgument,
                            String::concat({"the name ", row.name.view(),
                                            " is not of the enumeration of the first one"}));
        table->emplace_back(row.number, row.name);
    }
    auto& tables = immortal<Tables>();
    const std::lock_guard lock(tables.mutex);
    tables.all.push_back(std::move(table));
    slot->store(tables.all.back().get(), std::memory_order_release);
}

Key nameOf(const EnumNameTable* names, std::int64_t number) {
    if (names != nullptr)
        for (const auto& [known, name] : *names)
            if (known == number)
                return name;
    return {};
}

bool findNumber(const EnumNameTable& names, const Value& value, std::int64_t& number) {
    for (const auto& [known, name] : names) {
        if (value.isString() ? name.view() == value.view() : value == Value(known)) {
            number = known;
            return true;
        }
    }
    return false;
}

} // namespace qx::detail
