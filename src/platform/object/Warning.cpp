#include "platform/object/Warning.h"

#include <atomic>
#include <cstdio>

namespace qx {

namespace {

void writeToStandardError(const String& message) { std::fprintf(stderr, "%s\n", message.c_str()); }

std::atomic<WarningSink> installed{&writeToStandardError};

} // namespace

void installWarningSink(WarningSink sink) noexcept { installed.store(sink); }

void reportWarning(const String& message) { installed.load()(message); }

} // namespace qx
