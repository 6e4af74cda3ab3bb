// Checks of several documents at once, of documents that are none, and of classes of the program.

#include "Told.h"

#include "support/TemporaryFolder.h"
#include "support/Texts.h"

#include <QXXMLMarshalling/QXMappedObject.h>
#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/QXXMLDocumentCheck.h>

#include <gtest/gtest.h>

namespace {

using qx::Ref;

Ref<QXXMLMarshallingMapping> resolved(std::string_view classes) {
    const auto document = support::parsed("<mapping>" + std::string(classes) + "</mapping>");
    auto mapping = QXXMLMarshallingMapping::initWithDocument(document.get());
    QXXMLDataRepositoryManager::flushDefaultManager();
    return mapping;
}

struct Leg {
    std::string text;
    std::vector<int> parts;
};
enum class Way { foot = 1, bike };
struct Trip {
    int count = 0;
    Way way{}; // without a name
    Way back = Way::foot;
    std::string title;
    std::vector<Leg> legs;
    Leg first;
};
} // namespace

template <>
struct qx::EnumNames<Way> {
    static constexpr auto table =
        std::to_array<qx::EnumName<Way>>({{Way::foot, "foot"}, {Way::bike, "bike"}});
};

namespace {

class Guide : public QXMappedObject {
public:
    std::string name() const { return "Ada"; }
};

} // namespace

TEST(DocumentCheck, CountsOverAllDocumentsThatCanBeRead) {
    const TemporaryFolder folder;
    const auto marshaller = QXXMLMarshaller::initWithMapping(
        resolved("<class name='Order'><map-to xml='order'/><field name='no' type='int'>"
                 "<bind-xml name='no' node='attribute'/></field></class>"));
    QXXMLDocumentCheck check(marshaller);
    EXPECT_TRUE(check.why("/order").isNull());
    EXPECT_TRUE(check.addFile(folder.write("a.xml", "<order>\n<x/><x/></order>")));
    EXPECT_TRUE(check.addFile(folder.write("b.xml", "<order no='7'><x/></order>")));
    Ref<qx::Error> error;
    EXPECT_FALSE(check.addFile(folder.write("bad.xml", "<order><x></order>"), &error));
    EXPECT_EQ(error->documentName(), folder.path("bad.xml"));
    EXPECT_FALSE(check.addFile(folder.path("none.xml")));
    error.reset();
    EXPECT_FALSE(check.addData("<order no='seven'><x/></order>", "wrong", &error));
    EXPECT_EQ(error->code(), -221);
    const auto findings = check.findings();
    EXPECT_EQ(told(findings, true),
              "2:1 warning unbound: No field took the element x in order, 3 in all [Order]\n");
    EXPECT_EQ(findings.front().place.documentName, folder.path("a.xml"));
    EXPECT_TRUE(check.why("/order/x").view().starts_with("/order/x " + folder.path("b.xml")));
}

TEST(DocumentCheck, LeavesTheMarshallersOptionsAsTheyAre) {
    const auto marshaller = QXXMLMarshaller::initWithMapping(resolved(""));
    marshaller->setLenient(false);
    QXXMLDocumentCheck check(marshaller);
    EXPECT_TRUE(check.addData("<a/>", "a.xml"));
    EXPECT_EQ(told(check.findings(), true),
              "1:1 error unknown-root: No class maps to the root element a, 1 in all -> "
              "the mapping holds no class\n");
    EXPECT_FALSE(marshaller->isLenient());
    EXPECT_TRUE(marshaller->saveUnknownXML());
}

TEST(MappingCheck, KnowsARootThatIsNoMapping) {
    const auto notesOf = [](const char* text) {
        const auto mapping = QXXMLMarshallingMapping::initWithDocument(support::parsed(text).get(),
                                                                       {.collectsFaults = true});
        QXXMLDataRepositoryManager::flushDefaultManager();
        return told(mapping->check(), true);
    };
    EXPECT_EQ(notesOf("<mappings><class name='A'><map-to xml='a'/></class></mappings>"),
              "1:1 note other-root: The root element is mappings: it is read as a mapping\n");
    EXPECT_EQ(notesOf("<class name='A'><field name='f'/></class>"),
              "1:1 warning other-root: The root element is class: it stands for the mapping, and "
              "has no meaning itself\n"
              "1:1 warning misplaced-attribute: The attribute name has no meaning on mapping, only "
              "on class, and is passed over\n"
              "1:1 warning no-classes: The mapping holds no class\n"
              "1:17 warning misplaced-element: The element field has no meaning in mapping, only "
              "in class, and is passed over\n");
}

TEST(MappingCheck, ComparesTheClassesOfTheProgram) {
    const auto leg =
        qx::Class::define<Leg>("CheckedLeg").members<&Leg::text, &Leg::parts>().registration();
    const auto trip = qx::Class::define<Trip>("CheckedTrip")
                          .members<&Trip::count, &Trip::title, &Trip::legs, &Trip::first,
                                   &Trip::way, &Trip::back>()
                          .registration();
    const auto guide = qx::Class::define<Guide, QXMappedObject>("CheckedGuide")
                           .property<&Guide::name>("name")
                           .registration();
    const auto mapping = resolved(
        "<class name='CheckedTrip'><map-to xml='trip'/>\n"
        "<field name='count' type='boolean'><bind-xml name='c' node='attribute'/></field>\n"
        "<field name='titel'><bind-xml name='t' node='attribute'/></field>\n"
        "<field name='legs' type='CheckedLeg' collection='array'><bind-xml name='l'/></field>\n"
        "<field name='first' type='Other'><bind-xml name='f' node='element'/></field>"
        "<field name='way'><bind-xml name='w' node='attribute'/></field>"
        "<field name='back'><bind-xml name='b' node='attribute'/></field></class>\n"
        "<class name='CheckedLeg'><field name='text'><bind-xml node='text'/></field>"
        "<field name='parts' type='int'><bind-xml name='p' node='attribute'/></field></class>\n"
        "<class name='Other'/>\n"
        "<class name='CheckedGuide'><map-to xml='guide'/>"
        "<field name='name'><bind-xml name='n' node='attribute'/></field>\n"
        "<field name='age'><bind-xml name='a' node='attribute'/></field></class>");
    EXPECT_EQ(
        told(mapping->check(), false),
        "3:1 error missing-property: The class CheckedTrip of the program has no property titel: "
        "reading it fails [CheckedTrip.titel] -> did you mean \"title\"?\n"
        "5:1 error wrong-property: The property first of the class CheckedTrip of the program "
        "takes "
        "no object of the class Other, but of: CheckedLeg [CheckedTrip.first]\n"
        "5:77 warning unnamed-value: The property way of the class CheckedTrip of the program "
        "begins as 0, which has no name to be read by [CheckedTrip.way]\n"
        "6:76 error wrong-property: The property parts of the class CheckedLeg of the program does "
        "not take the field's values [CheckedLeg.parts]\n"
        "8:49 error missing-property: The property name of the class CheckedGuide of the program "
        "cannot be set [CheckedGuide.name]\n"
        "9:1 warning missing-property: The class CheckedGuide of the program has no property age: "
        "reading it fails, unless it takes any key [CheckedGuide.age]\n");
}
