// Documents are read and written again. What does not come back as it was: docs/round-trip.md.

#include "support/Scenario.h"

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
