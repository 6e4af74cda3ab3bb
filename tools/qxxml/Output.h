#pragma once

// Standard output. What did not arrive whole is a failure; some of it only shows when it is
// flushed.

#include <string>
#include <string_view>

namespace qxxml {

// All throw Failure.
void print(std::string_view text);
void flushOutput();
// To a file instead, which is replaced as a whole.
void save(std::string_view text, const std::string& path);

// A line for people with a blank for each control character, those of 8 bits among them: terminals
// obey them.
std::string harmless(std::string line);

} // namespace qxxml
