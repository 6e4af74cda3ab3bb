#include "files/Files.h"

#include "files/FileAccess.h"

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstring>
#include <fcntl.h>
#include <sys/stat.h>

namespace qx {

namespace {

const ErrorText& readingError(int errorNumber) {
    switch (errorNumber) {
    case ENOENT:
    case ENOTDIR:
        return errors::fileNotFound;
    case EACCES:
    case EPERM:
        return errors::readNotPermitted;
    default:
        return errors::readFailed;
    }
}

const ErrorText& writingError(int errorNumber) {
    switch (errorNumber) {
    case EACCES:
    case EPERM:
        return errors::writeNotPermitted;
    case ENOSPC:
    case EDQUOT:
        return errors::diskFull;
    case EROFS:
        return errors::readOnlyDisk;
    default:
        return errors::writeFailed;
    }
}

// Reads to the end, whatever size the file claimed: pipes and kernel files claim none, and any may
// grow meanwhile. The error number, EFBIG beyond the limit; else 0.
int readToEnd(int descriptor, std::size_t expected, std::size_t limit, std::string& bytes) {
    constexpr std::size_t smallestGrowth = 64 * 1024;
    std::size_t filled = 0;
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

bool holdsZeroByte(std::string_view path) { return path.find('\0') != std::string_view::npos; }

std::string directoryOf(std::string_view path) {
    const std::size_t slash = path.rfind('/');
    if (slash == std::string_view::npos)
        return ".";
    return std::string(path.substr(0, slash == 0 ? 1 : slash));
}

Failure failWithSystemError(Ref<Error>* error, const ErrorText& text, std::string_view path,
                            int errorNumber) {
    if (error == nullptr)
        return {};
    char buffer[256];
    const String reason = strerror_r(errorNumber, buffer, sizeof buffer);
    *error = make<Error>(text, std::vector<Value>{path}, reason);
    return {};
}

Failure failReading(Ref<Error>* error, const String& path, int errorNumber) {
    return errorNumber == EFBIG
               ? fail(error, errors::fileTooLarge, path)
               : failWithSystemError(error, readingError(errorNumber), path, errorNumber);
}

Failure failWriting(Ref<Error>* error, const String& path, int errorNumber) {
    return failWithSystemError(error, writingError(errorNumber), path, errorNumber);
}

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

bool checkLengthOfPath(const String& path, Ref<Error>* error) {
    std::size_t longest = 0;
    for (std::size_t start = 0; start < path.size();) {
        const std::size_t end = std::min(path.view().find('/', start), path.size());
        longest = std::max(longest, end - start);
        start = end + 1;
    }
    return (longest <= NAME_MAX && path.size() < PATH_MAX) ||
           failWriting(error, path, ENAMETOOLONG);
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

String appendingPathComponent(std::string_view directory, std::string_view component) {
    if (directory.empty())
        return component;
    while (directory.size() > 1 && directory.back() == '/')
        directory.remove_suffix(1);
    if (component.empty())
        return directory;
    return String::concat({directory, directory == "/" ? "" : "/", component});
}

String relativePath(std::string_view name) {
    if (name.starts_with('/') || name.find('\0') != std::string_view::npos)
        return nullptr;
    std::string path;
    while (!name.empty()) {
        const std::size_t slash = std::min(name.find('/'), name.size());
        const std::string_view component = name.substr(0, slash);
        name.remove_prefix(std::min(slash + 1, name.size()));
        if (component.empty() || component == ".")
            continue;
        if (component != "..") {
            if (!path.empty())
                path += '/';
            path += component;
            continue;
        }
        if (path.empty())
            return nullptr;
        const std::size_t parent = path.rfind('/');
        path.resize(parent == std::string::npos ? 0 : parent);
    }
    return path.empty() ? String() : String(path);
}

String pathOfURL(const String& URL) {
    constexpr std::string_view scheme = "file:";
    std::string_view rest = URL;
    if (!rest.starts_with(scheme))
        return rest.find("://") == std::string_view::npos ? URL : String();
    rest.remove_prefix(scheme.size());
    if (rest.starts_with("//")) {
        rest.remove_prefix(2);
        if (rest.starts_with("localhost/"))
            rest.remove_prefix(std::string_view("localhost").size());
        if (!rest.starts_with('/'))
            return nullptr;
    }
    const auto digit = [](char c) {
        if (c >= '0' && c <= '9')
            return c - '0';
        const char lower = static_cast<char>(c | 0x20);
        return lower >= 'a' && lower <= 'f' ? lower - 'a' + 10 : -1;
    };
    std::string path;
    for (std::size_t i = 0; i < rest.size(); ++i) {
        if (rest[i] == '%' && i + 2 < rest.size() && digit(rest[i + 1]) >= 0 &&
            digit(rest[i + 2]) >= 0) {
            path += static_cast<char>(digit(rest[i + 1]) * 16 + digit(rest[i + 2]));
            i += 2;
        } else {
            path += rest[i];
        }
    }
    return path;
}

} // namespace qx
