// A host with the warning function alone: messages for debugging go nowhere. The function asks for
// the very files that it is told are broken.

#include "LogRun.h"

#include <QXXMLMarshalling/host/Bundle.h>
#include <QXXMLMarshalling/host/ProcessInfo.h>
#include <QXXMLMarshalling/host/UserDefaults.h>

#include <filesystem>
#include <fstream>

namespace {

std::string warned;
std::string folder = "/tmp/qx-log-XXXXXX";

bool asksForBrokenFiles() {
    return !qx::UserDefaults::standardUserDefaults()->boolForKey("Loud") &&
           qx::Bundle::bundleWithPath(folder)->infoDictionary()->isEmpty();
}

} // namespace

void QXLogWarning(std::string_view format, std::span<const qx::Value> arguments) {
    warned += qx::format(format, arguments).str() + (asksForBrokenFiles() ? "\n" : "?");
}

int main() {
    if (&QXLogDebug != nullptr || ::mkdtemp(folder.data()) == nullptr)
        return 1;
    // NOLINTNEXTLINE(concurrency-mt-unsafe): no other thread runs
    ::setenv("XDG_CONFIG_HOME", folder.c_str(), 1);
    qx::ProcessInfo::setProcessName("Client");
    for (const char* name : {"/Client.plist", "/Info.plist"})
        std::ofstream(folder + name) << "<plist>";
    const std::string errors = standardErrorOf([] {
        asksForBrokenFiles();
        saySomething();
    });
    std::filesystem::remove_all(folder);
    expectTimes(0, "\n", errors);
    expectTimes(1, folder + "/Client.plist: Premature end", warned);
    expectTimes(1, folder + "/Info.plist: Premature end", warned);
    expectTimes(1, "The class name Taken is taken", warned);
    expectTimes(1, "Unbound attributes: ", warned);
    expectTimes(4, "\n", warned);
}
