#pragma once

// The C parser's texts as views.

#include <new>
#include <string_view>

namespace qx {

// Empty where there is none.
inline std::string_view viewOf(const unsigned char* text) {
    return text != nullptr ? reinterpret_cast<const char*>(text) : "";
}

// Without memory the parser has nothing where a text starts.
inline std::string_view viewOf(const unsigned char* from, const unsigned char* to) {
    if (from == nullptr)
        throw std::bad_alloc();
    return {reinterpret_cast<const char*>(from), static_cast<std::size_t>(to - from)};
}

} // namespace qx
