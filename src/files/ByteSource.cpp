#include "files/ByteSource.h"

#include "files/Paths.h"
#include "files/SystemErrors.h"

#include <algorithm>
#include <fcntl.h>
#include <istream>
#include <sys/stat.h>

namespace qx {

int FileSource::opened(const String& path) {
    if (!holdsZeroByte(path))
        return ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
    errno = ENOENT;
    return -1;
}

std::optional<std::size_t> FileSource::read(char* to, std::size_t room, Ref<Error>* error) {
    int failure = _openingFailed;
    while (failure == 0) {
        const ssize_t count = ::read(_file.number(), to, room);
        if (count >= 0)
            return static_cast<std::size_t>(count);
        failure = errno == EINTR ? 0 : errno;
    }
    failReading(error, _path, failure);
    return std::nullopt;
}

std::uint64_t FileSource::size() const noexcept {
    struct stat status {};
    const bool isKnown =
        _file.isOpen() && ::fstat(_file.number(), &status) == 0 && S_ISREG(status.st_mode);
    return isKnown ? static_cast<std::uint64_t>(status.st_size) : 0;
}

// What the stream's buffer holds is there; for more the stream may have to wait.
std::optional<std::size_t> StreamSource::read(char* to, std::size_t room, Ref<Error>* error) {
    if (_stream.peek() != std::istream::traits_type::eof()) {
        const auto wanted = static_cast<std::streamsize>(room);
        const std::streamsize there = _stream.rdbuf()->in_avail();
        _stream.read(to, there > 0 ? std::min(there, wanted) : wanted);
        if (_stream.gcount() > 0 && !_stream.bad())
            return static_cast<std::size_t>(_stream.gcount());
    }
    if (_stream.eof() && !_stream.bad())
        return 0;
    fail(error, errors::streamNotRead);
    return std::nullopt;
}

} // namespace qx
