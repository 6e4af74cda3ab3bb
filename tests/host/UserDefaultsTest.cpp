#include <QXXMLMarshalling/host/UserDefaults.h>

#include <QXXMLMarshalling/model/Array.h>

#include "support/FileSandbox.h"

#include <gtest/gtest.h>

#include <sys/stat.h>

#include <atomic>
#include <thread>

using namespace qx;

namespace {

struct UserDefaultsTest : ::testing::Test {
    ~UserDefaultsTest() override {
        defaults->setArguments({});
        defaults->removeObjectForKey("Key");
    }

    FileSandbox sandbox;
    Ref<UserDefaults> defaults = UserDefaults::standardUserDefaults();
};

std::string listWith(const std::string& value) {
    return "<plist><dict><key>Key</key>" + value + "</dict></plist>";
}

} // namespace

TEST_F(UserDefaultsTest, ArgumentsEndWhereNoneStands) {
    for (const std::vector<const char*>& arguments :
         {std::vector<const char*>{"-Key", nullptr, "-Other", "w"}, {nullptr, "-Key", "v"}}) {
        const Value before = defaults->objectForKey("Key");
        defaults->setArguments(arguments);
        EXPECT_EQ(defaults->objectForKey("Key"), before);
        EXPECT_TRUE(defaults->objectForKey("Other").isNull());
    }
}

TEST_F(UserDefaultsTest, AValueThatEndsMayAskForDefaults) {
    struct Asking : Object {
        ~Asking() override { UserDefaults::standardUserDefaults()->objectForKey("Key"); }
    };
    sandbox.write("config/Client.plist", listWith("<array/>"));
    for (int i = 0; i < 2; ++i) {
        defaults->registerDefault(make<Asking>(), "Asking");
        defaults->setObject(make<Asking>(), "Asking");
    }
    defaults->removeObjectForKey("Asking");
    defaults->registerDefault(0, "Asking");
    defaults->objectForKey("Key").as<Array>()->add(make<Asking>());
    defaults->synchronize();
    EXPECT_EQ(defaults->objectForKey("Key").as<Array>()->count(), 0U);
}

TEST_F(UserDefaultsTest, WhatOneThreadReadsStaysWhileAnotherForgetsTheFile) {
    sandbox.write("config/Client.plist", listWith("<string>of the file</string>"));
    std::atomic<bool> isDone = false;
    std::thread other([this, &isDone] {
        while (!isDone)
            defaults->synchronize();
    });
    for (int i = 0; i < 20000; ++i)
        EXPECT_EQ(defaults->stringForKey("Key"), "of the file");
    isDone = true;
    other.join();
}

TEST_F(UserDefaultsTest, AnUnusableFileIsWarnedAboutOnceAndHoldsNothing) {
    const std::string path = sandbox.write("config/Client.plist", "");
    const std::string huge = sandbox.write("huge", ""), pipe = sandbox.path("pipe");
    std::filesystem::resize_file(huge, std::uintmax_t{1} << 40U);
    ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
    const auto expectOneWarning = [&](const std::string& content) {
        defaults->synchronize();
        ::testing::internal::CaptureStderr();
        EXPECT_TRUE(defaults->objectForKey("Absent").isNull());
        EXPECT_TRUE(defaults->objectForKey("Absent").isNull());
        const std::string warning = ::testing::internal::GetCapturedStderr();
        EXPECT_NE(warning.find(path), std::string::npos) << content << ": " << warning;
        EXPECT_EQ(std::count(warning.begin(), warning.end(), '\n'), 1) << content << warning;
    };
    for (const char* text :
         {"<plist><dict>", "", "<plist><string>x</string></plist>", "<plist/>"}) {
        sandbox.write("config/Client.plist", text);
        expectOneWarning(text);
    }
    for (const std::string& target : {std::string("/dev/zero"), std::string("/"), huge, pipe}) {
        std::filesystem::remove(path);
        std::filesystem::create_symlink(target, path);
        expectOneWarning(target);
    }
}
