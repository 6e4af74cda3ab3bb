// The MIME database of the machine comes through whole, as host objects and as records.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "../examples/mime-types/MimeType.cpp"
#include "support/Show.h"

#include <gtest/gtest.h>

#include <fstream>
#include <map>
#include <sstream>

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

// The database as read under the example's mapping, which must know all of it.
struct Reading {
    qx::Ref<QXXMLMarshaller> marshaller = QXXMLMarshaller::initWithMappingFile(mappingPath);
    qx::Ref<qx::Object> database;

    Reading() {
        marshaller->setLenient(false);
        marshaller->setSaveUnknownXML(false);
        qx::Ref<qx::Error> error;
        database = marshaller->readFile(databasePath, &error);
        EXPECT_TRUE(database) << error->description().view();
    }
    void readAgain(const qx::String& text) { database = marshaller->readString(text); }
};

class MimeTypes : public testing::Test {
protected:
    void SetUp() override {
        std::ifstream file(databasePath);
        if (!file)
            GTEST_SKIP() << databasePath << " is missing";
        std::ostringstream text;
        text << file.rdbuf();
        source = text.str();
    }
    void TearDown() override {
        for (const char* name : {"MimeType", "Glob", "DatabaseObject"})
            qx::Class::forget(name);
    }

    std::string source;
};

} // namespace

TEST_F(MimeTypes, ComeBackEqualAndAreWrittenTheSameAgain) {
    qx::String asRecords;
    for (const bool inCpp : {false, true}) {
        if (inCpp)
            registerMimeTypes();
        Reading reading;
        const std::string first = support::show(reading.database);
        const qx::String written = reading.marshaller->writeString(reading.database);
        reading.readAgain(written);
        EXPECT_TRUE(support::show(reading.database) == first) << "texts too long to print";
        EXPECT_TRUE(reading.marshaller->writeString(reading.database) == written);
        EXPECT_TRUE(!inCpp || written == asRecords) << "classes in C++ write as records do";
        asRecords = written;
    }
}

TEST_F(MimeTypes, AreWrittenWithEveryElement) {
    const Reading reading;
    const auto original = qx::XMLDocument::initWithData(source);
    const auto written = reading.marshaller->marshall(reading.database);
    EXPECT_EQ(elementsIn(*written->rootElement()), elementsIn(*original->rootElement()));
}
