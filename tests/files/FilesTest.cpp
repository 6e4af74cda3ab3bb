#include "files/Files.h"

#include "files/AtomicWrite.h"
#include "files/Paths.h"

#include "support/FileSteps.h"

#include <gtest/gtest.h>

#include <fcntl.h>
#include <grp.h>
#include <sys/file.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <sys/xattr.h>

#include <csignal>

using namespace qx;

namespace {

struct FilesTest : ::testing::Test {
    TemporaryFolder sandbox;
};

struct Rights {
    mode_t mode;
    uid_t owner;
    gid_t group;
    bool operator==(const Rights&) const = default;
};

Rights rightsOf(const std::string& path) {
    struct stat status {};
    EXPECT_EQ(::stat(path.c_str(), &status), 0);
    return {status.st_mode & 0777U, status.st_uid, status.st_gid};
}

class Steps : public support::FileSteps<> {
public:
    Steps() {
        know("load", [this](auto& words) { load(words, ReadableFiles::regular); });
        know("load-any", [this](auto& words) { load(words, ReadableFiles::all); });
        know("write", [this](auto& words) {
            Ref<Error> error;
            if (!writeFileAtomically(path(words), words.at(1), &error))
                sayPath(error->description().str());
        });
        know("make-folders", [this](auto& words) {
            Ref<Error> error;
            if (!createDirectoryWithParents(path(words), &error))
                sayPath(error->description().str());
        });
        know("hard-link", [this](auto& words) {
            std::filesystem::create_hard_link(folder.path(words.at(1)), path(words));
        });
        know("target", [this](auto& words) { say(std::filesystem::read_symlink(path(words))); });
        know("rights", [this](auto& words) {
            say((std::ostringstream() << std::oct << rightsOf(path(words)).mode).str());
        });
        know("name", [this](auto& words) { sayOrNone(relativePath(words.at(0))); });
        know("url", [this](auto& words) { sayOrNone(pathOfURL(words.at(0))); });
    }

private:
    void load(const Arguments& words, ReadableFiles readable) {
        Ref<Error> error;
        const auto data = readFile(path(words), &error, readable, std::stoul(words.at(1)));
        sayPath(data ? std::string(data->view()) : error->description().str());
    }
    void sayOrNone(const String& text) { say(text.isNull() ? "none" : text.str()); }
};
const bool added = support::addSteps<Steps>("tests/files/files.md");

} // namespace

