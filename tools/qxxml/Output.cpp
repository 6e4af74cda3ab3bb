#include "qxxml/Output.h"

#include "qxxml/Failure.h"

#include <cerrno>
#include <cstdio>
#include <cstring>

namespace qxxml {

namespace {

[[noreturn]] void fail() {
    throw Failure("512: " +
                  message("The standard output cannot be written: %@", std::strerror(errno)));
}

} // namespace

void print(std::string_view text) {
    errno = 0;
    if (std::fwrite(text.data(), 1, text.size(), stdout) != text.size())
        fail();
}

void flushOutput() {
    errno = 0;
    if (std::fflush(stdout) != 0)
        fail();
}

} // namespace qxxml
