#include "qxxml/Json.h"

#include "qxxml/Failure.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Data.h>
#include <QXXMLMarshalling/model/Null.h>
#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <gtest/gtest.h>

namespace {

struct Part : qx::Object {
    std::string title = "lid";
    qx::Ref<Part> next;
    int size() const {
        if (_size < 0)
            throw qx::Exception(qx::Exception::generic, "the size is not known");
        return _size;
    }
    void setSize(const int& size) { _size = size; }

private:
    int _size = 3;
};

struct Handle : Part {
    qx::Value parent;
    std::string longTitle() const { return "the " + title; }
};

struct Note : QXGenericRecord {
    std::string author = "Ada";
};

class Json : public testing::Test {
protected:
    Json() {
        qx::Class::define<Part>("Part")
            .property<&Part::title>("title")
            .property<&Part::next>("next")
            .property<&Part::size, &Part::setSize>("size");
        qx::Class::define<Handle, Part>("Handle")
            .property<&Handle::parent>("@parent")
            .property<&Handle::longTitle>("title");
        qx::Class::define<Note, QXGenericRecord>("Note").property<&Note::author>("author");
    }
    ~Json() override {
        for (const char* name : {"Part", "Handle", "Note"})
            qx::Class::forget(name);
    }

    static std::string of(const qx::Value& value) { return qxxml::jsonOf(value).dump(); }
};

} // namespace

TEST_F(Json, ShowsValuesAsThemselvesAndNodesAsTheirXML) {
    const auto document = qx::XMLDocument::initWithData("<a x='1&amp;2' xmlns:p='u'><b/>t</a>");
    qx::XMLElement* const root = document->rootElement();
    const auto list = qx::make<qx::Array>(std::initializer_list<qx::Value>{
        nullptr, qx::Null::marker(), true, -9'007'199'254'740'993, 0.1, "\"quoted\"\n\u00e4",
        qx::make<qx::Data>(std::string("abc")), root, root->attributeForName(qx::Key("x")),
        qx::XMLNode::namespaceWithName("p", "u")});
    EXPECT_EQ(of(list),
              R"([null,null,true,-9007199254740993,0.1,"\"quoted\"\nä","<Data: 3 bytes>",)"
              R"("<a xmlns:p=\"u\" x=\"1&amp;2\"><b></b>t</a>","x=\"1&amp;2\"","xmlns:p=\"u\""])");
    EXPECT_EQ(qxxml::textOf(qxxml::jsonOf("a\xff")), "\"a\uFFFD\"");
    root->setStringValue("\x01");
    EXPECT_THROW(of(root), qx::Exception);
}

TEST_F(Json, ShowsARecordInTheOrderInWhichKeysWereSet) {
    const auto record = qx::make<QXGenericRecord>();
    record->setClassNameForMarshalling("Order");
    const auto dictionary = qx::make<qx::Dictionary>();
    dictionary->set("@b", 1);
    dictionary->set("a", 2);
    record->setValueForKey("last", "z");
    record->setValueForKey("many", "@count");
    record->setValueForKey(dictionary, "more");
    record->setValueForKey("changed", "z");
    EXPECT_EQ(of(record),
              R"({"@class":"Order","z":"changed","@@count":"many","more":{"@b":1,"a":2}})");
}

TEST_F(Json, ShowsDescribedPropertiesOnceThoseOfBaseClassesFirst) {
    const auto handle = qx::make<Handle>();
    handle->next = qx::make<Part>();
    EXPECT_EQ(of(handle), R"({"@class":"Handle","next":{"@class":"Part","title":"lid","next":null,)"
                          R"("size":3},"size":3,"@@parent":null,"title":"the lid"})");
    handle->setSize(-1);
    EXPECT_THROW(of(handle), qx::Exception);
}

TEST_F(Json, ShowsTheContentOfARecordClassBehindItsProperties) {
    const auto note = qx::make<Note>();
    note->setValueForKey("more", "text");
    note->setValueForKey("Lord Byron", "author");
    EXPECT_EQ(of(note), R"({"@class":"Note","author":"Lord Byron","text":"more"})");
}

TEST_F(Json, PointsUpwardsWhereAGraphIsCyclic) {
    const auto handle = qx::make<Handle>();
    const auto list = qx::make<qx::Array>();
    const auto inner = qx::make<Handle>();
    inner->parent = handle;
    list->add(inner);
    list->add(list);
    handle->parent = list;
    EXPECT_EQ(of(handle),
              R"({"@class":"Handle","next":null,"size":3,"@@parent":[{"@class":"Handle",)"
              R"("next":null,"size":3,"@@parent":{"@above":3},"title":"the lid"},{"@above":1}],)"
              R"("title":"the lid"})");
    list->removeAll();
    inner->parent = nullptr;
}

TEST_F(Json, RefusesWhatNestsTooDeep) {
    const auto chain = [](std::size_t length) {
        auto part = qx::make<Part>();
        for (std::size_t i = 1; i < length; ++i) {
            const auto outer = qx::make<Part>();
            outer->next = part;
            part = outer;
        }
        return part;
    };
    EXPECT_NE(qxxml::textOf(qxxml::jsonOf(chain(qxxml::deepestJson))), "");
    try {
        ADD_FAILURE() << of(chain(100'000)).size() << " bytes were written";
    } catch (const qxxml::Failure& failure) {
        EXPECT_STREQ(failure.what(), "-223: Objects nest deeper than the limit of 1024: Part");
    }
}
