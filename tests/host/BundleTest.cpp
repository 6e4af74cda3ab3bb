#include <QXXMLMarshalling/host/Bundle.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/base/Version.h>
#include <QXXMLMarshalling/model/Data.h>

#include "support/FileSandbox.h"
#include "support/Show.h"

#include <gtest/gtest.h>

#include <system_error>

using namespace qx;

namespace {

struct BundleTest : ::testing::Test {
    FileSandbox sandbox;
};

class HostObject : public Object {};

// A class that only the C++ run-time's library knows.
const std::type_info& typeOfRunTime() {
    const auto& category = std::generic_category();
    return typeid(category);
}

} // namespace

TEST_F(BundleTest, TheInfoDictionaryHoldsEveryKindOfAPropertyList) {
    sandbox.write("app/Info.plist", R"(<?xml version="1.0" encoding="UTF-8"?>
        <!DOCTYPE plist SYSTEM "file:///does/not/exist.dtd">
        <plist version="1.0"><dict>
            <key>text</key><string>a &amp; b</string>  <key>blank</key><string> </string>
            <key>none</key><string/>                   <key>orphan</key>
            <key>list</key><array><integer>1</integer><true/><dict/></array>
            <key>bytes</key><data> aGVs
                bG8= </data>                           <key>odd</key><unknown/>
            <key>when</key><date>2020-01-02T03:04:05Z</date>
        </dict></plist>)");
    const auto bundle = Bundle::bundleWithPath(sandbox.path("app"));
    const auto info = bundle->infoDictionary();
    Bundle::forget(bundle);
    EXPECT_EQ(info->get("bytes").as<Data>()->view(), "hello");
    info->remove("bytes");
    EXPECT_EQ(support::show(info), "{blank: \" \", list: [1, true, {}], none: \"\", "
                                   "text: \"a & b\", when: \"2020-01-02T03:04:05Z\"}");
}

TEST_F(BundleTest, NothingIsFoundUnderNoName) {
    const auto bundle = sandbox.bundle("app");
    EXPECT_TRUE(bundle->pathForResource(nullptr).isNull());
    EXPECT_TRUE(bundle->localizedString(nullptr).isNull());
    EXPECT_TRUE(bundle->objectForInfoDictionaryKey(nullptr).isNull());
    EXPECT_FALSE(Bundle::bundleWithPath(nullptr));
}

TEST_F(BundleTest, ABundleIsOpenedOnceAndThenFoundByItsIdentifier) {
    EXPECT_FALSE(Bundle::bundleWithIdentifier("org.example.Once"));
    EXPECT_FALSE(Bundle::bundleWithPath(sandbox.path("app")));
    const auto bundle = sandbox.bundle("app", {{"CFBundleIdentifier", "org.example.Once"}});
    EXPECT_EQ(Bundle::bundleWithIdentifier("org.example.Once"), bundle);
    EXPECT_EQ(Bundle::bundleWithPath(sandbox.path("app/../app/")), bundle);
    EXPECT_FALSE(Bundle::bundleWithIdentifier(nullptr));
}

TEST_F(BundleTest, WhatEndsWithTheMainBundleMayAskForBundles) {
    struct Asking : Object {
        ~Asking() override { Bundle::bundleWithIdentifier("org.example.Asked"); }
    };
    sandbox.write("asking/Info.plist", "<dict/>");
    auto bundle = Bundle::bundleWithPath(sandbox.path("asking"));
    bundle->infoDictionary()->set("asking", make<Asking>());
    Bundle::setMainBundle(bundle);
    Bundle::forget(std::exchange(bundle, nullptr));
    Bundle::setMainBundle(nullptr);
}

TEST_F(BundleTest, TheLibrarysOwnBundleHoldsItsResources) {
    const auto bundle = Bundle::frameworkBundle();
    EXPECT_EQ(bundle->bundleIdentifier(), "org.qxxml.QXXMLMarshalling");
    EXPECT_EQ(bundle->objectForInfoDictionaryKey("CFBundleShortVersionString"),
              Value(String(libraryVersionText())));
    EXPECT_FALSE(bundle->pathForResource("de.lproj/Localizable", "strings").isNull());
    EXPECT_EQ(Bundle::bundleWithIdentifier("org.qxxml.QXXMLMarshalling"), bundle);
}

TEST_F(BundleTest, TheMainBundleIsTheHostsElseThatOfTheProgram) {
    const auto program = std::filesystem::path(ProcessInfo::executablePath().str());
    EXPECT_EQ(Bundle::mainBundle()->bundlePath(), std::string_view(program.parent_path().native()));
    EXPECT_EQ(Bundle::bundleForClass(typeid(HostObject)), Bundle::mainBundle());
    const auto runTime = Bundle::bundleForClass(typeOfRunTime());
    EXPECT_NE(runTime, Bundle::mainBundle());
    EXPECT_FALSE(runTime->pathForResource("libstdc++.so.6").isNull());

    const auto chosen = sandbox.bundle("app", {{"CFBundleVersion", "57"}});
    Bundle::setMainBundle(chosen);
    EXPECT_EQ(Bundle::mainBundle(), chosen);
    EXPECT_EQ(chosen->objectForInfoDictionaryKey("CFBundleVersion"), Value("57"));
    ProcessInfo::setProcessVersion("2.1", "58");
    EXPECT_EQ(chosen->objectForInfoDictionaryKey("CFBundleShortVersionString"), Value("2.1"));
    EXPECT_EQ(chosen->objectForInfoDictionaryKey("CFBundleVersion"), Value("58"));
    EXPECT_EQ(sandbox.bundle("other")->objectForInfoDictionaryKey("CFBundleVersion"), Value());
}

TEST_F(BundleTest, AProcessNameIsAFileName) {
    EXPECT_EQ(ProcessInfo::processName(), "Client");
    for (const char* name : {"", ".", "..", "a/b"})
        EXPECT_THROW(ProcessInfo::setProcessName(name), Exception) << name;
    ProcessInfo::setProcessName(nullptr);
    EXPECT_TRUE(ProcessInfo::processName().view().starts_with("test_"));
}
