#include "model/Warning.h"

#include <atomic>
#include <cstdio>

namespace qx {

namespace {

void writeToStandardError(const String& message) { std::fprintf(stderr, "%s\n", message.c_str()); }

std::atomic<WarningSink> installed{&writeToStandardError};
std::atomic<DebugSinkFinder> debugFinder{nullptr};

} // namespace

void installWarningSink(WarningSink sink) noexcept { installed.store(sink); }

void reportWarning(const String& message) { installed.load()(message); }

void installDebugSinkFinder(DebugSinkFinder finder) noexcept { debugFinder.store(finder); }

DebugSink debugSink() noexcept {
    const DebugSinkFinder finder = debugFinder.load();
    return finder != nullptr ? finder() : nullptr;
}

} // namespace qx
