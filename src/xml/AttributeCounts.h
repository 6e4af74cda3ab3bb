#pragma once

// The C parser compares each attribute of a start tag with all others, and reads the whole tag
// before it reports any. So tags are counted beforehand.

#include <cstddef>
#include <string_view>

namespace qx {

// In the text of an entity, which may come again and again.
constexpr std::size_t maximumEntityAttributes = 512;

// Where the first tag that has more attributes stands; npos for none.
std::size_t findTagBeyond(std::string_view text, std::size_t maximum);

} // namespace qx
