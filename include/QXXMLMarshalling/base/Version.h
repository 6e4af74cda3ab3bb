// The version of the library: of the headers that a program is compiled with, and of the library
// that it runs with. While the major number is 0, another minor number is another interface: the
// file that the loader looks for has both in its name.
#pragma once

#include <QXXMLMarshalling/base/Export.h>

#include <string_view>

// The one place of these numbers: the build reads them here.
#define QXXMLMARSHALLING_VERSION_MAJOR 0
#define QXXMLMARSHALLING_VERSION_MINOR 1
#define QXXMLMARSHALLING_VERSION_PATCH 0

// One number to compare in #if: 203 is 0.2.3, 10000 is 1.0.0.
#define QXXMLMARSHALLING_VERSION                                                                   \
    (QXXMLMARSHALLING_VERSION_MAJOR * 10000 + QXXMLMARSHALLING_VERSION_MINOR * 100 +               \
     QXXMLMARSHALLING_VERSION_PATCH)

namespace qx {

// QXXMLMARSHALLING_VERSION as it was when the running library was built. May be called from any
// thread, as may the next.
[[nodiscard]] QX_API int libraryVersion() noexcept;
// The same as text, "0.1.0".
[[nodiscard]] QX_API std::string_view libraryVersionText() noexcept;

} // namespace qx
