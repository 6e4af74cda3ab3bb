// Unknown XML on structs and host classes: those that have a place for it keep it, the others are
// named in the log. So are classes whose items are left out.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXMappedObject.h>

namespace {

struct Place {
    int zip = 0;
};
// Answers nothing and keeps nothing.
class Mute : public qx::Object {};

struct Sheet {
    std::string title;
    QXUnknownXML unknown;
    std::vector<Sheet> pages;
};
class Leaf : public QXMappedObject {
public:
    std::string name;
    std::vector<qx::Ref<Leaf>> leaves;
};

class UnknownXML : public testing::Test {
protected:
    void SetUp() override { qx::Class::define<Place>("Place").members<&Place::zip>(); }
    void TearDown() override { qx::Class::forget("Place"); }
};

} // namespace

TEST_F(UnknownXML, IsDroppedByClassesWithoutAPlaceForItWhichAreNamedOnce) {
    const auto marshaller = scenario::marshaller("<Place><zip node='attribute'/></Place>");
    testing::internal::CaptureStderr();
    const char* document = "<place xmlns:x='urn:x' zip='1' a='1'><b/></place>";
    for (int i = 0; i < 2; ++i)
        EXPECT_EQ(marshaller->readString<Place>(document)->zip, 1);
    const std::string log = testing::internal::GetCapturedStderr();
    const std::string message = "Objects of class Place keep no unknown XML";
    const auto said = log.find(message);
    EXPECT_NE(said, std::string::npos) << log;
    EXPECT_EQ(log.find(message, said + 1), std::string::npos) << log;
    marshaller->setLenient(false);
    marshaller->setSaveUnknownXML(false);
    EXPECT_EQ(support::told(marshaller->readString<Place>("<place a='1'/>").error()),
              "-215: Unknown attributes found in XML document: (a [1]) element: place "
              "(Invalid XML)");
}

TEST_F(UnknownXML, IsNotNeededByItemsWhichHaveToAnswerIsRemovable) {
    qx::Class::define<Mute>("Mute");
    const auto list = scenario::marshaller("<class name='List'><field name='all' "
                                           "collection='array'><bind-xml/></field></class>"
                                           "<class name='Mute'/><class name='Place'/>");
    const auto read =
        list->readString("<list><mute a='1' xmlns:x='urn:x'/><place/><mute><b/></mute></list>");
    testing::internal::CaptureStderr();
    EXPECT_EQ(scenario::write(*list, read), "<List><Place></Place></List>");
    EXPECT_EQ(scenario::write(*list, read), "<List><Place></Place></List>");
    const std::string log = testing::internal::GetCapturedStderr();
    const std::string message =
        "Items of class Mute are not written: the class does not answer isRemovable";
    const auto said = log.find(message);
    EXPECT_NE(said, std::string::npos) << log;
    EXPECT_EQ(log.find(message, said + 1), std::string::npos) << log;
    qx::Class::forget("Mute");
}

TEST_F(UnknownXML, IsKeptInAMemberAndByTheBaseClass) {
    qx::Class::define<Sheet>("Sheet").members<&Sheet::title, &Sheet::unknown, &Sheet::pages>();
    qx::Class::define<Leaf, QXMappedObject>("Leaf").members<&Leaf::name, &Leaf::leaves>();
    const auto marshaller = scenario::marshaller(
        "<class name='Sheet'><map-to xml='sheet'/><field name='title'><bind-xml node='attribute'/>"
        "</field><field name='pages' type='Sheet' collection='array'><bind-xml name='p'/></field>"
        "</class><class name='Leaf'><map-to xml='leaf'/><field name='name'>"
        "<bind-xml node='attribute'/></field><field name='leaves' type='Leaf' collection='array'>"
        "<bind-xml name='leaf'/></field></class>");
    const std::string document = R"(<sheet xmlns:x="urn:x" title="t" a="1"><p title="u" x:b="2">)"
                                 R"(<c>d</c></p><e></e><e></e></sheet>)";
    const auto sheet = marshaller->readString<Sheet>(document);
    ASSERT_TRUE(sheet) << support::told(sheet.error());
    EXPECT_EQ(sheet->unknown.children()->count(), 1U);
    EXPECT_TRUE(sheet->pages.at(0).unknown.namespaces() == nullptr);
    const Sheet copy = *sheet;
    EXPECT_EQ(marshaller->marshall(*sheet)->rootElement()->XMLString().view(), document);
    EXPECT_EQ(marshaller->marshall(copy)->rootElement()->XMLString().view(), document)
        << "with nodes of its own";

    const std::string tree = R"(<leaf name="a" b="1"><leaf name="c"><d></d></leaf></leaf>)";
    const auto leaf = marshaller->readString<Leaf>(tree);
    ASSERT_TRUE(leaf) << support::told(leaf.error());
    EXPECT_EQ((*leaf)->leaves.at(0)->parent<Leaf>(), *leaf);
    EXPECT_EQ((*leaf)->parent(), nullptr);
    EXPECT_EQ(scenario::write(*marshaller, *leaf), tree);
    const auto orphan = (*leaf)->leaves.at(0);
    (*leaf)->leaves.clear();
    EXPECT_EQ(scenario::write(*marshaller, orphan), R"(<leaf name="c"><d></d></leaf>)");
    qx::Class::forget("Sheet");
    qx::Class::forget("Leaf");
}
