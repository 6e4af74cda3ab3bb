#include "host/Log.h"

#include "model/Warning.h"

#include "support/FileSandbox.h"

#include <gtest/gtest.h>

#include <regex>

using namespace qx;

namespace {

std::string lineOf(void (*write)()) {
    const FileSandbox world;
    ::testing::internal::CaptureStderr();
    write();
    return ::testing::internal::GetCapturedStderr();
}

const std::string head = R"(\d{4}-\d\d-\d\d \d\d:\d\d:\d\d\.\d{3} Client\[\d+\] )";

} // namespace

// Functions of a host are tried by the programs log_*.cpp: this one has none.
TEST(LogTest, WithoutAHostsFunctionWarningsAreLinesOnStandardError) {
    const std::string warned = lineOf([] { logWarningOrLine("cannot find %@", "it"); });
    EXPECT_TRUE(std::regex_match(warned, std::regex(head + "cannot find it\n"))) << warned;
    const std::string classes = lineOf([] { reportWarning("100%@ taken"); });
    EXPECT_TRUE(std::regex_match(classes, std::regex(head + "100%@ taken\n"))) << classes;
    EXPECT_EQ(lineOf([] { logDebug("%@", 1); }), "");
}

TEST(LogTest, AMessageIsOneLineWhateverItHolds) {
    const std::string line = lineOf([] { log("%@|%@", "a\nb\r\nc", nullptr); });
    EXPECT_TRUE(std::regex_match(line, std::regex(head + "a b  c\\|\\(null\\)\n"))) << line;
}
