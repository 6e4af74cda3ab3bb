#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>

#include <QXXMLMarshalling/base/Exception.h>

#include "support/FileSandbox.h"
#include "support/Texts.h"

#include <gtest/gtest.h>

#include <utility>

#include <sys/stat.h>

using namespace qx;

namespace {

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

    static Ref<Data> data(std::string_view text) { return make<Data>(text); }
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

TEST_F(FileSystemRepositoryTest, ANameIsLookedForFromTheVersionedFolderToTheLibrarysBundle) {
    const auto repository = QXXMLFileSystemDataRepository::init();
    EXPECT_EQ(pathsOf(*repository), "/data/Client/2.1.57 /data/Client ");
    EXPECT_EQ(repository->searchBundles()->at(0), Value(main));
    EXPECT_EQ(repository->searchBundles()->at(1), Value(Bundle::frameworkBundle()));

    EXPECT_TRUE(repository->pathForResourceNamed("de.lproj/Localizable.strings")
                    .view()
                    .starts_with(Bundle::frameworkBundle()->bundlePath()));
    EXPECT_FALSE(repository->containsDocument("a.xml"));
    // Each place shadows those behind it.
    for (const char* place : {"app/a.xml", "data/Client/a.xml", "data/Client/2.1.57/a.xml"}) {
        const std::string path = sandbox.write(place, "<" + std::string(1, place[0]) + "/>");
        EXPECT_EQ(repository->pathForResourceNamed("a.xml"), std::string_view(path));
    }
    EXPECT_TRUE(repository->containsDocument("a.xml"));
    EXPECT_TRUE(repository->containsData("a.xml"));
}

TEST_F(FileSystemRepositoryTest, VersionsAreCleanedBeforeTheyNameAFolder) {
    const struct {
        const char* version;
        const char* build;
        const char* expected;
    } rows[]{{"2.1", "57", "2.1.57"}, {"1.0(23)", "", "1.0.23"}, {"1.0 (23)", "", "1.0"},
             {"v1.0", "", ""},        {"3.0b2", "", "3.0"},      {"", "57", "57"},
             {"beta", "57a", "57"},   {"1", "x", "1"},           {"", "", ""}};
    const auto repository = QXXMLFileSystemDataRepository::init();
    for (const auto& row : rows) {
        main->infoDictionary()->set("CFBundleShortVersionString", row.version);
        main->infoDictionary()->set("CFBundleVersion", row.build);
        EXPECT_EQ(repository->applicationVersion(), row.expected) << row.version;
    }
    EXPECT_EQ(pathsOf(*QXXMLFileSystemDataRepository::init()), "/data/Client /data/Client ");
    main->infoDictionary()->set("CFBundleVersion", 12);
    EXPECT_EQ(repository->applicationVersion(), "12");
    main->infoDictionary()->removeAll();
    EXPECT_EQ(repository->applicationVersion(), "");
    ProcessInfo::setProcessVersion("4.0");
    EXPECT_EQ(repository->applicationVersion(), "4.0");
}

TEST_F(FileSystemRepositoryTest, AFolderThatEndsInTheProcessNameDoesNotGetItTwice) {
    for (const char* folder : {"area/MyClient", "area/MyClient//"}) {
        sandbox.setVariable("XDG_DATA_HOME", sandbox.path(folder));
        EXPECT_EQ(pathsOf(*QXXMLFileSystemDataRepository::init()),
                  "/area/MyClient/2.1.57 /area/MyClient ");
    }
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

TEST_F(FileSystemRepositoryTest, DocumentsAndDataAreReadFromTheFileFound) {
    sandbox.write("data/Client/maps/a.xml", "<a/>");
    sandbox.write("data/Client/broken.xml", "<a>");
    const std::string folder = sandbox.path("data/Client/folder.xml");
    std::filesystem::create_directories(folder);
    const std::string pipe = sandbox.path("data/Client/pipe.xml"); // that nobody writes to
    ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
    const auto repository = QXXMLFileSystemDataRepository::init();
    const struct {
        const char* name;
        const char* text;
        std::uint64_t size;
        std::string error;
    } rows[] = {{"maps/a.xml", "<a></a>", 4, ""},
                {"none.xml", "", 0, ""}, // a missing document is no failure
                {"broken.xml", "", 3, "Premature end"},
                {"folder.xml", "", 0, "The file cannot be read: " + folder},
                {"pipe.xml", "", 0, "The file cannot be read: " + pipe}};
    for (const auto& row : rows) {
        std::uint64_t size = 7;
        error.reset();
        const auto document = repository->documentNamed(row.name, &size, &error);
        EXPECT_EQ(document ? document->XMLString() : "", row.text) << row.name;
        EXPECT_EQ(size, row.size) << row.name;
        // What stands behind the beginning of a parser's text differs with its version.
        const std::string told = error ? error->localizedDescription().str() : "";
        EXPECT_EQ(told.substr(0, row.error.size()), row.error) << row.name;
        EXPECT_EQ(told.empty(), row.error.empty()) << row.name;
    }
    EXPECT_EQ(repository->dataForName("maps/a.xml", &error)->view(), "<a/>");
}

TEST_F(FileSystemRepositoryTest, ANameOrVersionThatLeavesItsDirectoryFindsNothingAndIsNotWritten) {
    const std::string outside = sandbox.write("data/outside.xml", "<out/>");
    std::filesystem::create_directories(sandbox.path("data/Client"));
    const auto refuses = [&](const String& written) {
        EXPECT_TRUE(written.isNull());
        EXPECT_TRUE(support::told(std::exchange(error, {})).starts_with("514: The file name is"));
    };
    const auto repository = QXXMLFileSystemDataRepository::init();
    for (const char* name : {"", "../outside.xml", outside.c_str(), ".", "x/../../outside.xml"}) {
        SCOPED_TRACE(name);
        EXPECT_FALSE(repository->containsDocument(name) || repository->dataForName(name, &error));
        EXPECT_FALSE(error);
        refuses(repository->writeFileToUserOverrideArea(data("new"), name, &error));
    }
    EXPECT_FALSE(repository->containsDocument(nullptr));
    for (const char* version : {"((", "..", "."}) {
        SCOPED_TRACE(version);
        ProcessInfo::setProcessVersion(version, "");
        const auto versioned = QXXMLFileSystemDataRepository::init();
        EXPECT_EQ(pathsOf(*versioned), "/data/Client ");
        EXPECT_FALSE(versioned->containsData("outside.xml"));
        refuses(versioned->writeFileToVersionedUserOverrideArea(data("x"), "a.xml", &error));
    }
    EXPECT_EQ(sandbox.read("data/outside.xml"), "<out/>");
    EXPECT_EQ(sandbox.list("data") + sandbox.list("data/Client"), "Client outside.xml ");
}

TEST_F(FileSystemRepositoryTest, WhatIsWrittenShadowsWhatShips) {
    sandbox.write("app/a.xml", "ships");
    const auto repository = QXXMLFileSystemDataRepository::init();
    const auto found = [&] { return std::string(repository->dataForName("a.xml")->view()); };
    EXPECT_EQ(repository->writeFileToUserOverrideArea(data("plain"), "a.xml", &error),
              std::string_view(sandbox.path("data/Client/a.xml")));
    EXPECT_EQ(found(), "plain");
    EXPECT_EQ(repository->writeFileToVersionedUserOverrideArea(data("versioned"), "a.xml", &error),
              std::string_view(sandbox.path("data/Client/2.1.57/a.xml")));
    EXPECT_EQ(found(), "versioned");
    EXPECT_EQ(repository->writeFileToUserOverrideArea(data("deep"), "maps/b.xml", &error),
              std::string_view(sandbox.path("data/Client/maps/b.xml")));

    const auto document = XMLDocument::initWithData("<a><b></b><c/></a>");
    EXPECT_FALSE(repository->writeDocumentToUserOverrideArea(document, "c.xml", &error).isNull());
    EXPECT_EQ(sandbox.read("data/Client/c.xml"), "<a>\n    <b/>\n    <c/>\n</a>\n");
    EXPECT_FALSE(error);
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
    refuses(repository->writeFileToUserOverrideArea(data("x"), "a.xml", &error),
            "-2000: Application support area is not a directory: " + area +
                " (Unable to write XML to user area)");
    refuses(repository->writeFileToVersionedUserOverrideArea(data("x"), "a.xml", &error),
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
