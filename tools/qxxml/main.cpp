// qxxml: tries mapping documents on XML documents from the command line.

#include <QXXMLMarshalling/host/Log.h>
#include <QXXMLMarshalling/model/Format.h>

#include "qxxml/CommandLine.h"

#include <csignal>
#include <cstdio>

namespace {

void warn(std::string_view format, std::span<const qx::Value> arguments) {
    std::fprintf(stderr, "qxxml: warning: %s\n", qx::format(format, arguments).c_str());
}

} // namespace

// The library's warnings, without the time and process of its own log lines.
void QXLogWarning(std::string_view format, std::span<const qx::Value> arguments) {
    warn(format, arguments);
}

// Unknown elements are told as a debugging message, unknown attributes as a warning; who writes a
// mapping wants to hear of both. The rest is for debugging the library.
void QXLogDebug(std::string_view format, std::span<const qx::Value> arguments) {
    constexpr std::string_view mark = "*** Warning: ";
    if (format.starts_with(mark))
        warn(format.substr(mark.size()), arguments);
}

int main(int argc, char** argv) {
    // A reader that went away is an error of writing, told like any other.
    std::signal(SIGPIPE, SIG_IGN);
    return qxxml::runCommandLine(argc, argv);
}
