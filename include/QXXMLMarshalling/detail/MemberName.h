#pragma once

// The name of a member as the source has it, and where a type comes from. No standard way leads to
// it, but GCC and Clang spell a template's arguments out in the name of the function that is being
// compiled:
//
//     GCC      … qx::detail::memberName() [with auto Member = &Point::lat; …]
//     Clang    … qx::detail::memberName() [Member = &Point::lat]
//
// A type is spelt with its namespaces, "T = std::chrono::year" in both.

#include <string_view>

namespace qx::detail {

template <auto Member>
constexpr std::string_view memberName() noexcept {
    constexpr std::string_view argument = "Member = ";
    std::string_view name = __PRETTY_FUNCTION__;
    name.remove_prefix(name.find(argument) + argument.size());
    // The type of a member may be spelt out before it, and other arguments behind it.
    name = name.substr(0, name.find_first_of(";]"));
    name = name.substr(0, name.find_last_not_of(") ") + 1);
    return name.substr(name.find_last_of(": &") + 1);
}

template <class T>
constexpr bool isOfStandardLibrary() noexcept {
    const std::string_view name = __PRETTY_FUNCTION__;
    return name.find("T = std::") != std::string_view::npos;
}

} // namespace qx::detail
