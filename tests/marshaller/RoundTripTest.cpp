// Documents are read and written again. What does not come back as it was: docs/round-trip.md.

#include "Host.h"
#include "support/Scenario.h"

namespace {

struct Case {
    const char* question;
    const char* mapping;
    const char* document;
    const char* expected;
};

constexpr Case cases[] = {
    {"unknown children and attributes stand behind the fields",
     "<Order xml='order'><title node='element'/></Order>",
     "<order b='1'><note>n</note><title>t</title><x/><note/></order>",
     R"(<order b="1"><title>t</title><note>n</note><note></note><x></x></order>)"},
    {"declarations that were read take the place of the mapping's",
     "<Order xml='order' ns-uri='urn:mine'/>", "<order xmlns='urn:its' xmlns:p='urn:p'/>",
     R"(<order xmlns="urn:its" xmlns:p="urn:p"></order>)"},
    {"collections and alternatives",
     "<Order xml='order'><lines type='Line' collection='array' name='item' location='items'/>"
     "<title name='t' node='attribute'><alt-xml name='u'/></title></Order><Line>"
     "<text node='text'/></Line>",
     "<order u='x'><items><item>1</item><item>2</item></items></order>",
     R"(<order t="x"><items><item>1</item><item>2</item></items></order>)"},
    {"nested objects, empty ones and what must be escaped",
     "<Order xml='order'><title required='true' node='attribute'/>"
     "<address type='Address' name='to' node='element'/>"
     "<lines type='Address' collection='array' name='stop'/></Order><Address>"
     "<street node='element'/></Address>",
     "<order title=''><to><street>a&#9;&lt;b</street></to><stop><street>1</street></stop><stop/>"
     "</order>",
     "<order title=\"\"><to><street>a\t&lt;b</street></to><stop><street>1</street></stop><stop>"
     "</stop></order>"},
    {"comments and processing instructions go", "<Order xml='order'/>",
     "<order><!--c--><?p i?></order>", "<order></order>"},
};

} // namespace

TEST(RoundTrip, BringsBackWhatTheMappingSaysAndWhatItDoesNotKnow) {
    host::forRecordsAndHosts(cases, [](const Case& row) {
        const auto marshaller = scenario::marshaller(row.mapping);
        const auto source = qx::XMLDocument::initWithData(row.document);
        const auto object = marshaller->unmarshall(source);
        EXPECT_EQ(scenario::write(*marshaller, object), row.expected);
    });
}

TEST(RoundTrip, MovesKeptNodesFromOneResultToTheNext) {
    const auto marshaller = scenario::marshaller("<Order xml='order'/>");
    const auto source = qx::XMLDocument::initWithData("<order a='1'><note/></order>");
    const auto object = marshaller->unmarshall(source);
    EXPECT_TRUE(source->rootElement()->firstChild());
    const auto first = marshaller->marshall(object);
    EXPECT_FALSE(source->rootElement()->firstChild()) << "kept nodes are the document's own";
    const auto second = marshaller->marshall(object);
    EXPECT_EQ(first->rootElement()->XMLString(), "<order></order>");
    EXPECT_EQ(second->rootElement()->XMLString(), R"(<order a="1"><note></note></order>)");
}

TEST(RoundTrip, LeavesTheDocumentAloneWhereObjectsAreFlattened) {
    const auto marshaller = scenario::marshaller(
        "<Order xml='order'><address type='Address' container='false' node='element'/></Order>"
        "<Address><street node='element'/></Address>");
    const auto source =
        qx::XMLDocument::initWithData("<order><street>s</street><note><deep/></note></order>");
    const qx::String before = source->rootElement()->XMLString();
    const auto object = marshaller->unmarshall(source);
    const auto written = marshaller->marshall(object);
    EXPECT_EQ(source->rootElement()->XMLString(), before);
    // Both objects keep the note, as one node: it is written once, behind the fields.
    EXPECT_EQ(written->rootElement()->XMLString(),
              "<order><street>s</street><note><deep></deep></note></order>");
}

// Objects flattened by a class, by one that it extends and by one inside of it keep the same node.
TEST(RoundTrip, WritesOnceWhatSeveralFlattenedObjectsKeep) {
    const std::string flat = " type='Flat' container='false' node='element'";
    const auto marshaller = scenario::marshaller(
        "<Order xml='order' extends='Base'><a" + flat + "/></Order><Base><b" + flat +
        "/><inner type='Inner' node='element'/></Base><Inner><c" + flat + "/></Inner><Flat/>");
    const auto object = marshaller->readString("<order><x/><inner><y/></inner></order>");
    EXPECT_EQ(scenario::write(*marshaller, object),
              "<order><inner><y></y></inner><inner></inner><x></x></order>");
}

TEST(RoundTrip, WritesUnknownXMLInsideWhatAFlattenedObjectKeepsOnce) {
    const auto marshaller = scenario::marshaller(
        "<Order xml='order'><item node='element'/><before type='Flat' container='false' "
        "node='element'/><last type='Item' name='last' node='element'/></Order><Flat/><Item "
        "xml='item'><item node='element'/></Item>");
    const std::string document =
        "<order><last xmlns:n='urn:n' a='1'>t<item b='2'><deep/></item><deeper><x/></deeper>"
        "</last></order>";
    const auto object = marshaller->readString(document);
    EXPECT_EQ(scenario::write(*marshaller, object),
              R"(<order><last xmlns:n="urn:n">t<item></item></last><last xmlns:n="urn:n" a="1">)"
              R"(<item b="2"><deep></deep></item><deeper><x></x></deeper></last></order>)");
    // Not written by another object first, it is still whole.
    EXPECT_EQ(
        support::show(marshaller->readString(document)->valueForKey("before")),
        R"(Flat{unboundChildren: {last: [<last xmlns:n="urn:n" a="1">t<item b="2"><deep></deep>)"
        R"(</item><deeper><x></x></deeper></last>]}})");
}
