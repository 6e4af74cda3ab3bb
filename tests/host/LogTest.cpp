#include "host/Log.h"

#include "model/Warning.h"

#include "support/FileSandbox.h"
#include "support/Patterns.h"

#include <gtest/gtest.h>

using namespace qx;

namespace {

std::string lineOf(void (*write)()) {
    const std::string head = R"(^\d{4}-\d\d-\d\d \d\d:\d\d:\d\d\.\d{3} Client\[\d+\] )";
    const FileSandbox world;
    ::testing::internal::CaptureStderr();
    write();
    return support::replaced(::testing::internal::GetCapturedStderr(), head, "head ");
}

} // namespace

// A host's own functions are tried by tests/checks/log-hooks.sh: this program has none.
TEST(LogTest, AMessageIsOneLineOnStandardErrorWhateverItHolds) {
    EXPECT_EQ(lineOf([] { logWarningOrLine("cannot find %@", "it"); }), "head cannot find it\n");
    EXPECT_EQ(lineOf([] { reportWarning("100%@ taken"); }), "head 100%@ taken\n");
    EXPECT_EQ(lineOf([] { logDebug("%@", 1); }), "");
    EXPECT_EQ(lineOf([] { log("%@|%@", "a\nb\r\nc", nullptr); }), "head a b  c|(null)\n");
}
