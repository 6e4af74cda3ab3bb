#include "files/SystemErrors.h"

#include <cerrno>
#include <cstring>

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

} // namespace

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

} // namespace qx
