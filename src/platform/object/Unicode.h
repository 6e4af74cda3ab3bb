#pragma once

// Case rules of Unicode in the root locale, over UTF-8.

#include <string>
#include <string_view>

namespace qx::unicode {

std::string lowercased(std::string_view text);
std::string capitalized(std::string_view text);
bool equalIgnoringCase(std::string_view a, std::string_view b);

} // namespace qx::unicode
