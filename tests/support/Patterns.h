#pragma once

// Regular expressions, compiled in one place: the standard library's take seconds in each file that
// uses them.

#include <string>
#include <utility>
#include <vector>

namespace support {

// The text with each match of the pattern replaced; "$1" stands for what its first group matches.
std::string replaced(const std::string& text, const std::string& pattern, const std::string& by);

// What the first two groups of the pattern match, for each of its matches.
std::vector<std::pair<std::string, std::string>> matches(const std::string& text,
                                                         const std::string& pattern);

} // namespace support
