#pragma once

// Paths as texts: the file system is not asked. Any thread may call.

#include <QXXMLMarshalling/base/String.h>

#include <string>

namespace qx {

// A path with a zero byte inside would name another file than it reads.
bool holdsZeroByte(std::string_view path);

// The folder that holds the path's last component: "." for a path without a slash.
std::string directoryOf(std::string_view path);

// The directory with a further component, with exactly one slash between them.
String appendingPathComponent(std::string_view directory, std::string_view component);

// A name as a path below a directory, without "." and "..": "a.xml", "sub/a.xml". Null for a name
// that is empty or absolute, holds a zero byte, or leads out of the directory or to the directory
// itself.
String relativePath(std::string_view name);

// The path in a file: URL, its percent escapes decoded, or the text itself where it is no such URL.
// Null for a URL of another scheme or host.
String pathOfURL(const String& URL);

} // namespace qx
