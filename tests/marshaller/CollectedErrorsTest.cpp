// Readings that go on after an error: what they answer, and what is left out.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "support/Cases.h"
#include "support/Show.h"
#include "support/Texts.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <sstream>

using namespace qx;

namespace {

struct Reader {
    Ref<QXXMLMarshaller> marshaller;

    explicit Reader(std::size_t errors, bool keepsPartial = false)
        : marshaller(QXXMLMarshaller::initWithMappingXML(support::parsed(R"(<mapping>
<class name="Order">
    <field name="count" type="integer"><bind-xml node="element"/></field>
    <field name="number" required="true"><bind-xml node="attribute"/></field>
    <field name="lines" collection="array" type="Line"><bind-xml name="line" node="element"/></field>
    <field name="sizes" collection="array" type="integer"><bind-xml name="size" node="element"/></field>
    <field name="part" type="Line"><bind-xml name="part" node="element"/></field>
</class>
<class name="Line">
    <field name="n" type="integer"><bind-xml node="attribute"/></field>
    <field name="text"><bind-xml node="text"/></field>
</class></mapping>)")
                                                             .get())) {
        marshaller->setMaximumErrors(errors);
        marshaller->setKeepsPartial(keepsPartial);
    }

    // A line for each error.
    static std::string told(const Ref<Error>& error) {
        std::string text;
        for (const auto& one : error ? error->all() : std::vector<Ref<const Error>>())
            text += std::to_string(one->code()) + " " + std::to_string(one->line()) + " " +
                    one->path().str() + "\n";
        return text;
    }
};

constexpr const char* faulty = R"(<order>
<line n='a'>x</line>
<line n='2'>y</line>
<size>1</size><size>b</size><size>3</size>
<part n='c'>z</part>
<count>d</count>
<count>e</count>
</order>)";

constexpr const char* all = "-202 1 /order\n-221 2 /order/line[1]/@n\n-221 4 /order/size[2]\n"
                            "-221 5 /order/part/@n\n-210 7 /order/count[2]\n";

} // namespace

TEST(CollectedErrors, StandBesideTheFirstInTheOrderOfTheDocument) {
    for (const bool isTree : {false, true}) {
        const Reader reader(100);
        Ref<Error> error;
        const auto document = support::parsed(faulty);
        if (isTree)
            document->rootElement();
        EXPECT_FALSE(reader.marshaller->unmarshall(document, &error));
        EXPECT_EQ(Reader::told(error), all);
        EXPECT_EQ(error->localizedDescription().view().substr(0, 44),
                  "Required attribute missing for field: number");
        EXPECT_EQ(reader.marshaller->undoManager()->groupingLevel(), 0U);
    }
}

TEST(CollectedErrors, AreNoMoreThanWereAskedFor) {
    for (const std::size_t most : {0, 1, 2, 3}) {
        const Reader reader(most);
        Ref<Error> error;
        EXPECT_FALSE(reader.marshaller->readString(faulty, &error));
        EXPECT_EQ(error->all().size(), std::max<std::size_t>(most, 1));
    }
    EXPECT_FALSE(Reader(100).marshaller->readString(faulty)) << "nobody is told: the first ends it";
}

TEST(CollectedErrors, LeaveThePartialObject) {
    for (const std::size_t most : {2, 100}) {
        const Reader reader(most, true);
        Ref<Error> error;
        const auto object = reader.marshaller->readString(faulty, &error);
        ASSERT_TRUE(object);
        EXPECT_EQ(
            support::withoutLayout(support::show(object)),
            support::withoutLayout("Order{lines: [Line{text: \"x\"}, Line{n: 2, text: \"y\"}], "
                                   "part: Line{text: \"z\"}, sizes: [1, 3]}"));
        EXPECT_EQ(error->all().size(), std::min<std::size_t>(most, 5));
        EXPECT_EQ(
            reader.marshaller->readString("<order number='1'/>", &error)->valueForKey("number"),
            Value("1"));
        EXPECT_FALSE(error);
        // Part of a document is none to reload.
        const auto held = reader.marshaller->readString("<order number='1'/>");
        EXPECT_FALSE(reader.marshaller->readStringInto(held, faulty, &error));
        EXPECT_EQ(held->valueForKey("number"), Value("1"));
        EXPECT_EQ(error->all().size(), std::min<std::size_t>(most, 5));
    }
}

TEST(CollectedErrors, OfStrictReadingsNameChildrenAndAttributes) {
    const Reader reader(100);
    reader.marshaller->setLenient(false);
    reader.marshaller->setSaveUnknownXML(false);
    Ref<Error> error;
    EXPECT_FALSE(reader.marshaller->readString(
        "<order number='1' x='1'><line "
        "y='1'/>\n<z/><line><w/></line><size>b</size><count/><count/></order>",
        &error));
    EXPECT_EQ(Reader::told(error), "-215 1 /order/@x\n-215 1 /order/line[1]/@y\n-214 2 /order/z\n"
                                   "-214 2 /order/line[2]/w\n-221 2 /order/size\n"
                                   "-210 2 /order/count[2]\n");
}

TEST(CollectedErrors, LeaveOutTheObjectsThatAreReadOneByOne) {
    std::string text = "<all>\n";
    for (int i = 0; i < 40'000; ++i)
        text += i % 10'000 == 1 ? "<line n='x'/>\n" : "<line n='1'/>\n";
    for (const bool keepsPartial : {false, true}) {
        const Reader reader(100, keepsPartial);
        std::istringstream stream(text + "</all>");
        Ref<Error> error;
        int visited = 0;
        const auto count = [&](const Ref<Object>&) { ++visited; };
        EXPECT_FALSE(reader.marshaller->unmarshallEach(stream, "line", count, &error));
        EXPECT_EQ(visited, keepsPartial ? 40'000 : 39'996);
        EXPECT_EQ(Reader::told(error), "-221 3 /all/line[2]/@n\n-221 10003 /all/line[10002]/@n\n"
                                       "-221 20003 /all/line[20002]/@n\n"
                                       "-221 30003 /all/line[30002]/@n\n");
    }
}

TEST(CollectedErrors, EndWithWhatEndsTheReading) {
    const Reader reader(100, true);
    reader.marshaller->setMaximumObjects({3, 0});
    Ref<Error> error;
    EXPECT_FALSE(reader.marshaller->readString(
        "<order><line n='x'/><line/><line/><line/><line/></order>", &error));
    EXPECT_EQ(Reader::told(error),
              "-202 1 /order\n-221 1 /order/line[1]/@n\n-224 1 /order/line[3]\n");
}

// A thousand errors are placed by one pass over the document.
TEST(CollectedErrors, AreCheapToPlace) {
    std::string text = "<order number='1'>";
    for (int i = 0; i < 50'000; ++i)
        text += "<line n='x'/>\n";
    const Reader reader(1'000'000);
    Ref<Error> error;
    EXPECT_FALSE(reader.marshaller->readString(text + "</order>", &error));
    const auto errors = error->all();
    ASSERT_EQ(errors.size(), 50'000U);
    for (const std::size_t i : {std::size_t(0), errors.size() / 2, errors.size() - 1})
        EXPECT_EQ(errors[i]->path(), "/order/line[" + std::to_string(i + 1) + "]/@n");
    for (const auto& one : errors)
        ASSERT_NE(one->line(), 0U);
}
