#pragma once

// What reading and writing files share: descriptors that are closed, and the errors of the
// operating system as errors of ours.

#include "model/Errors.h"

#include <string>

#include <unistd.h>

namespace qx {

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
bool holdsZeroByte(std::string_view path);

// The folder that holds the path's last component: "." for a path without a slash.
std::string directoryOf(std::string_view path);

// Reports that the operating system refused something about the path. The reason is its text for
// the error number.
Failure failWithSystemError(Ref<Error>* error, const ErrorText& text, std::string_view path,
                            int errorNumber);
Failure failReading(Ref<Error>* error, const String& path, int errorNumber);
Failure failWriting(Ref<Error>* error, const String& path, int errorNumber);

} // namespace qx
