#include "files/Files.h"

#include "base/BulkArray.h"
#include "files/Descriptor.h"
#include "files/Paths.h"
#include "files/SystemErrors.h"

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <istream>
#include <ostream>
#include <sys/stat.h>

namespace qx {

namespace {

// Reads to the end, whatever size the file claimed: pipes and kernel files claim none, and any may
// grow meanwhile. The error number, EFBIG beyond the limit; else 0.
int readToEnd(int descriptor, std::size_t expected, std::size_t limit, std::string& bytes) {
    constexpr std::size_t smallestGrowth = 64 * 1024;
    std::size_t filled = 0;
    bytes.reserve(expected + 1);
    askForLargePages(bytes.data(), bytes.capacity());
    bytes.resize(expected + 1);
    while (true) {
        if (filled > limit)
            return EFBIG;
        if (filled == bytes.size())
            bytes.resize(std::min(bytes.size() * 2 + smallestGrowth, limit + 1));
        const ssize_t count = ::read(descriptor, bytes.data() + filled, bytes.size() - filled);
        if (count < 0 && errno != EINTR)
            return errno;
        if (count == 0)
            break;
        filled += count > 0 ? static_cast<std::size_t>(count) : 0;
    }
    bytes.resize(filled);
    return 0;
}

} // namespace

Ref<Data> readFile(const String& path, Ref<Error>* error, ReadableFiles readable,
                   std::size_t maximumSize) {
    if (holdsZeroByte(path))
        return failReading(error, path, ENOENT);
    const bool regularOnly = readable == ReadableFiles::regular;
    // A pipe that nobody writes to would be waited for.
    const int waiting = regularOnly ? O_NONBLOCK | O_NOCTTY : 0;
    const Descriptor file(::open(path.c_str(), O_RDONLY | O_CLOEXEC | waiting));
    struct stat status {};
    if (!file.isOpen() || ::fstat(file.number(), &status) != 0)
        return failReading(error, path, errno);
    if (S_ISDIR(status.st_mode))
        return failReading(error, path, EISDIR);
    if (regularOnly && !S_ISREG(status.st_mode))
        return fail(error, errors::noRegularFile, path);

    const auto size = S_ISREG(status.st_mode) ? static_cast<std::size_t>(status.st_size) : 0;
    if (size > maximumSize)
        return failReading(error, path, EFBIG);
    std::string bytes;
    if (const int errorNumber = readToEnd(file.number(), size, maximumSize, bytes))
        return failReading(error, path, errorNumber);
    return make<Data>(std::move(bytes));
}

Ref<Data> readStream(std::istream& stream, Ref<Error>* error) {
    std::string bytes;
    char block[16 * 1024];
    while (stream.read(block, sizeof block) || stream.gcount() > 0)
        bytes.append(block, static_cast<std::size_t>(stream.gcount()));
    if (stream.eof() && !stream.bad())
        return make<Data>(std::move(bytes));
    return fail(error, errors::streamNotRead);
}

bool writeToStream(std::ostream& stream, std::string_view bytes, Ref<Error>* error) {
    stream.write(bytes.data(), static_cast<std::streamsize>(bytes.size()));
    return stream.flush() ? true : fail(error, errors::streamNotWritten);
}

bool fileExists(const String& path) {
    struct stat status {};
    return !holdsZeroByte(path) && ::stat(path.c_str(), &status) == 0;
}

bool isDirectory(const String& path) {
    struct stat status {};
    return !holdsZeroByte(path) && ::stat(path.c_str(), &status) == 0 && S_ISDIR(status.st_mode);
}

bool createDirectoryWithParents(const String& path, Ref<Error>* error) {
    if (path.isEmpty() || holdsZeroByte(path))
        return fail(error, errors::invalidFileName);
    std::size_t end = 0;
    while (end < path.size()) {
        end = std::min(path.view().find('/', end + 1), path.size());
        const String directory = path.view().substr(0, end);
        if (::mkdir(directory.c_str(), 0777) == 0)
            continue;
        // A directory that is there may answer EROFS or EACCES rather than EEXIST.
        const int errorNumber = errno == EEXIST ? ENOTDIR : errno;
        if (!isDirectory(directory))
            return failWriting(error, directory, errorNumber);
    }
    return true;
}

} // namespace qx
