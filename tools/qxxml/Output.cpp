#include "qxxml/Output.h"

#include <QXXMLMarshalling/files/FileWriting.h>

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

void save(std::string_view text, const std::string& path) {
    qx::Ref<qx::Error> error;
    if (!qx::writeFileAtomically(path, text, &error))
        throw Failure(error, path);
}

} // namespace qxxml
