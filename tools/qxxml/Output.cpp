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

std::string harmless(std::string line) {
    for (std::size_t i = 0; i < line.size(); ++i) {
        const auto byte = static_cast<unsigned char>(line[i]);
        const auto next = static_cast<unsigned char>(i + 1 < line.size() ? line[i + 1] : 0);
        if (byte == 0xC2 && next >= 0x80 && next < 0xA0)
            line.replace(i, 2, " ");
        else if (byte < ' ' || byte == 0x7F)
            line[i] = ' ';
    }
    return line;
}

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
