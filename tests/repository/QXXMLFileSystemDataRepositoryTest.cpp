#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>

#include <QXXMLMarshalling/base/Exception.h>

#include "RepositorySteps.h"

#include <gtest/gtest.h>

#include <utility>

using namespace qx;

namespace {

const bool added = support::addSteps<RepositorySteps>("tests/repository/repositories.md");

// A client of version 2.1.57 in a world of its own.
class FileSystemRepositoryTest : public ::testing::Test {
protected:
    FileSystemRepositoryTest()
        : main(sandbox.bundle("app",
                              {{"CFBundleShortVersionString", "2.1"}, {"CFBundleVersion", "57"}})) {
        Bundle::setMainBundle(main);
    }
    ~FileSystemRepositoryTest() override {
        UserDefaults::standardUserDefaults()->removeObjectForKey(
            QXXMLFileSystemDataRepository::clientBundleIdentifierKey);
        QXXMLFileSystemDataRepository::setRepositoryCreateFunction(nullptr);
    }

    std::string pathsOf(QXXMLFileSystemDataRepository& repository) const {
        std::string text;
        for (const Value& path : *repository.searchPaths())
            text += path.string().view().substr(sandbox.root().size()).data() + std::string(" ");
        return text;
    }

    FileSandbox sandbox;
    Ref<Bundle> main;
    Ref<Error> error;
};

// Looks in a folder of its own before any other.
class SiteRepository : public QXXMLFileSystemDataRepository {
public:
    void addPathToSearchPaths(const String& directory, const String& processName) override {
        QXXMLFileSystemDataRepository::addPathToSearchPaths(directory, processName);
        searchPaths()->insert(0, "/srv/site");
    }
    String applicationVersion() override { return "9"; }
};

} // namespace

TEST_F(FileSystemRepositoryTest, TheBundlesOfTheClientAndOfTheLibraryAreSearchedToo) {
    const auto repository = QXXMLFileSystemDataRepository::init();
    EXPECT_EQ(repository->searchBundles()->at(0), Value(main));
    EXPECT_EQ(repository->searchBundles()->at(1), Value(Bundle::frameworkBundle()));
    EXPECT_TRUE(repository->pathForResourceNamed("de.lproj/Localizable.strings")
                    .view()
                    .starts_with(Bundle::frameworkBundle()->bundlePath()));
    // Versions by themselves: a number, none, that of the process.
    main->infoDictionary()->removeAll();
    EXPECT_EQ(repository->applicationVersion(), "");
    main->infoDictionary()->set("CFBundleVersion", 12);
    EXPECT_EQ(repository->applicationVersion(), "12");
    ProcessInfo::setProcessVersion("4.0", "");
    EXPECT_EQ(repository->applicationVersion(), "4.0");
}

TEST_F(FileSystemRepositoryTest, TheClientsBundleIsTheOneThatTheUserDefaultNames) {
    const auto client = sandbox.bundle(
        "client", {{"CFBundleIdentifier", "org.example.Client"}, {"CFBundleVersion", "8"}});
    const auto defaults = UserDefaults::standardUserDefaults();
    defaults->setObject("org.example.Client",
                        QXXMLFileSystemDataRepository::clientBundleIdentifierKey);
    const auto repository = QXXMLFileSystemDataRepository::init();
    EXPECT_EQ(repository->applicationBundle(), client);
    EXPECT_EQ(pathsOf(*repository), "/data/Client/8 /data/Client ");

    defaults->setObject("org.example.None",
                        QXXMLFileSystemDataRepository::clientBundleIdentifierKey);
    ::testing::internal::CaptureStderr();
    EXPECT_EQ(repository->applicationBundle(), main);
    const std::string warning = ::testing::internal::GetCapturedStderr();
    EXPECT_TRUE(std::string_view(warning).ends_with(
        "] Unable to locate bundle with identifier: org.example.None\n"))
        << warning;
}

TEST_F(FileSystemRepositoryTest, TheCreationHookAndASubclassChangeTheSearch) {
    QXXMLFileSystemDataRepository::setRepositoryCreateFunction(
        [](QXXMLFileSystemDataRepository& repository) {
            repository.searchPaths()->add(repository.userOverrideArea());
            repository.setSearchBundles(nullptr);
        });
    const auto repository = QXXMLFileSystemDataRepository::init();
    EXPECT_EQ(pathsOf(*repository), "/data/Client/2.1.57 /data/Client /data/Client ");
    sandbox.write("app/a.xml", "<a/>");
    EXPECT_FALSE(repository->containsDocument("a.xml"));

    const auto site = QXXMLFileSystemDataRepository::init<SiteRepository>();
    EXPECT_EQ(site->searchPaths()->at(0), Value("/srv/site"));
    EXPECT_EQ(site->searchPaths()->at(1), Value(sandbox.path("data/Client/9")));
}

TEST_F(FileSystemRepositoryTest, WhatCannotBeWrittenIsToldAndChangesNothing) {
    const auto repository = QXXMLFileSystemDataRepository::init();
    const auto refuses = [&](const String& written, const std::string& expected) {
        EXPECT_TRUE(written.isNull());
        EXPECT_TRUE(support::told(std::exchange(error, {})).starts_with(expected));
    };
    const auto unwritable = XMLDocument::initWithData("<a/>");
    unwritable->setStringValue("\x01");
    refuses(repository->writeFileToUserOverrideArea(nullptr, "a.xml", &error), "512: ");
    refuses(repository->writeDocumentToUserOverrideArea(nullptr, "a.xml", &error), "512: ");
    refuses(repository->writeDocumentToUserOverrideArea(unwritable, "a.xml", &error), "517: ");
    EXPECT_FALSE(std::filesystem::exists(sandbox.path("data")));
    const std::string area = sandbox.write("data/Client", "a plain file");
    refuses(repository->writeFileToUserOverrideArea(make<Data>(std::string("x")), "a.xml", &error),
            "-2000: Application support area is not a directory: " + area +
                " (Unable to write XML to user area)");
    refuses(repository->writeFileToVersionedUserOverrideArea(make<Data>(std::string("x")), "a.xml",
                                                             &error),
            "512: The file cannot be written: " + area + " (Not a directory)");
    EXPECT_EQ(sandbox.read("data/Client"), "a plain file");
}

TEST_F(FileSystemRepositoryTest, ListsMayHoldAnythingAndItsDescriptionShowsThePaths) {
    const auto repository = QXXMLFileSystemDataRepository::init();
    const std::string here = sandbox.write("here/a.xml", "<a/>");
    repository->setSearchPaths(make<Array>(
        std::initializer_list<Value>{nullptr, 5, make<Dictionary>(), sandbox.path("here")}));
    repository->setSearchBundles(make<Array>(std::initializer_list<Value>{"text", nullptr, main}));
    EXPECT_EQ(repository->pathForResourceNamed("a.xml"), std::string_view(here));
    EXPECT_FALSE(repository->containsDocument("b.xml"));

    const String plain = repository->Object::description();
    EXPECT_EQ(repository->description(),
              String::concat({plain, " searchPaths: ", repository->searchPaths()->description()}));
    repository->setSearchPaths(nullptr);
    EXPECT_EQ(repository->description(), plain);
}
