#pragma once

// Files and directories by path. Failures are errors of qx::Error::cocoaDomain whose message says
// what failed and for which path, and whose reason is the operating system's text:
//   260 no such file, 257 reading not permitted, 256 any other failure to read
//   513 writing not permitted, 640 disk full, 642 read-only disk, 512 any other failure to write
//   514 the name is none (empty, or with a zero byte); the one message without a path
// Everything here may be called from any thread.

#include <QXXMLMarshalling/model/Data.h>
#include <QXXMLMarshalling/model/Error.h>

namespace qx {

// What a document may hold at most, and what a property list or a file of texts may.
inline constexpr std::size_t largestFile = 0x7FFF'FFFF;
inline constexpr std::size_t largestResource = 16 * 1024 * 1024;

// The file's bytes, copied: a mapped file that is cut short would end the process. Null with an
// error, 256 for more than `maximumSize` bytes. Pipes and devices are read to their end, if they
// have one; with `regular` they are refused (256).
enum class ReadableFiles : std::uint8_t { all, regular };
Ref<Data> readFile(const String& path, Ref<Error>* error = nullptr,
                   ReadableFiles readable = ReadableFiles::all,
                   std::size_t maximumSize = largestFile);

// Writes a temporary file beside the target, flushes it to disk and renames it over the target: at
// every moment, a power failure included, the path names the old bytes or the new ones, whole.
// False with an error; the old file is then untouched and the temporary one gone. Of a file that is
// replaced
// - the permissions, group, owner and access list are kept as far as the system lets this process.
//   Where the group cannot be, its rights go to no other, and where the permissions cannot be told,
//   the new file is the owner's alone. The folder has to be writable, the file has not;
// - other hard links keep the old bytes;
// - symbolic links that the path ends in stay: what they lead to is replaced, or made. One that
//   another user put into a folder like /tmp is not followed (513);
// - pipes, sockets and devices are refused (512), directories too.
// A temporary file is called ".~qx-save-N.tmp". What a writer left that was killed is removed by
// the next that saves into the same folder.
bool writeFileAtomically(const String& path, std::string_view bytes, Ref<Error>* error = nullptr);

// False with an error for a path that is too long to be written, or has a component that is: to be
// known before directories are made for it.
bool checkLengthOfPath(const String& path, Ref<Error>* error = nullptr);

// Whether anything is there, symbolic links followed.
bool fileExists(const String& path);
bool isDirectory(const String& path);

// Makes the directory and those above it that are missing; fine when it is there already.
bool createDirectoryWithParents(const String& path, Ref<Error>* error = nullptr);

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
