#pragma once

#include <cstdint>

namespace qx {

// Changes whenever a class is described or forgotten: what was found out about classes by their
// names holds as long as it stays. Any thread may ask.
std::uint64_t classVersion() noexcept;

} // namespace qx
