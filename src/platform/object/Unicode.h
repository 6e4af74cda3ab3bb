#pragma once

// Case rules of Unicode in the root locale, over UTF-8; and what is UTF-8.

#include <string>
#include <string_view>

namespace qx::unicode {

std::string lowercased(std::string_view text);
std::string capitalized(std::string_view text);
bool equalIgnoringCase(std::string_view a, std::string_view b);

bool isWellFormed(std::string_view text);
// A half of a surrogate pair without the other becomes U+FFFD.
std::string fromUTF16(std::u16string_view units);

} // namespace qx::unicode
