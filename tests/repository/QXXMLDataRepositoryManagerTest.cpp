#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>

#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>
#include <QXXMLMarshalling/QXXMLVolatileDataRepository.h>
#include <QXXMLMarshalling/platform/Exception.h>

#include "support/FileSandbox.h"

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

// Both kinds at once, and does something when it is asked.
class BothKinds : public QXXMLMutableDataRepository, public QXXMLPersistentRepository {
public:
    std::function<void()> whenAsked = [] {};

    bool containsDocument(const String&) override {
        whenAsked();
        return false;
    }
    bool containsData(const String&) override { return true; }
    Ref<XMLDocument> documentNamed(const String&, std::uint64_t*, Ref<Error>*) override {
        return nullptr;
    }
    Ref<Data> dataForName(const String&, Ref<Error>* error) override {
        if (error != nullptr)
            *error = make<Error>("Host", -1, "refused", "always");
        return nullptr;
    }
    bool setDocument(const Ref<XMLDocument>&, const String&, Ref<Error>*) override { return false; }
    String pathForResourceNamed(const String&) override { return nullptr; }
    String writeDocumentToUserOverrideArea(const Ref<XMLDocument>&, const String&,
                                           Ref<Error>*) override {
        return nullptr;
    }
    String writeFileToUserOverrideArea(const Ref<Data>&, const String&, Ref<Error>*) override {
        return nullptr;
    }
    String writeFileToVersionedUserOverrideArea(const Ref<Data>&, const String&,
                                                Ref<Error>*) override {
        return nullptr;
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
    manager->setVolatileRepository(holding("a.xml"));
    Ref<Error> error;
    EXPECT_FALSE(manager->documentNamed("a.xml", nullptr, &error));
    ASSERT_TRUE(error);
    EXPECT_EQ(error->domain(), Error::parserDomain);
    error.reset();
    manager->setPersistentRepository(make<BothKinds>());
    EXPECT_FALSE(manager->dataForName("a.xml", &error));
    EXPECT_EQ(error->description(), "Host -1: refused (always)");
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
}

TEST_F(RepositoryManagerTest, ChangingTheOrderDuringALookUpRaises) {
    const auto meddler = make<BothKinds>();
    manager->addRepository(meddler, "meddler");
    manager->addRepository(holding("a.xml"), "last");
    const std::function<void()> changes[]{
        [this] { manager->repositoryNames()->remove(0); },
        [this] { manager->addRepository(holding("b.xml"), "new"); },
        [this] { manager->repositoryNames()->removeAll(); },
        [this] { manager->setRepositoryNames(make<Array>()); }};
    for (const auto& change : changes) {
        manager->setRepositoryNames(make<Array>(std::initializer_list<Value>{"meddler", "last"}));
        meddler->whenAsked = change;
        EXPECT_THROW(manager->documentNamed("a.xml"), Exception);
    }
    meddler->whenAsked = [] {};
}

TEST_F(RepositoryManagerTest, TheSharedManagerIsMadeOnceUntilItIsFlushed) {
    QXXMLDataRepositoryManager::flushDefaultManager();
    const auto shared = QXXMLDataRepositoryManager::defaultManager();
    shared->setVolatileRepository(holding("a.xml"));
    EXPECT_EQ(QXXMLDataRepositoryManager::defaultManager(), shared);
    QXXMLDataRepositoryManager::flushDefaultManager();
    const auto fresh = QXXMLDataRepositoryManager::defaultManager();
    EXPECT_NE(fresh, shared);
    EXPECT_EQ(namesOf(*fresh), "QXXMLDataRepositoryPersistentName ");
    QXXMLDataRepositoryManager::flushDefaultManager();
}

TEST_F(RepositoryManagerTest, AHookThatAsksForTheManagerInTheMakingRaises) {
    QXXMLDataRepositoryManager::flushDefaultManager();
    QXXMLFileSystemDataRepository::setRepositoryCreateFunction(
        [](QXXMLFileSystemDataRepository&) { QXXMLDataRepositoryManager::defaultManager(); });
    EXPECT_THROW(QXXMLDataRepositoryManager::defaultManager(), Exception);
    QXXMLFileSystemDataRepository::setRepositoryCreateFunction(nullptr);
    EXPECT_TRUE(QXXMLDataRepositoryManager::defaultManager());
    QXXMLDataRepositoryManager::flushDefaultManager();
}

TEST_F(RepositoryManagerTest, TheDescriptionShowsTheRepositories) {
    const std::string text = manager->description().str();
    EXPECT_EQ(text.find(manager->Object::description().str() + " repositories: {"), 0U) << text;
    EXPECT_NE(text.find("QXXMLDataRepositoryPersistentName = "), std::string::npos) << text;
}
