#pragma once

// The files that the running program was put together from.

#include <QXXMLMarshalling/base/String.h>

namespace qx {

// The absolute path of the shared object that holds the address. Null for the program itself, by
// whatever name it was called, and where nobody knows. Any thread may ask.
String sharedObjectHolding(const void* address);

// The path without symbolic links, "." and ".."; null when nothing is there.
String realPath(const String& path);

// The folder of the framework bundle: share/QXXMLMarshalling beside the library's folder, else this
// folder; of a static library, the same with the program's folder.
const String& frameworkFolder();

} // namespace qx
