#pragma once

// Names of enumerations that are given at run time (ClassBuilder::names); those of EnumNames
// (ValueTraits.h) are constants.

#include <QXXMLMarshalling/model/Value.h>

#include <atomic>
#include <initializer_list>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

namespace qx::detail {

// In the order given. A table is never freed.
using EnumNameTable = std::vector<std::pair<std::int64_t, Key>>;
using EnumNameSlot = std::atomic<const EnumNameTable*>;

template <class E>
inline EnumNameSlot namesOf{nullptr};

// One row of a list of names, of whatever enumeration.
struct NamedNumber {
    template <class E>
    requires std::is_enum_v<E> NamedNumber(E value, std::string_view text)
        : slot(&namesOf<E>), number(static_cast<std::int64_t>(value)), name(text) {}

    EnumNameSlot* slot;
    std::int64_t number;
    Key name;
};

// Raises NSInvalidArgumentException where the rows are not of one enumeration.
QX_API void nameNumbers(std::initializer_list<NamedNumber> names);
// The first name of the number; null without a table or a name.
QX_API Key nameOf(const EnumNameTable* names, std::int64_t number);
// The number that a name, or a number that has one, stands for.
QX_API bool findNumber(const EnumNameTable& names, const Value& value, std::int64_t& number);

} // namespace qx::detail
