#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>

#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>
#include <QXXMLMarshalling/QXXMLVolatileDataRepository.h>
#include <QXXMLMarshalling/base/Exception.h>

#include "support/FileSandbox.h"
#include "support/Texts.h"

#include <gtest/gtest.h>

#include <functional>
#include <regex>

using namespace qx;

namespace {

class RepositoryManagerTest : public ::testing::Test {
protected:
    RepositoryManagerTest() { Bundle::setMainBundle(sandbox.bundle("app")); }

    static Ref<QXXMLVolatileDataRepository> holding(const char* name) {
        auto repository = QXXMLVolatileDataRepository::init();
        repository->setDocument(XMLDocument::initWithData("<held/>"), name);
        return repository;
    }
    static std::string namesOf(const QXXMLDataRepositoryManager& manager) {
        std::string text;
        for (const Value& name : *manager.repositoryNames())
            text += name.string().str() + " ";
        return text;
    }

    FileSandbox sandbox;
    Ref<QXXMLDataRepositoryManager> manager = QXXMLDataRepositoryManager::init();
};

// Does something when it is asked.
class Meddler : public QXXMLVolatileDataRepository {
public:
    std::function<void()> whenAsked;
    bool containsDocument(const String&) override {
        whenAsked();
        return false;
    }
};

class Searching : public QXXMLFileSystemDataRepository {
public:
    std::size_t searches = 0;
    String pathForResourceNamed(const String& name) override {
        ++searches;
        return QXXMLFileSystemDataRepository::pathForResourceNamed(name);
    }
};

} // namespace

TEST_F(RepositoryManagerTest, AFreshManagerAsksTheFileSystemAlone) {
    EXPECT_EQ(namesOf(*manager), "QXXMLDataRepositoryPersistentName ");
    EXPECT_FALSE(manager->volatileRepository());
    EXPECT_TRUE(manager->persistentRepository().as<QXXMLFileSystemDataRepository>());

    sandbox.write("data/Client/a.xml", "<a/>");
    std::uint64_t size = 0;
    EXPECT_EQ(manager->documentNamed("a.xml", &size)->rootElement()->name(), "a");
    EXPECT_EQ(size, 4U);
    EXPECT_EQ(manager->dataForName("a.xml")->view(), "<a/>");

    Ref<Error> error;
    EXPECT_FALSE(manager->documentNamed("none.xml", &size, &error));
    EXPECT_FALSE(manager->dataForName("none.xml", &error));
    EXPECT_EQ(size, 4U);
    EXPECT_FALSE(error);
}

TEST_F(RepositoryManagerTest, TheFirstThatClaimsANameServesIt) {
    sandbox.write("data/Client/a.xml", "<file/>");
    const auto memory = holding("a.xml");
    manager->setVolatileRepository(memory);
    EXPECT_EQ(namesOf(*manager),
              "QXXMLDataRepositoryPersistentName QXXMLDataRepositoryVolatileName ");
    EXPECT_EQ(manager->documentNamed("a.xml")->rootElement()->name(), "file");
    manager->setRepositoryNames(make<Array>(std::initializer_list<Value>{
        "nobody", nullptr, QXXMLDataRepositoryVolatileName, QXXMLDataRepositoryPersistentName}));
    EXPECT_EQ(manager->documentNamed("a.xml")->rootElement()->name(), "held");
    EXPECT_EQ(manager->repositoryForDocumentNamed("a.xml"), memory);
    EXPECT_EQ(manager->repositoryForDataNamed("a.xml"), manager->persistentRepository());
    manager->setRepositoryNames(nullptr);
    EXPECT_FALSE(manager->documentNamed("a.xml"));
}

TEST_F(RepositoryManagerTest, NoOtherRepositoryIsAskedWhenTheFirstFails) {
    sandbox.write("data/Client/a.xml", "<broken");
    const std::string folder = sandbox.path("data/Client/b");
    std::filesystem::create_directory(folder);
    const auto memory = holding("a.xml");
    memory->setData(make<Data>(), "b");
    manager->setVolatileRepository(memory);
    Ref<Error> error;
    EXPECT_FALSE(manager->documentNamed("a.xml", nullptr, &error));
    EXPECT_EQ(error->domain(), Error::parserDomain);
    error.reset();
    EXPECT_FALSE(manager->dataForName("b", &error));
    EXPECT_EQ(error->localizedDescription().str(), "The file cannot be read: " + folder);
}

