#pragma once

// What stands at a path: files are read and looked for, directories are made. Any thread may call.
// Errors of files are those of qx::Error::cocoaDomain:
//   260 no such file, 257 reading not permitted, 256 any other failure to read
//   513 writing not permitted, 640 disk full, 642 read-only disk, 512 any other failure to write
//   514 the name is none (empty, or with a zero byte); the one message without a path
// The message says what failed and for which path, the reason is the operating system's text.

#include <QXXMLMarshalling/model/Data.h>
#include <QXXMLMarshalling/model/Error.h>

#include <iosfwd>

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

// What a stream has left; null with error 256 when it fails.
Ref<Data> readStream(std::istream& stream, Ref<Error>* error = nullptr);
// Writes and flushes; false with error 512 when the stream fails.
bool writeToStream(std::ostream& stream, std::string_view bytes, Ref<Error>* error = nullptr);

// Whether anything is there, symbolic links followed.
bool fileExists(const String& path);
bool isDirectory(const String& path);

// Makes the directory and those above it that are missing; fine when it is there already.
bool createDirectoryWithParents(const String& path, Ref<Error>* error = nullptr);

} // namespace qx
