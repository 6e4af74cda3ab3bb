#pragma once

// Standard output. What did not arrive whole is a failure; some of it only shows when it is
// flushed.

#include <string_view>

namespace qxxml {

// Both throw Failure.
void print(std::string_view text);
void flushOutput();

} // namespace qxxml