TEST_F(FilesTest, AFileIsReadWholeAndItsBytesStay) {
    for (const std::size_t size : {std::size_t{0}, std::size_t{1}, std::size_t{70'000}}) {
        const std::string text(size, 'x');
        const std::string path = sandbox.write("file" + std::to_string(size), text);
        const auto data = readFile(path);
        ASSERT_TRUE(data);
        ASSERT_EQ(::truncate(path.c_str(), 0), 0);
        EXPECT_EQ(data->view(), text);
    }
    // Files of the kernel claim to be empty.
    EXPECT_GT(readFile("/proc/self/status")->size(), 100U);
}

TEST_F(FilesTest, AZeroByteInAPathNamesNothing) {
    const std::string path = sandbox.write("secret", "x") + std::string("\0.xml", 5);
    EXPECT_TRUE(relativePath(std::string_view("a\0b", 3)).isNull());
    Ref<Error> error;
    EXPECT_FALSE(readFile(path, &error));
    EXPECT_FALSE(fileExists(path));
    EXPECT_FALSE(writeFileAtomically(path, "y", &error));
    EXPECT_EQ(error->code(), 514);
    EXPECT_EQ(sandbox.read("secret"), "x");
}

TEST_F(FilesTest, AFileThatIsReplacedKeepsTheRightsThatItsWriterMayGive) {
    if (::geteuid() != 0)
        GTEST_SKIP() << "only the superuser can be others";
    ASSERT_EQ(::chmod(sandbox.root().c_str(), 0777), 0);
    const std::string path = sandbox.path("a.xml");
    const gid_t staff = 1234;
    const struct {
        uid_t writer;
        bool isMember;
        mode_t before;
        Rights after;
    } rows[]{{0, false, 0640, {0640, 99, staff}},
             {65534, true, 0664, {0664, 65534, staff}},
             {65534, false, 0664, {0604, 65534, 65534}},
             {65534, false, 0640, {0600, 65534, 65534}},
             {65534, false, 0604, {0600, 65534, 65534}}};
    for (const auto& row : rows) {
        sandbox.write("a.xml", "old");
        ASSERT_EQ(::chown(path.c_str(), 99, staff), 0);
        ASSERT_EQ(::chmod(path.c_str(), row.before), 0);
        const pid_t child = ::fork();
        if (child == 0) {
            const bool isOther =
                row.writer == 0 || (::setgroups(row.isMember ? 1 : 0, &staff) == 0 &&
                                    ::setgid(row.writer) == 0 && ::setuid(row.writer) == 0);
            ::_exit(isOther && writeFileAtomically(path, "new") ? 0 : 1);
        }
        int status = 0;
        ASSERT_EQ(::waitpid(child, &status, 0), child);
        EXPECT_EQ(status, 0);
        EXPECT_EQ(rightsOf(path), row.after)
            << std::oct << row.before << " " << rightsOf(path).mode;
        std::filesystem::remove(path);
    }
}

TEST_F(FilesTest, AnothersLinkInASharedFolderIsNotFollowed) {
    if (::geteuid() != 0)
        GTEST_SKIP() << "only the superuser can make another's link";
    const std::string link = sandbox.path("shared/a.xml");
    sandbox.write("victim.xml", "old");
    std::filesystem::create_directory(sandbox.path("shared"));
    std::filesystem::create_symlink("../victim.xml", link);
    ASSERT_EQ(::lchown(link.c_str(), 99, 99), 0);
    ASSERT_EQ(::chmod(sandbox.path("shared").c_str(), 01777), 0);
    Ref<Error> error;
    EXPECT_FALSE(writeFileAtomically(link, "new", &error));
    EXPECT_EQ(error->code(), 513);
    EXPECT_EQ(sandbox.read("victim.xml"), "old");
    EXPECT_EQ(sandbox.list("shared"), "a.xml ");
}

TEST_F(FilesTest, AnAccessListIsKeptAndNoneIsInherited) {
    // Version 2; owner, user 1234, group, mask, others.
    const auto list = [](char group) {
        const char text[] = "\2\0\0\0"
                            "\1\0\6\0\xFF\xFF\xFF\xFF"
                            "\2\0\4\0\xD2\4\0\0"
                            "\4\0\0\0\xFF\xFF\xFF\xFF"
                            "\x10\0\4\0\xFF\xFF\xFF\xFF"
                            "\x20\0\0\0\xFF\xFF\xFF\xFF";
        std::string bytes(text, sizeof text - 1);
        bytes[22] = group;
        return bytes;
    };
    const auto set = [](const std::string& path, const char* name, const std::string& value) {
        return ::setxattr(path.c_str(), name, value.data(), value.size(), 0) == 0;
    };
    const auto listOf = [](const std::string& path) {
        std::string value(100, ' ');
        const ssize_t size =
            ::getxattr(path.c_str(), "system.posix_acl_access", value.data(), value.size());
        return value.substr(0, size < 0 ? 0 : static_cast<std::size_t>(size));
    };
    const std::string listed = sandbox.write("area/listed.xml", "old");
    const std::string plain = sandbox.write("area/plain.xml", "old");
    ASSERT_EQ(::chmod(plain.c_str(), 0640), 0);
    if (!set(listed, "system.posix_acl_access", list(0)) ||
        !set(sandbox.path("area"), "system.posix_acl_default", list(4)))
        GTEST_SKIP() << "no access lists here";
    EXPECT_TRUE(writeFileAtomically(listed, "new"));
    EXPECT_TRUE(writeFileAtomically(plain, "new"));
    EXPECT_EQ(listOf(listed), list(0));
    EXPECT_EQ(listOf(plain), "");
    EXPECT_EQ(rightsOf(plain).mode, 0640U);
}

TEST_F(FilesTest, WhatAKilledWriterLeftIsSweptAndWhatALiveOneWritesIsNot) {
    const std::string live = sandbox.write("area/.~qx-save-0.tmp", "being written");
    for (int n = 1; n < 7; ++n)
        sandbox.write("area/.~qx-save-" + std::to_string(n) + ".tmp", "left");
    const int descriptor = ::open(live.c_str(), O_RDONLY | O_CLOEXEC);
    ASSERT_EQ(::flock(descriptor, LOCK_EX), 0);
    EXPECT_TRUE(writeFileAtomically(sandbox.path("area/a.xml"), "new"));
    EXPECT_EQ(sandbox.list("area"), ".~qx-save-0.tmp a.xml ");
    ::close(descriptor);
    EXPECT_TRUE(writeFileAtomically(sandbox.path("area/a.xml"), "new"));
    EXPECT_EQ(sandbox.list("area"), "a.xml ");
}

TEST_F(FilesTest, AFileThatOutgrowsItsLimitLeavesTheOldOne) {
    const std::string path = sandbox.write("area/a.xml", "old");
    rlimit former{};
    ASSERT_EQ(::getrlimit(RLIMIT_FSIZE, &former), 0);
    const rlimit small{1000, former.rlim_max};
    const auto formerHandler = std::signal(SIGXFSZ, SIG_IGN);
    ASSERT_EQ(::setrlimit(RLIMIT_FSIZE, &small), 0);
    Ref<Error> error;
    EXPECT_FALSE(writeFileAtomically(path, std::string(5000, 'x'), &error));
    ASSERT_EQ(::setrlimit(RLIMIT_FSIZE, &former), 0);
    std::signal(SIGXFSZ, formerHandler);
    EXPECT_EQ(error->localizedFailureReason(), "File too large");
    EXPECT_EQ(sandbox.list("area"), "a.xml ");
    EXPECT_EQ(sandbox.read("area/a.xml"), "old");
}
