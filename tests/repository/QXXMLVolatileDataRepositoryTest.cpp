#include <QXXMLMarshalling/QXXMLVolatileDataRepository.h>

#include <QXXMLMarshalling/base/Exception.h>

#include <gtest/gtest.h>

using namespace qx;

struct VolatileRepositoryTest : testing::Test {
    Ref<QXXMLVolatileDataRepository> repository = QXXMLVolatileDataRepository::init();
};

TEST_F(VolatileRepositoryTest, DocumentsAndDataAreKeptApartAndReplaced) {
    const auto document = XMLDocument::initWithData("<b/>");
    const auto data = make<Data>(std::string_view("bytes"));
    EXPECT_TRUE(repository->setDocument(XMLDocument::initWithData("<a/>"), "name"));
    EXPECT_FALSE(repository->containsData("name"));
    EXPECT_TRUE(repository->setData(data, "name"));
    EXPECT_TRUE(repository->setDocument(document, "name"));
    EXPECT_EQ(repository->documentNamed("name"), document);
    EXPECT_EQ(repository->dataForName("name"), data);
    EXPECT_THROW(repository->setDocument(nullptr, "name"), Exception);
    EXPECT_THROW(repository->setData(nullptr, "name"), Exception);
    EXPECT_THROW(repository->setDocument(document, nullptr), Exception);
    EXPECT_EQ(repository->documentNamed("name"), document);
}

TEST_F(VolatileRepositoryTest, AnAbsentNameIsNoErrorAndHasTheSizeOfNothingRead) {
    std::uint64_t size = 0;
    Ref<Error> error;
    for (const String& name : {String("none"), String(""), String()}) {
        EXPECT_FALSE(repository->containsDocument(name) || repository->containsData(name));
        EXPECT_FALSE(repository->documentNamed(name, &size, &error));
        EXPECT_FALSE(repository->dataForName(name, &error));
        EXPECT_FALSE(error);
        EXPECT_EQ(size, 9223372036854775807U);
    }
}
