// Mapping documents are resolved: includes are pulled in, classes are found by both of their names.

#include "support/Cases.h"
#include "support/TemporaryFolder.h"
#include "support/Texts.h"

#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>
#include <QXXMLMarshalling/QXXMLVolatileDataRepository.h>
#include <QXXMLMarshalling/base/Exception.h>

#include <gtest/gtest.h>

#include <chrono>
#include <map>
#include <new>

namespace {

using qx::Error;
using qx::Ref;
using qx::String;

Ref<qx::XMLDocument> mappingOf(std::string_view content) {
    return qx::XMLDocument::initWithData("<mapping>" + std::string(content) + "</mapping>");
}

// Documents by name in memory. Some contents are a deed instead.
class Repository : public QXXMLDataRepository {
public:
    std::map<std::string, std::string> documents;
    std::string asked;

    bool containsDocument(const String& name) override { return documents.contains(name.str()); }
    bool containsData(const String&) override { return false; }
    Ref<qx::XMLDocument> documentNamed(const String& name, std::uint64_t*,
                                       Ref<Error>* error) override {
        asked += name.str() + " ";
        const std::string& content = documents[name.str()];
        if (content == "raise")
            throw qx::Exception(qx::Exception::generic, "no such luck");
        if (content == "no memory")
            throw std::bad_alloc();
        if (content == "flush")
            QXXMLDataRepositoryManager::flushDefaultManager();
        return content == "broken" ? qx::XMLDocument::initWithData("<!DOCTYPE", {}, error)
                                   : mappingOf(content);
    }
    Ref<qx::Data> dataForName(const String&, Ref<Error>*) override { return nullptr; }
};

// The names of the classes in order, a blank behind each, or the error.
std::string resolve(std::string_view content) {
    Ref<Error> error;
    const auto mapping =
        QXXMLMarshallingMapping::initWithDocument(mappingOf(content).get(), &error);
    EXPECT_EQ(mapping.get() == nullptr, error.get() != nullptr);
    if (error)
        return support::told(error);
    std::string names;
    for (const auto& type : mapping->mapping()->classMappings())
        names += type->className().str() + ' ';
    return names;
}

class MarshallingMapping : public testing::Test {
protected:
    MarshallingMapping() {
        QXXMLDataRepositoryManager::defaultManager()->setVolatileRepository(repository);
    }
    ~MarshallingMapping() override { QXXMLDataRepositoryManager::flushDefaultManager(); }

    Ref<Repository> repository = qx::make<Repository>();
};

const bool added = support::addCases(
    "tests/plan/includes.md", {"documents", "mapping"}, {"classes", "asked", "error"},
    [](const auto& expected) {
        const auto repository = qx::make<Repository>();
        const auto documents = support::parsed(expected.given.at("documents"));
        for (const qx::XMLNode& document : documents->rootElement()->children())
            for (const qx::XMLNode& child : document.children())
                repository->documents[document.name().str()] += child.XMLString().str();
        QXXMLDataRepositoryManager::defaultManager()->setVolatileRepository(repository);
        std::string came = resolve(expected.given.at("mapping"));
        QXXMLDataRepositoryManager::flushDefaultManager();
        if (expected.kind == "asked")
            came = repository->asked;
        EXPECT_EQ(came.substr(0, came.find_last_not_of(' ') + 1) + "\n", expected.text);
    });

} // namespace

