// What the marshaller passes over, told to a handler.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "support/Texts.h"

#include <gtest/gtest.h>

#include <regex>

using namespace qx;

namespace {

constexpr const char* mapping = R"(<mapping>
<class name="Order">
    <field name="number" type="integer"><bind-xml node="attribute"/></field>
    <field name="title" type="string"><bind-xml node="element"/></field>
    <field name="lines" collection="array" type="Line">
        <bind-xml name="line" node="element" location="lines"/>
    </field>
    <field name="tags" collection="array" type="string"><bind-xml name="tag" node="element"/></field>
    <field name="things" collection="array"><bind-xml name="things" node="element"/></field>
</class>
<class name="Line"><field name="text"><bind-xml node="text"/></field></class></mapping>)";

std::string told(const QXXMLReport& report) {
    constexpr const char* kinds[] = {"child", "attribute", "text", "item", "omitted"};
    return std::string(kinds[static_cast<std::size_t>(report.kind)]) + " " +
           (report.name.isNull() ? "-" : report.name.str()) + " x" + std::to_string(report.count) +
           " in " + report.elementName.str() + " at " + std::to_string(report.place().line) + ":" +
           std::to_string(report.place().column) + " " + report.path().str() +
           (report.object != nullptr ? " of " + report.object->classNameForMarshalling().str()
                                     : "") +
           (report.isKept ? " kept\n" : "\n");
}

} // namespace

TEST(ReportHandler, HearsOfAllThatNoFieldTakes) {
    constexpr const char* document = R"(<order number='0' a='1'>loose
<x/><x/><y/>
<title lang='de'>t<b/></title>
<lines kind='k'><line q='1'>l</line><foreign/> more</lines>
<tag id='1'>g</tag>
<things><line>m</line><other/></things>
</order>)";
    constexpr const char* reading =
        "attribute lang x1 in title at 3:8 /order/title/@lang of Order\n"
        "child b x1 in title at 3:19 /order/title/b of Order\n"
        "attribute kind x1 in lines at 4:8 /order/lines/@kind of Order\n"
        "item foreign x1 in lines at 4:37 /order/lines/foreign of Order\n"
        "text - x1 in lines at 4:48 /order/lines/text() of Order\n"
        "attribute q x1 in line at 4:23 /order/lines/line/@q of Line\n"
        "attribute id x1 in tag at 5:6 /order/tag/@id of Order\n"
        "item other x1 in things at 6:23 /order/things/other of Order\n"
        "text - x1 in order at 1:25 /order/text() of Order\n"
        "child x x2 in order at 2:1 /order/x[1] of Order\n"
        "child y x1 in order at 2:9 /order/y of Order\n"
        "attribute a x1 in order at 1:19 /order/@a of Order\n";
    const auto marshaller = QXXMLMarshaller::initWithMappingXML(support::parsed(mapping).get());
    std::string heard;
    marshaller->setReportHandler([&](const QXXMLReport& report) { heard += told(report); });
    testing::internal::CaptureStderr();
    for (const bool saves : {true, false}) {
        marshaller->setSaveUnknownXML(saves);
        heard.clear();
        Ref<Error> error;
        const Ref<Object> object = marshaller->readString(document, &error);
        ASSERT_TRUE(object) << error->report().view();
        static const std::regex ofObjects("((child [xy]|attribute [aq] |text - x1 in order).*)\n");
        static const std::regex unknown("((child [xy]|attribute [aq] ).*)\n");
        EXPECT_EQ(heard, saves ? std::regex_replace(reading, unknown, "$1 kept\n")
                               : std::regex_replace(reading, ofObjects, ""))
            << "what is discarded is not looked at";
        heard.clear();
        EXPECT_FALSE(marshaller->writeString(object).isNull());
        EXPECT_EQ(heard, "omitted number x1 in order at 0:0 \n");
    }
    EXPECT_EQ(testing::internal::GetCapturedStderr(), "") << "the log is left to the handler";
    marshaller->setReportHandler(nullptr);
    EXPECT_TRUE(marshaller->readString(document));
}

TEST(ReportHandler, MayReplaceItself) {
    const auto marshaller = QXXMLMarshaller::initWithMappingXML(support::parsed(mapping).get());
    int heard = 0;
    marshaller->setReportHandler([&](const QXXMLReport&) {
        ++heard;
        marshaller->setReportHandler(nullptr);
    });
    EXPECT_TRUE(marshaller->readString("<order a='1' b='2'/>"));
    EXPECT_EQ(heard, 2) << "this reading keeps the handler";
    EXPECT_TRUE(marshaller->readString("<order a='1' b='2'/>"));
    EXPECT_EQ(heard, 2);
}
