#include "files/AtomicWrite.h"

#include "files/Descriptor.h"
#include "files/Paths.h"
#include "files/SystemErrors.h"

#include <algorithm>
#include <cerrno>
#include <climits>
#include <cstdio>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <sys/xattr.h>

namespace qx {

namespace {

bool isSameFile(const struct stat& a, const struct stat& b) {
    return a.st_dev == b.st_dev && a.st_ino == b.st_ino;
}

// In a folder where anybody may put something, a link that somebody else put there may lead to a
// file that only this process can write. Most systems refuse to follow such links by themselves.
bool isTrap(const std::string& link) {
    constexpr mode_t shared = S_ISVTX | S_IWOTH;
    struct stat own {};
    struct stat folder {};
    if (::lstat(link.c_str(), &own) != 0 || ::stat(directoryOf(link).c_str(), &folder) != 0)
        return true;
    return (folder.st_mode & shared) == shared && own.st_uid != ::geteuid() &&
           own.st_uid != folder.st_uid;
}

// What is to be replaced.
struct Target {
    enum class Kind : std::uint8_t { nothing, file, special, unknown };

    std::string path; // behind the symbolic links
    Kind kind = Kind::nothing;
    struct stat status {};

    // 0, or the error number by which the target cannot be written.
    int find();

private:
    int followLinks(std::size_t& count);
};

int Target::followLinks(std::size_t& count) {
    constexpr std::size_t mostLinks = 40; // as the system
    char link[PATH_MAX];
    for (count = 0; count <= mostLinks; ++count) {
        const ssize_t length = ::readlink(path.c_str(), link, sizeof link);
        if (length < 0)
            return errno == EINVAL || errno == ENOENT ? 0 : errno; // no link, or nothing there
        const std::string_view next(link, static_cast<std::size_t>(length));
        if (next.size() == sizeof link)
            return ENAMETOOLONG;
        if (isTrap(path))
            return EACCES;
        path =
            next.starts_with('/') ? std::string(next) : directoryOf(path).append("/").append(next);
    }
    return ELOOP;
}

int Target::find() {
    const int failure = ::stat(path.c_str(), &status) == 0 ? 0 : errno;
    std::size_t links = 0;
    if (const int broken = followLinks(links))
        return broken;
    if (failure == ENOENT)
        return 0;
    if (failure != 0) {
        kind = Kind::unknown;
        return links == 0 ? 0 : failure;
    }
    if (S_ISDIR(status.st_mode))
        return EISDIR;
    if (!S_ISREG(status.st_mode)) {
        kind = Kind::special;
        return 0;
    }
    kind = Kind::file;
    // The kernel's own links, those of open files, say something else than a path.
    struct stat behind {};
    if (links != 0 && (::lstat(path.c_str(), &behind) != 0 || !isSameFile(behind, status)))
        return ENOENT;
    return 0;
}

// Gives the new file the access list of the old one, which says in full what the permission bits
// only sum up; takes it one that it got from the folder. False where it can't.
bool keepAccessList(int descriptor, const std::string& old) {
    constexpr const char* accessList = "system.posix_acl_access";
    char list[16 * 1024];
    const ssize_t size = ::getxattr(old.c_str(), accessList, list, sizeof list);
    if (size > 0)
        return ::fsetxattr(descriptor, accessList, list, static_cast<std::size_t>(size), 0) == 0;
    const bool isUnknown = size < 0 && (errno == ENOTSUP || errno == ENOSYS);
    if (isUnknown)
        return true;
    const bool isNone = size == 0 || errno == ENODATA;
    return isNone && (::fremovexattr(descriptor, accessList) == 0 || errno == ENODATA);
}

// False with errno.
bool keepPermissions(int descriptor, const Target& old) {
    struct stat now {};
    if (::fstat(descriptor, &now) != 0)
        return false;
    mode_t mode = old.status.st_mode & 0777U;
    const bool keepsGroup = now.st_gid == old.status.st_gid ||
                            ::fchown(descriptor, static_cast<uid_t>(-1), old.status.st_gid) == 0;
    // Without its group the file has no list of it either. Its members are among the others from
    // now on, who get no more than they had.
    if (!keepsGroup || !keepAccessList(descriptor, old.path))
        mode &= S_IRWXU | (mode >> 3U & S_IRWXO);
    if (::fchmod(descriptor, mode) != 0)
        return false;
    // Last, for who has given a file away may not change it. Only the superuser can.
    const bool keepsOwner = now.st_uid == old.status.st_uid ||
                            ::fchown(descriptor, old.status.st_uid, static_cast<gid_t>(-1)) == 0;
    static_cast<void>(keepsOwner);
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

// A new file beside the target. It has one of a row of names, so that the leavings of killed
// writers are found without reading the folder, and its writer holds a lock on it:
//   1. Only who has the lock removes or renames the file.
//   2. A writer that finds its file locked or without a name after making it has lost it to one who
//      sweeps, and takes the next name.
//   3. The first few names are swept, and those after them up to the first that is free.
//   4. Where there are no locks nothing is swept.
class TemporaryFile {
public:
    // `mode` as for open. Errors are in errno.
    TemporaryFile(const std::string& directory, mode_t mode) {
        constexpr unsigned leastSwept = 4;
        constexpr unsigned mostNames = 1000;
        const auto take = [&](unsigned n) {
            _path = directory + "/.~qx-save-" + std::to_string(n) + ".tmp";
        };
        bool isThere = true;
        for (unsigned n = 0; n < leastSwept || (isThere && n < mostNames); ++n) {
            take(n);
            isThere = sweep(_path.c_str());
        }
        for (unsigned n = 0; n < mostNames && _descriptor < 0; ++n) {
            take(n);
            if (!create(mode) && errno != EEXIST)
                return;
        }
    }
    TemporaryFile(const TemporaryFile&) = delete;
    TemporaryFile& operator=(const TemporaryFile&) = delete;
    ~TemporaryFile() {
        if (_descriptor < 0)
            return;
        if (!_isRenamed)
            ::unlink(_path.c_str());
        ::close(_descriptor);
    }

    bool isOpen() const noexcept { return _descriptor >= 0; }
    int descriptor() const noexcept { return _descriptor; }

    bool renameTo(const std::string& target) {
        _isRenamed = ::rename(_path.c_str(), target.c_str()) == 0;
        return _isRenamed;
    }

private:
    bool create(mode_t mode) {
        const int made = ::open(_path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, mode);
        if (made < 0)
            return false;
        struct stat status {};
        const bool isTaken = ::flock(made, LOCK_EX | LOCK_NB) != 0 && errno == EWOULDBLOCK;
        if (isTaken || (::fstat(made, &status) == 0 && status.st_nlink == 0)) {
            ::close(made);
            errno = EEXIST;
            return false;
        }
        _descriptor = made;
        return true;
    }

    // Whether there was a file of that name.
    static bool sweep(const char* path) {
        // For writing, because some file systems lock nothing else.
        const Descriptor left(::open(path, O_WRONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
        struct stat own {};
        struct stat named {};
        if (left.isOpen() && ::flock(left.number(), LOCK_EX | LOCK_NB) == 0 &&
            ::fstat(left.number(), &own) == 0 && S_ISREG(own.st_mode) &&
            ::lstat(path, &named) == 0 && isSameFile(own, named))
            ::unlink(path);
        return left.isOpen();
    }

    std::string _path;
    int _descriptor = -1;
    bool _isRenamed = false;
};

} // namespace

struct AtomicFile::State {
    Target target;
    std::string directory;
    TemporaryFile temporary;

    explicit State(Target found)
        : target(std::move(found)), directory(directoryOf(target.path)),
          temporary(directory, target.kind == Target::Kind::nothing ? 0666 : 0600) {}
};

AtomicFile::AtomicFile(String path) : _path(std::move(path)) {}

AtomicFile::~AtomicFile() = default;

bool AtomicFile::open(Ref<Error>* error) {
    if (_path.isEmpty() || holdsZeroByte(_path) || _path.view().back() == '/')
        return fail(error, errors::invalidFileName);
    Target target{_path.str()};
    if (const int errorNumber = target.find())
        return failWriting(error, _path, errorNumber);
    if (target.kind == Target::Kind::special)
        return fail(error, errors::noRegularTarget, _path);
    _state = std::make_unique<State>(std::move(target));
    return _state->temporary.isOpen() || failWriting(error, _path, errno);
}

bool AtomicFile::write(std::string_view bytes, Ref<Error>* error) {
    return writeAll(_state->temporary.descriptor(), bytes) || failWriting(error, _path, errno);
}

bool AtomicFile::commit(Ref<Error>* error) {
    const Target& target = _state->target;
    TemporaryFile& temporary = _state->temporary;
    const bool isDone =
        (target.kind != Target::Kind::file || keepPermissions(temporary.descriptor(), target)) &&
        ::fsync(temporary.descriptor()) == 0 && temporary.renameTo(target.path);
    if (!isDone)
        return failWriting(error, _path, errno);

    // The document is in place. Where the directory can't be flushed (no permission to read it, a
    // file system without the notion) nothing better can be done.
    const Descriptor parent(::open(_state->directory.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
    if (parent.isOpen())
        ::fsync(parent.number());
    return true;
}

bool writeFileAtomically(const String& path, std::string_view bytes, Ref<Error>* error) {
    AtomicFile file(path);
    return file.open(error) && file.write(bytes, error) && file.commit(error);
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

} // namespace qx