TEST_F(MarshallingMapping, FindsClassesByNameAndByElement) {
    const auto document = mappingOf("<class name='PurchaseOrder'/><class name='Item'>"
                                    "<map-to xml='x:it'/></class><class name='Empty'>"
                                    "<map-to xml=''/></class>");
    const auto mapping = QXXMLMarshallingMapping::initWithDocument(document.get());
    const auto name = [](const QXXMLClassMapping* found) {
        return found != nullptr ? found->className().str() : "";
    };
    EXPECT_EQ(name(mapping->mappingForClassName("PurchaseOrder")), "PurchaseOrder");
    EXPECT_EQ(name(mapping->mappingForClassName("purchaseorder")), "");
    EXPECT_EQ(name(mapping->mappingForElementName("purchaseorder")), "PurchaseOrder");
    EXPECT_EQ(name(mapping->mappingForElementName("PurchaseOrder")), "");
    EXPECT_EQ(name(mapping->mappingForElementName("empty")), "Empty");
    EXPECT_EQ(name(mapping->mappingForNode(qx::XMLElement::initWithName("x:it").get())), "Item");
    EXPECT_EQ(name(mapping->mappingForNode(qx::XMLElement::initWithName("it").get())), "");
    EXPECT_EQ(name(mapping->mappingForNode(nullptr)), "");
    EXPECT_EQ(mapping->document(), document.get());
    EXPECT_TRUE(
        QXXMLMarshallingMapping::initWithDocument(nullptr)->mapping()->classMappings().empty());
}

TEST_F(MarshallingMapping, AsksOneManagerForAllIncludesAndCatchesWhatIsRaisedBelowThem) {
    repository->documents = {{"flush", "flush"},
                             {"d", "<class name='D'/>"},
                             {"raising", "raise"},
                             {"outer", "<include href='raising'/>"}};
    EXPECT_EQ(resolve("<include href='outer'/>"),
              "-218: Unable to load included file: outer (Unable to load included document)");
    EXPECT_EQ(resolve("<include href='flush'/><include href='d'/>"), "D ");
}

TEST_F(MarshallingMapping, TellsWhichIncludesLedToAClass) {
    repository->documents = {{"b", "\n<include href='c'/>"}, {"c", "<class name='C'/>"}};
    const auto document = mappingOf("<include href='none'/><include href='b'/>");
    document->setDocumentName("outer.xml");
    const auto mapping = QXXMLMarshallingMapping::initWithDocument(document.get());
    const QXXMLClassMapping& included = *mapping->mappingForClassName("C");
    std::string told = included.place().documentName.str();
    for (const QXXMLMappingPlace& place : included.includedFrom())
        told += " from " + place.documentName.str() + ':' + std::to_string(place.line) + ':' +
                std::to_string(place.column);
    EXPECT_EQ(told, "c from b:2:1 from outer.xml:1:32");
}

