#include "platform/system/Files.h"

#include "platform/system/Errors.h"

#include <cerrno>
#include <climits>
#include <fcntl.h>
#include <linux/magic.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <sys/vfs.h>
#include <unistd.h>

namespace qx {

namespace {

// Below this size copying is cheaper than setting up a mapping.
constexpr std::size_t smallestMapping = 64 * 1024;

class Descriptor {
public:
    explicit Descriptor(int number) noexcept : _number(number) {}
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;
    ~Descriptor() {
        if (_number >= 0)
            ::close(_number);
    }
    int number() const noexcept { return _number; }
    bool isOpen() const noexcept { return _number >= 0; }

private:
    int _number;
};

// A path with a zero byte inside would name another file than it reads.
bool holdsZeroByte(const String& path) { return path.view().find('\0') != std::string_view::npos; }

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

Failure failReading(Ref<Error>* error, const String& path, int errorNumber) {
    return failWithSystemError(error, readingError(errorNumber), path, errorNumber);
}

Failure failWriting(Ref<Error>* error, const String& path, int errorNumber) {
    return failWithSystemError(error, writingError(errorNumber), path, errorNumber);
}

// A mapped file that shrinks ends the process at the next access behind its end. Files that only
// the superuser can write are replaced by whole new ones, as packages are; a network may go away.
bool isSafeToMap(int descriptor, const struct stat& status) {
    if (status.st_uid != 0 || (status.st_mode & (S_IWGRP | S_IWOTH)) != 0)
        return false;
    struct statfs system {};
    if (::fstatfs(descriptor, &system) != 0)
        return false;
    constexpr unsigned cifs = 0xFF534D42U;
    constexpr unsigned smb2 = 0xFE534D42U;
    switch (static_cast<unsigned>(system.f_type)) {
    case NFS_SUPER_MAGIC:
    case SMB_SUPER_MAGIC:
    case FUSE_SUPER_MAGIC:
    case V9FS_MAGIC:
    case cifs:
    case smb2:
        return false;
    default:
        return true;
    }
}

void unmap(const char* bytes, std::size_t size) { ::munmap(const_cast<char*>(bytes), size); }

Ref<Data> mapFile(int descriptor, std::size_t size) {
    void* const memory = ::mmap(nullptr, size, PROT_READ, MAP_PRIVATE, descriptor, 0);
    if (memory == MAP_FAILED)
        return nullptr;
    return make<Data>(static_cast<const char*>(memory), size, &unmap);
}

// Reads to the end, whatever size the file claimed: pipes and kernel files claim none.
bool readToEnd(int descriptor, std::size_t expected, std::string& bytes) {
    std::size_t filled = 0;
    bytes.resize(expected + 1);
    while (true) {
        if (filled == bytes.size())
            bytes.resize(bytes.size() * 2 + smallestMapping);
        const ssize_t count = ::read(descriptor, bytes.data() + filled, bytes.size() - filled);
        if (count < 0) {
            if (errno == EINTR)
                continue;
            return false;
        }
        if (count == 0)
            break;
        filled += static_cast<std::size_t>(count);
    }
    bytes.resize(filled);
    return true;
}

bool writeAll(int descriptor, std::string_view bytes) {
    while (!bytes.empty()) {
        const ssize_t count = ::write(descriptor, bytes.data(), bytes.size());
        if (count < 0) {
            if (errno == EINTR)
                continue;
            return false;
        }
        bytes.remove_prefix(static_cast<std::size_t>(count));
    }
    return true;
}

std::string directoryOf(std::string_view path) {
    const std::size_t slash = path.rfind('/');
    if (slash == std::string_view::npos)
        return ".";
    return std::string(path.substr(0, slash == 0 ? 1 : slash));
}

// A new file beside the target, under a name that no document has: short, whatever the target's
// name.
class TemporaryFile {
public:
    explicit TemporaryFile(const std::string& directory) {
        static std::atomic<unsigned> counter{0};
        do {
            _path = directory + "/.qx-" + std::to_string(::getpid()) + "-" +
                    std::to_string(counter.fetch_add(1)) + ".tmp";
            _descriptor = ::open(_path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666);
        } while (_descriptor < 0 && errno == EEXIST);
    }
    TemporaryFile(const TemporaryFile&) = delete;
    TemporaryFile& operator=(const TemporaryFile&) = delete;
    ~TemporaryFile() {
        if (_descriptor >= 0)
            ::close(_descriptor);
        if (_descriptor >= 0 || _closed)
            ::unlink(_path.c_str());
    }

    bool isOpen() const noexcept { return _descriptor >= 0; }

    // Fills the file and brings it to disk. False with errno.
    bool write(std::string_view bytes, const struct stat* replaced) {
        if (replaced != nullptr) {
            // The owner can be kept by the superuser only; the permissions by everybody.
            if (::fchown(_descriptor, replaced->st_uid, replaced->st_gid) != 0)
                errno = 0;
            if (::fchmod(_descriptor, replaced->st_mode & 0777U) != 0)
                return false;
        }
        if (!writeAll(_descriptor, bytes) || ::fsync(_descriptor) != 0)
            return false;
        const int descriptor = std::exchange(_descriptor, -1);
        _closed = true;
        return ::close(descriptor) == 0;
    }
    bool renameTo(const char* target) {
        if (::rename(_path.c_str(), target) != 0)
            return false;
        _closed = false;
        return true;
    }

private:
    std::string _path;
    int _descriptor = -1;
    bool _closed = false;
};

} // namespace

Ref<Data> readFile(const String& path, Ref<Error>* error, ReadableFiles readable) {
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
    if (size >= smallestMapping && isSafeToMap(file.number(), status)) {
        if (Ref<Data> mapped = mapFile(file.number(), size))
            return mapped;
    }
    std::string bytes;
    if (!readToEnd(file.number(), size, bytes))
        return failReading(error, path, errno);
    return make<Data>(std::move(bytes));
}

bool writeFileAtomically(const String& path, std::string_view bytes, Ref<Error>* error) {
    if (path.isEmpty() || holdsZeroByte(path) || path.view().back() == '/')
        return fail(error, errors::invalidFileName);
    struct stat status {};
    const bool exists = ::lstat(path.c_str(), &status) == 0;
    if (exists && S_ISDIR(status.st_mode))
        return failWriting(error, path, EISDIR);

    const std::string directory = directoryOf(path);
    TemporaryFile temporary(directory);
    const bool keepsPermissions = exists && S_ISREG(status.st_mode);
    if (!temporary.isOpen() || !temporary.write(bytes, keepsPermissions ? &status : nullptr) ||
        !temporary.renameTo(path.c_str()))
        return failWriting(error, path, errno);

    // The document is in place. Where the directory can't be flushed (no permission to read it, a
    // file system without the notion) nothing better can be done.
    const Descriptor parent(::open(directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (parent.isOpen())
        ::fsync(parent.number());
    return true;
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
