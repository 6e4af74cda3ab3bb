// qxxml: tries mapping documents on XML documents from the command line.

#include <QXXMLMarshalling/platform/Format.h>
#include <QXXMLMarshalling/platform/Log.h>

#include "qxxml/CommandLine.h"

#include <csignal>
#include <cstdio>

// The library's warnings, without the time and process of its own log lines.
void QXLogWarning(std::string_view format, std::span<const qx::Value> arguments) {
    std::fprintf(stderr, "qxxml: warning: %s\n", qx::format(format, arguments).c_str());
}

int main(int argc, char** argv) {
    // A reader that went away is an error of writing, told like any other.
    std::signal(SIGPIPE, SIG_IGN);
    return qxxml::runCommandLine(argc, argv);
}
