#pragma once

// The unit of the benchmarks: what the XML parser alone takes.

#include <string_view>

namespace bench {

// Parses the bytes with callbacks that do nothing; false when they are no XML.
bool emptyPass(std::string_view xml);

} // namespace bench
