#pragma once

// Which texts a type of member takes, for the suggestion beside an error: a list of words where
// they are few, else what they are.

#include <QXXMLMarshalling/model/ValueTraits.h>

#include <optional>
#include <string_view>
#include <type_traits>
#include <vector>

namespace qx::detail {

struct TakenTexts {
    std::vector<std::string_view> words; // that live for ever
    const char* kind = nullptr;          // "a number"
};

template <class T>
TakenTexts takenTexts() {
    if constexpr (isOptional<T>) {
        return takenTexts<typename T::value_type>();
    } else if constexpr (NamedEnumeration<T>) {
        TakenTexts texts;
        for (const EnumName<T>& known : EnumNames<T>::table)
            texts.words.push_back(known.name);
        return texts;
    } else if constexpr (std::is_enum_v<T>) {
        TakenTexts texts{{}, "a whole number"};
        if (const auto* names = namesOf<T>.load(std::memory_order_acquire))
            for (const auto& [number, name] : *names)
                texts.words.push_back(name.view());
        return texts;
    } else if constexpr (std::is_same_v<T, bool>) {
        return {{"true", "false"}, nullptr};
    } else if constexpr (std::is_same_v<T, char>) {
        return {{}, "a single character"};
    } else if constexpr (std::is_integral_v<T>) {
        return {{}, std::is_unsigned_v<T> ? "a whole number from zero on" : "a whole number"};
    } else if constexpr (std::is_floating_point_v<T>) {
        return {{}, "a number"};
    } else {
        return {};
    }
}

} // namespace qx::detail