TEST_F(MarshallingMapping, LooksBesideTheOutermostFileForWhatNoRepositoryHas) {
    const TemporaryFolder folder;
    const auto one = [](const char* name) {
        return "<mapping><class name='" + std::string(name) + "'/></mapping>";
    };
    folder.write("secret.xml", one("Secret"));
    folder.write("maps/both.xml", one("Beside"));
    folder.write("maps/last.xml", one("Last"));
    folder.write("maps/parts/inner.xml", "<mapping><include href='last.xml'/></mapping>");
    folder.write("maps/parts/last.xml", one("NotAsked"));
    folder.write("maps/broken.xml", "<mapping>");
    folder.write("maps/folder/file", "");
    repository->documents = {{"both.xml", "<class name='Repository'/>"}};
    const auto names = [&](const std::string& href) {
        const std::string path =
            folder.write("maps/main.xml", "<mapping><include href='" + href + "'/></mapping>");
        Ref<Error> error;
        const auto mapping = QXXMLMarshallingMapping::initWithContentsOfFile(path, &error);
        if (!mapping)
            return "error " + std::to_string(error->code());
        std::string told;
        for (const auto& type : mapping->mapping()->classMappings())
            told += type->className().str() + ' ' + type->place().documentName.str();
        return told;
    };
    const std::pair<std::string, std::string> cases[] = {
        {"last.xml", "Last " + folder.path("maps/last.xml")},
        {"both.xml", "Repository both.xml"},
        {"parts/inner.xml", "Last " + folder.path("maps/last.xml")},
        {"nowhere.xml", ""},
        {"../secret.xml", ""},
        {"parts/../../secret.xml", ""},
        {folder.path("secret.xml"), ""},
        {"", ""},
        {".", ""},
        {std::string(100'000, 'a'), ""},
        {"folder", "error 256"},
        {"broken.xml", "error 77"},
        {"main.xml", "error -218"},
    };
    for (const auto& [href, expected] : cases)
        EXPECT_EQ(names(href), expected) << href.substr(0, 100);
    const auto document = mappingOf("<include href='last.xml'/>");
    EXPECT_TRUE(QXXMLMarshallingMapping::initWithDocument(document.get())
                    ->mapping()
                    ->classMappings()
                    .empty());
}

TEST_F(MarshallingMapping, TellsWhereAFaultIsAndWhatWasMeant) {
    repository->documents = {{"misspelt", "\n<class nmae='B'/>"},
                             {"outer", "<include href='misspelt'/>"},
                             {"broken", "broken"},
                             {"twice", "<class name='A'/>\n  <class name='A'/>"}};
    const std::pair<const char*, const char*> cases[] = {
        {"<class name='A'><field name='f' lazy='yes'/></class>",
         "Boolean attribute: lazy has an illegal value: yes\n"
         "  at main.xml:1:26 /mapping/class/field\n"
         "  did you mean \"true\" or \"false\"?"},
        {"<include href='outer'/>",
         "Required attribute: name not found in element: <class nmae=\"B\"></class>\n"
         "  at misspelt:2:1 /mapping/class\n"
         "  by misspelt:2:1\n"
         "    included by outer:1:10\n"
         "    included by main.xml:1:10\n"
         "  did you mean \"name\" by \"nmae\"?"},
        {"<include href='twice'/>",
         "Class redefined: A\n  at twice:2:3 /mapping/class[2]\n  by twice:2:3\n"
         "    included by main.xml:1:10\n  class \"A\" stands at twice:1:10, too"},
        {"\n<include href='ring'/>",
         "Unable to load included file: ring\n  at ring:1:10 /mapping/include\n  by ring:1:10\n"
         "    included by main.xml:2:1\n"
         "  it is being included already: take out the include that leads back to it"},
    };
    repository->documents["ring"] = "<include href='ring'/>";
    for (const auto& [content, expected] : cases) {
        const auto document = mappingOf(content);
        document->setDocumentName("main.xml");
        Ref<Error> error;
        EXPECT_FALSE(QXXMLMarshallingMapping::initWithDocument(document.get(), &error));
        EXPECT_EQ(error->report(), expected);
    }
    Ref<Error> error;
    const auto document = mappingOf("<include href='broken'/>");
    document->setDocumentName("main.xml");
    EXPECT_FALSE(QXXMLMarshallingMapping::initWithDocument(document.get(), &error));
    EXPECT_EQ(error->documentName(), "broken");
    EXPECT_EQ(error->mappingPlace().documentName, "main.xml");
    EXPECT_EQ(error->mappingPlace().column, 10U);
}

TEST_F(MarshallingMapping, CollectsAllFaultsOfADocumentAndItsIncludesInOneRun) {
    repository->documents = {{"b", "\n<class name='B'><field name='f' lazy='no'/></class>"
                                   "<class name='A'/>"},
                             {"broken", "broken"}};
    const auto document = mappingOf("<class/>\n<class name='A' self-first='1'><map-to/><map-to/>\n"
                                    "<field/><field name='f' lazy='x' direct='y'><alt-xml/></field>"
                                    "</class>\n<include href='broken'/>\n<include href='b'/>");
    Ref<Error> error;
    const auto mapping =
        QXXMLMarshallingMapping::initWithDocument(document.get(), {.collectsFaults = true}, &error);
    ASSERT_TRUE(mapping);
    std::string told;
    for (const QXXMLFinding& fault : mapping->faults())
        told += std::to_string(fault.fault->code()) + ' ' + fault.place.documentName.str() + ':' +
                std::to_string(fault.place.line) +
                (fault.includedFrom.empty()
                     ? "\n"
                     : " from " + std::to_string(fault.includedFrom.front().line) + '\n');
    EXPECT_EQ(told, "-202 :1\n-203 :2\n-201 :2\n-202 :3\n-203 :3\n-203 :3\n-219 :3\n"
                    "68 broken:1 from 4\n-203 b:2 from 5\n-205 b:2 from 5\n");
    EXPECT_EQ(error->code(), -202);
    EXPECT_EQ(mapping->mappingForClassName("A")->fields().size(), 1U);
    EXPECT_FALSE(mapping->mappingForClassName("B")->copyWithZone()); // reports to nobody now
}

TEST_F(MarshallingMapping, FailsForASlotThatHoldsAnErrorAlready) {
    Ref<Error> error = qx::make<Error>(Error::cocoaDomain, 1, "old", "old");
    EXPECT_FALSE(QXXMLMarshallingMapping::initWithDocument(mappingOf("").get(), &error));
    EXPECT_EQ(error->code(), 1);
}

TEST_F(MarshallingMapping, ResolvesAChainOfIncludesInTheTimeOfItsClasses) {
    constexpr int documents = 250;
    constexpr int classes = 80;
    const auto timed = [&](bool isChain) {
        std::string all;
        for (int i = 0; i < documents; ++i) {
            const std::string next = "<include href='" + std::to_string(i + 1) + "'/>";
            std::string content = isChain ? next : "";
            for (int k = 0; k < classes; ++k)
                content += "<class name='C" + std::to_string(i * classes + k) + "'/>";
            repository->documents[std::to_string(i)] = content;
            all += "<include href='" + std::to_string(i) + "'/>";
        }
        const auto start = std::chrono::steady_clock::now();
        const std::string names = resolve(isChain ? "<include href='0'/>" : all);
        EXPECT_TRUE(names.starts_with("C0 C1 C2 ") && names.ends_with("C19999 "));
        return std::chrono::steady_clock::now() - start;
    };
    EXPECT_LT(timed(true), 5 * timed(false));
}

TEST_F(MarshallingMapping, EndsChainsOfIncludesThatAreTooLongOrLoadTooMuch) {
    for (int i = 0; i < 2000; ++i) {
        const std::string next = std::to_string(i + 1) + "'/>";
        repository->documents["n" + std::to_string(i)] = "<include href='n" + next;
        // Without a ring, and still more documents than can be loaded.
        repository->documents["d" + std::to_string(i)] =
            i < 50 ? "<include href='d" + next + "<include href='d" + next : "";
    }
    EXPECT_EQ(resolve("<include href='n0'/>").substr(0, 5), "-218:");
    EXPECT_EQ(resolve("<include href='d0'/>").substr(0, 5), "-218:");
}

TEST_F(MarshallingMapping, DoesNotChangeOnceItStands) {
    repository->documents = {{"b", "<class name='B'/>"}};
    const auto mapping =
        QXXMLMarshallingMapping::initWithDocument(mappingOf("<include href='b'/>").get());
    EXPECT_TRUE(mapping->loadIncludedDocuments() && mapping->populateLookupCaches());
    EXPECT_EQ(mapping->mapping()->classMappings().size(), 1U);
}

TEST_F(MarshallingMapping, PassesErrorsAndExceptionsOn) {
    repository->documents = {{"broken", "broken"},
                             {"raising", "raise"},
                             {"full", "no memory"},
                             {"outer", "<include href='raising'/>"}};
    Ref<Error> error;
    const auto broken = mappingOf("<include href='broken'/>");
    EXPECT_FALSE(QXXMLMarshallingMapping::initWithDocument(broken.get(), &error));
    EXPECT_EQ(error->domain(), Error::parserDomain);
    // Caught is what a repository raises for the document that asked: a row above.
    EXPECT_THROW(resolve("<include href='raising'/>"), qx::Exception);
    EXPECT_FALSE(
        QXXMLMarshallingMapping::initWithDocument(mappingOf("<include href='outer'/>").get()));
    EXPECT_THROW(resolve("<include href='full'/>"), std::bad_alloc);
}
