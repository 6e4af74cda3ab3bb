#pragma once

// Case rules of Unicode in the root locale, over UTF-8.

#include <string>
#include <string_view>

namespace qx::unicode {

// The text from the first character on that is no white space; line ends count as such.
std::string_view withoutLeadingSpace(std::string_view text) noexcept;

std::string lowercased(std::string_view text);
std::string capitalized(std::string_view text);
bool equalIgnoringCase(std::string_view a, std::string_view b);

} // namespace qx::unicode
