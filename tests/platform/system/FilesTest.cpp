#include "platform/system/Files.h"

#include "support/FileSandbox.h"

#include <gtest/gtest.h>

#include <sys/resource.h>
#include <sys/stat.h>

#include <csignal>

using namespace qx;

namespace {

class FilesTest : public ::testing::Test {
protected:
    FileSandbox sandbox;
};

} // namespace

TEST_F(FilesTest, AFileIsReadWholeWhetherMappedOrCopied) {
    for (const std::size_t size : {std::size_t{0}, std::size_t{1}, std::size_t{70'000}}) {
        const std::string text(size, 'x');
        const std::string path = sandbox.write("file" + std::to_string(size), text);
        for (const auto mode : {0600U, 0666U}) { // everybody may shorten the second
            ASSERT_EQ(::chmod(path.c_str(), mode), 0);
            const auto data = readFile(path);
            ASSERT_TRUE(data);
            EXPECT_EQ(data->view(), text);
        }
    }
    // Files of the kernel claim to be empty.
    EXPECT_GT(readFile("/proc/self/status")->size(), 100U);
}

TEST_F(FilesTest, WhatCannotBeReadIsToldWithItsPathAndTheSystemsReason) {
    const std::string file = sandbox.write("file", "x");
    const std::pair<std::string, std::string> rows[]{
        {sandbox.path("none"), "NSCocoaErrorDomain 260: There is no such file: " +
                                   sandbox.path("none") + " (No such file or directory)"},
        {file + "/below",
         "NSCocoaErrorDomain 260: There is no such file: " + file + "/below (Not a directory)"},
        {sandbox.root(), "NSCocoaErrorDomain 256: The file cannot be read: " + sandbox.root() +
                             " (Is a directory)"},
        {"", "NSCocoaErrorDomain 260: There is no such file:  (No such file or directory)"}};
    for (const auto& [path, expected] : rows) {
        Ref<Error> error;
        EXPECT_FALSE(readFile(path, &error));
        ASSERT_TRUE(error) << path;
        EXPECT_EQ(error->description().str(), expected);
    }
}

TEST_F(FilesTest, AZeroByteInAPathNamesNothing) {
    const std::string path = sandbox.write("secret", "x") + std::string("\0.xml", 5);
    Ref<Error> error;
    EXPECT_FALSE(readFile(path, &error));
    EXPECT_FALSE(fileExists(path));
    EXPECT_FALSE(writeFileAtomically(path, "y", &error));
    EXPECT_EQ(error->code(), 514);
    EXPECT_EQ(sandbox.read("secret"), "x");
}

TEST_F(FilesTest, AWrittenFileTakesThePlaceOfTheOldOneWithItsPermissions) {
    const std::string path = sandbox.write("area/a.xml", "old");
    ASSERT_EQ(::chmod(path.c_str(), 0640), 0);
    // A link is replaced and not followed.
    std::filesystem::create_symlink(path, sandbox.path("area/link.xml"));
    for (const char* name : {"link.xml", "b.xml"})
        EXPECT_TRUE(writeFileAtomically(sandbox.path("area/") + name, "other"));
    EXPECT_FALSE(std::filesystem::is_symlink(sandbox.path("area/link.xml")));
    EXPECT_EQ(sandbox.read("area/a.xml"), "old");
    EXPECT_TRUE(writeFileAtomically(path, "new"));
    struct stat status {};
    ASSERT_EQ(::stat(path.c_str(), &status), 0);
    EXPECT_EQ(status.st_mode & 0777U, 0640U);
    EXPECT_EQ(sandbox.read("area/a.xml"), "new");
    EXPECT_EQ(sandbox.list("area"), "a.xml b.xml link.xml ");
}

TEST_F(FilesTest, WhatCannotBeWrittenIsToldAndNothingIsLeftBehind) {
    const std::string file = sandbox.write("area/file", "x");
    std::filesystem::create_directory(sandbox.path("area/folder"));
    const std::string longName = sandbox.path("area/" + std::string(300, 'n'));
    const std::pair<std::string, std::string> rows[]{
        {file + "/below", "512: The file cannot be written: " + file + "/below (Not a directory)"},
        {sandbox.path("area/folder"),
         "512: The file cannot be written: " + sandbox.path("area/folder") + " (Is a directory)"},
        {"/proc/a.xml", "512: The file cannot be written: /proc/a.xml (No such file or directory)"},
        {longName, "512: The file cannot be written: " + longName + " (File name too long)"}};
    for (const auto& [path, expected] : rows) {
        Ref<Error> error;
        EXPECT_FALSE(writeFileAtomically(path, "y", &error));
        ASSERT_TRUE(error) << path;
        EXPECT_EQ(error->description().str(), "NSCocoaErrorDomain " + expected);
    }
    EXPECT_EQ(sandbox.list("area"), "file folder ");
    EXPECT_EQ(sandbox.read("area/file"), "x");
}

TEST_F(FilesTest, AFileThatOutgrowsItsLimitLeavesTheOldOne) {
    const std::string path = sandbox.write("area/a.xml", "old");
    rlimit former{};
    ASSERT_EQ(::getrlimit(RLIMIT_FSIZE, &former), 0);
    const rlimit small{1000, former.rlim_max};
    const auto formerHandler = std::signal(SIGXFSZ, SIG_IGN);
    ASSERT_EQ(::setrlimit(RLIMIT_FSIZE, &small), 0);
    Ref<Error> error;
    const bool written = writeFileAtomically(path, std::string(5000, 'x'), &error);
    ASSERT_EQ(::setrlimit(RLIMIT_FSIZE, &former), 0);
    std::signal(SIGXFSZ, formerHandler);
    EXPECT_FALSE(written);
    ASSERT_TRUE(error);
    EXPECT_EQ(error->localizedFailureReason(), "File too large");
    EXPECT_EQ(sandbox.list("area"), "a.xml ");
    EXPECT_EQ(sandbox.read("area/a.xml"), "old");
}

TEST_F(FilesTest, DirectoriesAreMadeWithThoseAboveThem) {
    EXPECT_TRUE(createDirectoryWithParents(sandbox.path("a/b//c/")));
    EXPECT_TRUE(createDirectoryWithParents(sandbox.path("a/b/c")));
    EXPECT_TRUE(isDirectory(sandbox.path("a/b/c")));

    sandbox.write("plain", "x");
    Ref<Error> error;
    EXPECT_FALSE(createDirectoryWithParents(sandbox.path("plain/c"), &error));
    ASSERT_TRUE(error);
    EXPECT_EQ(error->localizedDescription().str(),
              "The file cannot be written: " + sandbox.path("plain"));
}

TEST(FileNames, ANameStaysBelowItsDirectoryOrIsNone) {
    for (const char* name :
         {"", ".", "..", "/a.xml", "../a.xml", "sub/../../a.xml", "sub/..", "//"})
        EXPECT_TRUE(relativePath(name).isNull()) << name;
    EXPECT_TRUE(relativePath(std::string_view("a\0b", 3)).isNull());
    for (const char* name : {"a.xml", "sub/a.xml", "...", "a..b/..c"})
        EXPECT_EQ(relativePath(name), name);
    EXPECT_EQ(relativePath("./sub//a.xml"), "sub/a.xml");
    EXPECT_EQ(relativePath("sub/../a.xml"), "a.xml");
}

TEST(FileNames, AFileURLIsAPath) {
    const char* const rows[][2] = {{"/a b", "/a b"},
                                   {"sub/a%20b", "sub/a%20b"},
                                   {"file:///a%20b%C3%A4", "/a b\xC3\xA4"},
                                   {"file:/a", "/a"},
                                   {"file://localhost/a%2", "/a%2"},
                                   {"file://elsewhere/a", nullptr},
                                   {"https://example.org/a.xml", nullptr}};
    for (const auto& [url, expected] : rows)
        EXPECT_EQ(pathOfURL(url), expected) << url;
}
