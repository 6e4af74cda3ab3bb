#pragma once

// Generated documents of nested orders, and the mapping they are read under.

#include <string>

namespace bench {

// About that many bytes of orders, each with an address, attributes and a handful of lines.
std::string orders(std::size_t bytes);

// The mapping of such documents, every field of a usual kind.
extern const char* const orderMapping;

} // namespace bench
