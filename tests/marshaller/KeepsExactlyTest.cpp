// What is kept exactly, of objects that were changed, copied or read one by one.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/QXUnknownXML.h>

#include <sstream>

namespace {

struct Page {
    std::string title;
    QXUnknownXML unknown;
};
struct Book {
    std::vector<Page> pages;
    QXUnknownXML unknown;
};

constexpr const char* mapping =
    "<Book xml='book'><title node='element'/>"
    "<pages type='Page' collection='array' name='page' location='pages'/></Book>"
    "<Page xml='page'><title node='element'/></Page>";
constexpr const char* document =
    "<book><a/><title>t</title><b/><pages n=\"2\"><c/><page><d/><title>1</title></page><e/>"
    "<page><title>2</title><f/></page><g/></pages><h/></book>";

class KeepsExactly : public testing::Test {
protected:
    KeepsExactly() { marshaller->setKeepsExactly(true); }
    std::string written(const qx::Value& object) {
        qx::Ref<qx::Error> error;
        const qx::String text =
            marshaller->writeString(object, &error, qx::XMLCompactEmptyElements);
        EXPECT_FALSE(error) << support::told(error);
        return text.str().substr(text.str().find("?>") + 2);
    }
    qx::Ref<QXXMLMarshaller> marshaller = scenario::marshaller(mapping);
};

} // namespace

TEST_F(KeepsExactly, WhatIsLeftStaysWhereItStoodWhenFieldsAndItemsGo) {
    const auto book = marshaller->readString(document);
    EXPECT_EQ(written(book), document);
    EXPECT_EQ(written(book), document);
    const auto pages = book->valueForKey("pages").as<qx::Array>();
    book->setValueForKey(nullptr, "title");
    pages->add(pages->at(0));
    pages->remove(0);
    EXPECT_EQ(written(book),
              "<book><a/><b/><pages n=\"2\"><c/><page><title>2</title><f/></page><e/>"
              "<page><d/><title>1</title></page><g/></pages><h/></book>");
    pages->removeAll();
    EXPECT_EQ(written(book), "<book><a/><b/><pages n=\"2\"><c/><e/><g/></pages><h/></book>");
    book->valueForKey("unboundChildren").as<qx::Dictionary>()->remove("b");
    const auto mine = qx::make<qx::Array>();
    mine->add(qx::XMLElement::initWithName("mine"));
    book->valueForKey("unboundChildren").as<qx::Dictionary>()->set("mine", mine);
    EXPECT_EQ(written(book), "<book><a/><pages n=\"2\"><c/><e/><g/></pages><h/><mine/></book>");
    marshaller->setKeepsExactly(false);
    EXPECT_EQ(written(book), "<book n=\"2\"><a/><c/><e/><g/><h/><mine/></book>");
}

TEST_F(KeepsExactly, CopiesOfStructsKeepThePlacesToo) {
    qx::Class::define<Page>("Page").members<&Page::title, &Page::unknown>();
    qx::Class::define<Book>("Book").members<&Book::pages, &Book::unknown>();
    const auto structs = scenario::marshaller(
        "<Book xml='book'><pages type='Page' collection='array' name='page'/></Book>"
        "<Page xml='page'><title node='element'/></Page>");
    structs->setKeepsExactly(true);
    auto book = structs->readString<Book>(
        "<book><a/><page><b/><title>1</title><c/></page><d/><page/><e/></book>");
    ASSERT_TRUE(book);
    const Book copy = *book;
    book = structs->readString<Book>("<book/>");
    EXPECT_NE(structs->writeString(copy, nullptr, qx::XMLCompactEmptyElements)
                  .str()
                  .find("<book><a/><page><b/><title>1</title><c/></page><d/><page><title/></page>"
                        "<e/></book>"),
              std::string::npos);
    qx::Class::forget("Book");
    qx::Class::forget("Page");
}

TEST_F(KeepsExactly, HoldsForSequencesReloadsAndUndo) {
    std::string pieces = "<books>";
    for (int i = 0; i < 3; ++i)
        pieces += document;
    std::istringstream stream(pieces + "</books>");
    std::string all;
    EXPECT_TRUE(marshaller->unmarshallEach(
        stream, "book", [&](const qx::Ref<qx::Object>& book) { all += written(book); }));
    EXPECT_EQ("<books>" + all, pieces);

    const auto book = marshaller->readString(document);
    const auto manager = qx::make<qx::UndoManager>();
    book.as<QXGenericRecord>()->setUndoManager(manager);
    EXPECT_TRUE(marshaller->readStringInto(book, "<book><title>u</title><z/></book>"));
    EXPECT_EQ(written(book), "<book><title>u</title><z/></book>");
    manager->undo();
    EXPECT_EQ(written(book), document);
}

TEST_F(KeepsExactly, ManyItemsWithManyLeftBetweenThemTakeLinearTime) {
    std::string many = "<book><pages>";
    for (int i = 0; i < 20'000; ++i)
        many += "<page><title>x</title></page><left/>";
    many += "</pages></book>";
    EXPECT_EQ(written(marshaller->readString(many)), many);
}
