#pragma once

#include <string>
#include <typeinfo>

namespace qx {

// The name of a C++ type as sources have it.
std::string readableName(const std::type_info& type);

} // namespace qx
