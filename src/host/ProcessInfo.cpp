#include <QXXMLMarshalling/host/ProcessInfo.h>

#include <QXXMLMarshalling/base/Exception.h>

#include "base/Immortal.h"

#include <cerrno>
#include <mutex>
#include <unistd.h>

namespace qx {

namespace {

struct State {
    std::mutex mutex;
    String name;
    String version;
    String build;
};

bool isFileName(std::string_view name) {
    constexpr std::string_view separators("/\0", 2);
    return !name.empty() && name != "." && name != ".." &&
           name.find_first_of(separators) == std::string_view::npos;
}

} // namespace

String ProcessInfo::processName() {
    auto& state = immortal<State>();
    const std::lock_guard lock(state.mutex);
    if (state.name.isNull()) {
        state.name = program_invocation_short_name;
        if (!isFileName(state.name))
            state.name = "program"; // called with an empty argument vector
    }
    return state.name;
}

void ProcessInfo::setProcessName(const String& name) {
    if (!name.isNull() && !isFileName(name))
        throw Exception(Exception::invalidArgument,
                        String::concat({"a process name is a file name, not \"", name, "\""}));
    auto& state = immortal<State>();
    const std::lock_guard lock(state.mutex);
    state.name = name;
}

void ProcessInfo::setProcessVersion(const String& version, const String& build) {
    auto& state = immortal<State>();
    const std::lock_guard lock(state.mutex);
    state.version = version;
    state.build = build;
}

String ProcessInfo::processVersion() {
    auto& state = immortal<State>();
    const std::lock_guard lock(state.mutex);
    return state.version;
}

String ProcessInfo::processBuild() {
    auto& state = immortal<State>();
    const std::lock_guard lock(state.mutex);
    return state.build;
}

int ProcessInfo::processIdentifier() { return ::getpid(); }

String ProcessInfo::executablePath() {
    std::string path(256, '\0');
    while (true) {
        const ssize_t length = ::readlink("/proc/self/exe", path.data(), path.size());
        if (length < 0)
            return nullptr;
        if (static_cast<std::size_t>(length) < path.size()) {
            path.resize(static_cast<std::size_t>(length));
            return path;
        }
        path.resize(path.size() * 2);
    }
}

} // namespace qx