TEST_F(RepositoryManagerTest, ANameIsSearchedOnceForEachLookUpAndNoneIsKept) {
    sandbox.write("app/a.xml", "<shipped/>");
    const auto files = QXXMLFileSystemDataRepository::init<Searching>();
    manager->setPersistentRepository(files);
    EXPECT_EQ(manager->documentNamed("a.xml")->rootElement()->name(), "shipped");
    EXPECT_TRUE(manager->dataForName("a.xml"));
    EXPECT_EQ(files->searches, 2U);

    EXPECT_TRUE(manager->repositoryForDocumentNamed("a.xml"));
    sandbox.write("data/Client/a.xml", "<own/>");
    EXPECT_EQ(files->documentNamed("a.xml")->rootElement()->name(), "own");
    EXPECT_EQ(manager->documentNamed("a.xml")->rootElement()->name(), "own");
}

TEST_F(RepositoryManagerTest, ARepositoryUnderAKnownNameKeepsItsPlace) {
    manager->addRepository(holding("a.xml"), "one");
    manager->addRepository(holding("b.xml"), "two");
    const auto replacement = holding("c.xml");
    manager->setRepository(replacement, "one");
    EXPECT_EQ(namesOf(*manager), "QXXMLDataRepositoryPersistentName one two ");
    EXPECT_EQ(manager->repositoryForName("one"), replacement);
    EXPECT_FALSE(manager->documentNamed("a.xml"));
    EXPECT_THROW(manager->setRepository(nullptr, "three"), Exception);
    EXPECT_THROW(manager->setRepository(replacement, nullptr), Exception);
    EXPECT_EQ(namesOf(*manager), "QXXMLDataRepositoryPersistentName one two ");
    manager->setRepositoryNames(make<Array>(std::initializer_list<Value>{
        QXXMLDataRepositoryVolatileName, QXXMLDataRepositoryPersistentName}));
    manager->setVolatileRepository(replacement); // whose name has its place already
    EXPECT_EQ(namesOf(*manager),
              "QXXMLDataRepositoryVolatileName QXXMLDataRepositoryPersistentName ");
}

TEST_F(RepositoryManagerTest, ChangingTheOrderDuringALookUpRaises) {
    const auto meddler = make<Meddler>();
    manager->addRepository(meddler, "meddler");
    manager->addRepository(holding("a.xml"), "last");
    for (const auto& change : std::vector<std::function<void()>>{
             [this] { manager->repositoryNames()->remove(0); },
             [this] { manager->addRepository(holding("b.xml"), "new"); },
             [this] { manager->repositoryNames()->removeAll(); },
             [this] { manager->setRepositoryNames(make<Array>()); }}) {
        manager->setRepositoryNames(make<Array>(std::initializer_list<Value>{"meddler", "last"}));
        meddler->whenAsked = change;
        EXPECT_THROW(manager->documentNamed("a.xml"), Exception);
    }
}

TEST_F(RepositoryManagerTest, TheSharedManagerIsMadeOnceUntilItIsFlushedAndNotWhileItIsMade) {
    using Manager = QXXMLDataRepositoryManager;
    Manager::flushDefaultManager();
    const auto shared = Manager::defaultManager();
    shared->setVolatileRepository(holding("a.xml"));
    EXPECT_EQ(Manager::defaultManager(), shared);
    Manager::flushDefaultManager();
    QXXMLFileSystemDataRepository::setRepositoryCreateFunction(
        [](QXXMLFileSystemDataRepository&) { Manager::defaultManager(); });
    EXPECT_THROW(Manager::defaultManager(), Exception);
    QXXMLFileSystemDataRepository::setRepositoryCreateFunction(nullptr);
    EXPECT_EQ(namesOf(*Manager::defaultManager()), "QXXMLDataRepositoryPersistentName ");
    Manager::flushDefaultManager();
}

TEST_F(RepositoryManagerTest, TheDescriptionShowsTheRepositoriesAndTheirDocumentsButNoData) {
    const auto memory = holding("doc");
    memory->setData(make<Data>(), "data");
    manager->addRepository(memory, "memory");
    const std::regex addressOrRoot(": 0x[0-9a-f]+|" + sandbox.root());
    EXPECT_EQ(std::regex_replace(support::oneLine(Value(manager)), addressOrRoot, ""),
              "<QXXMLDataRepositoryManager> repositories: { QXXMLDataRepositoryPersistentName = "
              "<QXXMLFileSystemDataRepository> searchPaths: ( /data/Client, /data/Client ); "
              "memory = <QXXMLVolatileDataRepository> documents: { doc = <held></held>; }; }");
}
