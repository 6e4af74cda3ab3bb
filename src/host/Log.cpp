#include "host/Log.h"

#include <QXXMLMarshalling/host/ProcessInfo.h>
#include <QXXMLMarshalling/model/Format.h>

#include "base/Unicode.h"
#include "model/Warning.h"

#include <ctime>
#include <dlfcn.h>
#include <link.h>
#include <mutex>
#include <unistd.h>

namespace qx {

namespace {

// Changes whenever a shared object is loaded or unloaded.
std::uint64_t loadGeneration() {
    std::uint64_t generation = 0;
    ::dl_iterate_phdr(
        [](dl_phdr_info* info, std::size_t, void* result) {
            *static_cast<std::uint64_t*>(result) = info->dlpi_adds + info->dlpi_subs;
            return 1;
        },
        &generation);
    return generation;
}

// A function of the host that the loader did not bind: one in a shared object that came after this
// library. The search is only made again when something was loaded or unloaded since.
class LateFunction {
public:
    explicit constexpr LateFunction(const char* name) noexcept : _name(name) {}

    LogFunction find() {
        // The loader's own lock is never taken under ours: it may be held while a host's
        // initialisers log.
        const std::uint64_t generation = loadGeneration();
        {
            const std::lock_guard lock(_mutex);
            if (_generation == generation)
                return _function;
        }
        const auto function = reinterpret_cast<LogFunction>(::dlsym(RTLD_DEFAULT, _name));
        const std::lock_guard lock(_mutex);
        _generation = generation;
        _function = function;
        return function;
    }

private:
    const char* _name;
    std::mutex _mutex;
    std::uint64_t _generation = 0;
    LogFunction _function = nullptr;
};

constinit LateFunction lateDebug("QXLogDebug");
constinit LateFunction lateWarning("QXLogWarning");

String timestamp() {
    std::timespec now{};
    std::timespec_get(&now, TIME_UTC);
    std::tm local{};
    ::localtime_r(&now.tv_sec, &local);
    char text[40];
    const std::size_t length = std::strftime(text, sizeof text, "%Y-%m-%d %H:%M:%S", &local);
    const std::string milliseconds = std::to_string(1000 + now.tv_nsec / 1'000'000);
    return String::concat({std::string_view(text, length), ".", milliseconds.substr(1)});
}

void sendWarning(const String& message) { logWarningOrLine("%@", message); }

// Warnings about class descriptions come here as soon as the library is loaded.
[[maybe_unused]] const bool sinkInstalled = (installWarningSink(&sendWarning), true);
[[maybe_unused]] const bool finderInstalled = (installDebugSinkFinder(&hostLogDebug), true);

} // namespace

LogFunction hostLogDebug() noexcept {
    return &QXLogDebug != nullptr ? &QXLogDebug : lateDebug.find();
}

LogFunction hostLogWarning() noexcept {
    return &QXLogWarning != nullptr ? &QXLogWarning : lateWarning.find();
}

void writeLogLine(std::string_view format, std::span<const Value> arguments) {
    // A message that quotes XML may hold line breaks, and what a terminal obeys.
    const std::string line =
        unicode::printable(String::concat({timestamp(), " ", ProcessInfo::processName(), "[",
                                           std::to_string(ProcessInfo::processIdentifier()), "] ",
                                           qx::format(format, arguments)})) +
        '\n';
    // In one call, so that lines of several threads and processes do not mix. There is nobody to
    // tell when it fails.
    [[maybe_unused]] const ssize_t written = ::write(STDERR_FILENO, line.data(), line.size());
}

} // namespace qx
