#pragma once

#include <unistd.h>

namespace qx {

// A file descriptor that is closed with its owner. Its number is negative where opening failed.
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

} // namespace qx
