#include <QXXMLMarshalling/host/UserDefaults.h>

#include <QXXMLMarshalling/model/Array.h>

#include "host/Directories.h"

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

TEST_F(UserDefaultsTest, TheFirstOfFourSourcesGivesTheValue) {
    const char* const arguments[]{"-Key", "argument"};
    EXPECT_TRUE(defaults->objectForKey("Key").isNull());
    defaults->registerDefault("registered", "Key");
    EXPECT_EQ(defaults->stringForKey("Key"), "registered");
    sandbox.write("config/Client.plist", listWith("<string>file</string>"));
    defaults->synchronize();
    EXPECT_EQ(defaults->stringForKey("Key"), "file");
    defaults->setObject("set", "Key");
    EXPECT_EQ(defaults->stringForKey("Key"), "set");
    defaults->setArguments(arguments);
    EXPECT_EQ(defaults->stringForKey("Key"), "argument");

    defaults->setArguments({});
    defaults->setObject(nullptr, "Key");
    EXPECT_EQ(defaults->stringForKey("Key"), "file");
    ProcessInfo::setProcessName("Other"); // whose file is not there
    EXPECT_EQ(defaults->stringForKey("Key"), "registered");
}

TEST_F(UserDefaultsTest, ArgumentsArePairsOfAKeyAndAValue) {
    const struct {
        std::vector<const char*> arguments;
        Value key;
        Value other;
    } rows[]{{{"-Key", "v", "-Other", "w"}, "v", "w"},
             {{"file", "-Key", "-5", "-Other"}, "-5", nullptr},
             {{"-Key", "-Other", "w"}, nullptr, "w"},
             {{"--Key", "v", "-Other", "w"}, nullptr, "w"},
             {{"-Other", "w", "--", "-Key", "v"}, nullptr, "w"},
             {{"-", "Key", "-Key", ""}, "", nullptr},
             {{"-Key", "v", "-Key", "last"}, "last", nullptr},
             {{"-Key", nullptr, "-Other", "w"}, nullptr, nullptr}, // the end, as in argv
             {{nullptr, "-Key", "v"}, nullptr, nullptr}};
    for (const auto& row : rows) {
        defaults->registerDefault("registered", "Key");
        defaults->setArguments(row.arguments);
        const Value expected = row.key.isNull() ? Value("registered") : row.key;
        EXPECT_EQ(defaults->objectForKey("Key"), expected);
        EXPECT_EQ(defaults->objectForKey("Other"), row.other);
    }
}

TEST_F(UserDefaultsTest, BooleansAndNumbersAreReadFromListsAndTexts) {
    const struct {
        const char* value;
        bool boolean;
        std::int64_t integer;
    } rows[]{{"<string>NO</string>", false, 0},
             {"<string>YES</string>", true, 0},
             {"<true/>", true, 1},
             {"<false/>", false, 0},
             {"<integer> -12 </integer>", true, -12},
             {"<real>2.5</real>", true, 2},
             {"<string>7</string>", true, 7}};
    for (const auto& row : rows) {
        sandbox.write("config/Client.plist", listWith(row.value));
        defaults->synchronize();
        EXPECT_EQ(defaults->boolForKey("Key"), row.boolean) << row.value;
        EXPECT_EQ(defaults->integerForKey("Key"), row.integer) << row.value;
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

TEST(DirectoriesTest, TheUsersDirectoryIsTheFirstAbsoluteOneOfThree) {
    FileSandbox sandbox;
    const auto support = [] { return searchPathForApplicationSupport().at(0); };
    EXPECT_EQ(support(), std::string_view(sandbox.path("data")));
    EXPECT_EQ(configurationDirectory(), std::string_view(sandbox.path("config")));
    sandbox.setVariable("XDG_DATA_HOME", "relative");
    sandbox.setVariable("XDG_CONFIG_HOME", "");
    EXPECT_EQ(support(), std::string_view(sandbox.path("home/.local/share")));
    EXPECT_EQ(configurationDirectory(), std::string_view(sandbox.path("home/.config")));
    // A service may have neither; the account has a home.
    sandbox.setVariable("XDG_DATA_HOME", std::nullopt);
    sandbox.setVariable("HOME", std::nullopt);
    EXPECT_TRUE(support().view().ends_with("/.local/share")) << support().view();
    EXPECT_TRUE(support().view().starts_with('/'));
}
