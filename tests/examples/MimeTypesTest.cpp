// The MIME database of the machine comes through whole, as host objects and as records.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "../examples/mime-types/MimeType.h"
#include "support/Show.h"

#include <gtest/gtest.h>

#include <fstream>
#include <map>

namespace {

constexpr const char* databasePath = "/usr/share/mime/packages/freedesktop.org.xml";
constexpr const char* mappingPath = QX_SOURCE_DIR "/examples/mime-types/mapping.xml";

// How often each element name occurs.
std::map<std::string, std::size_t> elementsIn(const qx::XMLElement& element) {
    std::map<std::string, std::size_t> counts;
    counts[element.name().str()] = 1;
    for (const qx::XMLNode& child : element.children())
        if (child.isElement())
            for (const auto& [name, count] : elementsIn(*child.asElement()))
                counts[name] += count;
    return counts;
}

// Reads under the example's mapping, which must know all of the database.
qx::Ref<QXXMLMarshaller> strictMarshaller() {
    const auto marshaller = QXXMLMarshaller::initWithMappingFile(mappingPath);
    marshaller->setLenient(false);
    marshaller->setSaveUnknownXML(false);
    return marshaller;
}

struct MimeTypes : testing::Test {
    void SetUp() override {
        if (!std::ifstream(databasePath))
            GTEST_SKIP() << databasePath << " is missing";
    }
    void TearDown() override {
        for (const char* name : {"MimeType", "Glob", "DatabaseObject"})
            qx::Class::forget(name);
    }
};

} // namespace

TEST_F(MimeTypes, ComeBackEqualAndAreWrittenTheSameAgain) {
    qx::String asRecords;
    for (const bool inCpp : {false, true}) {
        if (inCpp)
            registerMimeTypes();
        const auto marshaller = strictMarshaller();
        const auto first = marshaller->readFile(databasePath);
        const qx::String written = marshaller->writeString(first);
        const auto second = marshaller->readString(written);
        EXPECT_TRUE(support::show(second) == support::show(first)) << "texts too long to print";
        EXPECT_TRUE(marshaller->writeString(second) == written);
        EXPECT_TRUE(!inCpp || written == asRecords) << "classes in C++ write as records do";
        asRecords = written;
    }
}

TEST_F(MimeTypes, AreWrittenWithEveryElement) {
    const auto marshaller = strictMarshaller();
    qx::Ref<qx::Error> error;
    const auto database = marshaller->readFile(databasePath, &error);
    ASSERT_TRUE(database) << error->description().view();
    const auto original = qx::XMLDocument::initWithContentsOfURL(databasePath);
    const auto written = marshaller->marshall(database);
    EXPECT_EQ(elementsIn(*written->rootElement()), elementsIn(*original->rootElement()));
}
