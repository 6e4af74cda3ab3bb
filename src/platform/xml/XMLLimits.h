#pragma once

// What a document may hold at most, besides the limits of XMLParseOptions. What is written keeps to
// the same limits, so that it can be read again.

#include <climits>
#include <cstddef>

namespace qx::xmlLimits {

// Bytes of the document as UTF-8.
inline constexpr std::size_t documentSize = INT_MAX - 1;

// Attributes and namespace declarations of one element.
inline constexpr std::size_t attributes = 4096;

// Namespace declarations in force at one place: for a prefix the parser goes through them all.
inline constexpr std::size_t namespaces = 1000;

// Different names, namespace URIs among them: the parser's own table of names gets slow with more.
inline constexpr std::size_t names = 100'000;

} // namespace qx::xmlLimits
