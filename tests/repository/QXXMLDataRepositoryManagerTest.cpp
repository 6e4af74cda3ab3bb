#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>

#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>
#include <QXXMLMarshalling/QXXMLVolatileDataRepository.h>
#include <QXXMLMarshalling/base/Exception.h>

#include "support/FileSandbox.h"
#include "support/Patterns.h"
#include "support/Texts.h"

#include <gtest/gtest.h>

#include <functional>

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

TEST_F(RepositoryManagerTest, ARepositoryHasANameAndANameARepository) {
    EXPECT_THROW(manager->setRepository(nullptr, "three"), Exception);
    EXPECT_THROW(manager->setRepository(holding("a.xml"), nullptr), Exception);
    EXPECT_EQ(namesOf(*manager), "QXXMLDataRepositoryPersistentName ");
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
    const std::string addressOrRoot = ": 0x[0-9a-f]+|" + sandbox.root();
    EXPECT_EQ(support::replaced(support::oneLine(Value(manager)), addressOrRoot, ""),
              "<QXXMLDataRepositoryManager> repositories: { QXXMLDataRepositoryPersistentName = "
              "<QXXMLFileSystemDataRepository> searchPaths: ( /data/Client, /data/Client ); "
              "memory = <QXXMLVolatileDataRepository> documents: { doc = <held></held>; }; }");
}
