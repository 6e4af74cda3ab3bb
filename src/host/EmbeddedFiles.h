#pragma once

// Files of the framework bundle that are compiled in, so that a library without its share/ folder,
// a static one above all, speaks the user's language, too. The build makes their contents from
// share/.

#include <string_view>

namespace qx {

// The contents of "de.lproj/Localizable.strings", say; empty for a file that is not compiled in.
std::string_view embeddedFile(std::string_view name);

} // namespace qx
