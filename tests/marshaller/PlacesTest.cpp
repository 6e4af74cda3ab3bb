// Where errors of reading say that they came about, and how they are shown to people.

#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/model/Class.h>

#include "support/TemporaryFolder.h"
#include "support/Texts.h"

#include <gtest/gtest.h>

#include <sstream>

using namespace qx;

namespace {

Ref<QXXMLMarshaller> marshallerFor(const char* classes) {
    const auto mapping = support::parsed(std::string("<mapping>\n") + classes + "</mapping>");
    mapping->setDocumentName("points.map.xml");
    return QXXMLMarshaller::initWithMappingXML(mapping.get());
}

constexpr const char* points = R"(<class name="Points">
  <field name="points" collection="array" type="Point"><bind-xml name="p" node="element"/></field>
</class>
<class name="Point"><map-to xml="p"/>
  <field name="x" type="integer"><bind-xml node="attribute"/></field>
</class>
)";

std::string told(const Error& error) {
    return std::to_string(error.line()) + ":" + std::to_string(error.column()) + " " +
           error.path().str();
}

} // namespace

TEST(Places, OfAFileHaveItsName) {
    const TemporaryFolder folder;
    const std::string path =
        folder.write("points.xml", "<points>\n<p x='1'/>\n\t<p x='b'/></points>");
    const auto marshaller = marshallerFor(points);
    Ref<Error> error;
    EXPECT_FALSE(marshaller->readFile(path, &error));
    EXPECT_EQ(error->report(), "<x>: Unable to convert value to integer: b\n  at " + path +
                                   ":3:5 /points/p[2]/@x\n"
                                   "        <p x='b'/></points>\n"
                                   "           ^\n"
                                   "  by points.map.xml:6:3, field \"x\" of class \"Point\"\n"
                                   "  it takes a whole number");
    const auto document = XMLDocument::initWithContentsOfFile(path);
    for (const bool hasNodes : {false, true}) {
        if (hasNodes)
            document->rootElement();
        error = nullptr;
        EXPECT_FALSE(marshaller->unmarshall(document, &error));
        EXPECT_EQ(error->documentName(), path);
        EXPECT_EQ(told(*error), hasNodes ? "3:2 /points/p[2]/@x" : "3:5 /points/p[2]/@x");
    }
    folder.write("points.xml", "<points>\n  <p x='1' x='2'/></points>");
    EXPECT_FALSE(marshaller->readFile(path, &error));
    EXPECT_EQ(error->documentName(), path);
    EXPECT_EQ(told(*error), "2:17 ");
}

TEST(Places, OutliveDocumentMappingAndMarshaller) {
    Ref<Error> error;
    marshallerFor(points)->unmarshall(support::parsed("<points><p x='b'/></points>"), &error);
    EXPECT_EQ(told(*error), "1:12 /points/p/@x");
    EXPECT_EQ(error->mappingPlace().documentName, "points.map.xml");
}

TEST(Places, ArePlacesOfTheWholeWhereItIsReadObjectByObject) {
    const auto marshaller = marshallerFor(points);
    std::string text = "<all><group>\n";
    for (int i = 1; i <= 20'000; ++i)
        text += "<p x='" + std::to_string(i) + "'/>\n";
    std::istringstream stream(text + "<p  x='b'/></group></all>");
    Ref<Error> error;
    int visited = 0;
    const auto count = [&](const Ref<Object>&) { ++visited; };
    EXPECT_FALSE(marshaller->unmarshallEach(stream, "p", count, &error));
    EXPECT_EQ(visited, 20'000);
    EXPECT_EQ(told(*error), "20002:5 /all/group/p[20001]/@x");
}

// An error that the caller had before is none of this reading.
TEST(Places, OfEarlierErrorsStayUnknown) {
    const auto earlier = make<Error>(Error::cocoaDomain, 7, "earlier", "earlier");
    Ref<Error> error = earlier;
    EXPECT_FALSE(marshallerFor(points)->unmarshall(support::parsed("<points/>"), &error));
    EXPECT_EQ(error, earlier);
    EXPECT_EQ(told(*earlier), "0:0 ");
    EXPECT_EQ(earlier->report(), "earlier");
}

TEST(Reports, CutLongLinesAroundTheMark) {
    const auto marshaller = marshallerFor(points);
    const std::string many(30, 'a');
    Ref<Error> error;
    marshaller->readString("<points><p a='\u6f22\u5b57" + many + many +
                               "' x='1'  \n\t x='\u00e4'/>" + "<!-- " + many + many + many +
                               " --></points>",
                           &error);
    EXPECT_EQ(error->code(), 42) << "of the parser";
    EXPECT_FALSE(marshaller->readString("<points><p a='\u6f22\u5b57" + many + many +
                                            "' x='\u00e4'/><!-- " + many + many + many +
                                            " --></points>",
                                        &error));
    EXPECT_EQ(error->report(), "<x>: Unable to convert value to integer: \u00e4\n"
                               "  at 1:79 /points/p/@x\n"
                               "    ..." +
                                   many.substr(12) + many + "' x='\u00e4'/><!-- " +
                                   many.substr(16) +
                                   "...\n"
                                   "       " +
                                   std::string(50, ' ') +
                                   "^\n"
                                   "  by points.map.xml:6:3, field \"x\" of class \"Point\"\n"
                                   "  it takes a whole number");
}

TEST(Reports, QuoteLittleOfALongElement) {
    const auto marshaller = marshallerFor(R"(<class name="Points">
  <field name="x" required="true"><bind-xml node="attribute"/></field></class>)");
    Ref<Error> error;
    marshaller->readString("<points>\n<p>" + std::string(5'000, 'a') + "</p></points>", &error);
    EXPECT_GT(error->localizedDescription().size(), 5'000U);
    const std::string short_ = error->shortDescription().str();
    EXPECT_LT(short_.size(), 250U);
    EXPECT_EQ(short_.find('\n'), std::string::npos);
}

enum class Fix { none, flat, full };
struct Sample {
    bool isGood = false;
    Fix fix = Fix::none;
    std::optional<unsigned> count;
    double height = 0;
};

TEST(Suggestions, NameWhatAMemberTakes) {
    const auto registration =
        Class::define<Sample>("Sample")
            .property<&Sample::isGood>("good")
            .property<&Sample::fix>("fix")
            .property<&Sample::count>("count")
            .property<&Sample::height>("height")
            .names({{Fix::none, "none"}, {Fix::flat, "2d"}, {Fix::full, "full"}})
            .registration();
    const auto marshaller = marshallerFor(R"(<class name="Sample">
<field name="good"><bind-xml node="attribute"/></field>
<field name="fix"><bind-xml node="attribute"/></field>
<field name="count"><bind-xml node="attribute"/></field>
<field name="height"><bind-xml node="element"/></field></class>)");
    const std::pair<const char*, const char*> cases[] = {
        {"good='ja'", "it takes \"true\", \"false\""},
        {"good='ture'", "did you mean \"true\"?"},
        {"fix='Full'", "did you mean \"full\"?"},
        {"fix='x'", "it takes \"none\", \"2d\", \"full\""},
        {"count='-1'", "it takes a whole number from zero on"},
        {"><height>1,5</height", "it takes a number"},
    };
    for (const auto& [content, suggestion] : cases) {
        const auto read = marshaller->readString<Sample>(std::string("<sample ") + content +
                                                         (content[0] == '>' ? "></sample>" : "/>"));
        ASSERT_FALSE(read) << content;
        EXPECT_EQ(read.error()->suggestion(), suggestion) << content;
    }
}
