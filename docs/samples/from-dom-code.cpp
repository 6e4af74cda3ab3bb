// The sample of docs/from-dom-code.md, and what the page says of it. tests/docs/SamplesTest.cpp
// compares it with the page.

#include "support/Scenario.h"
#include "support/TemporaryFolder.h"

#include <gtest/gtest.h>

namespace {

// sample: tree
double costOf(const std::string& path, QXXMLMarshaller& marshaller, qx::Ref<qx::Error>* error) {
    const auto document = qx::XMLDocument::initWithContentsOfFile(path, {}, error);
    if (!document)
        return 0;
    double cost = 0;
    for (const auto& element : document->rootElement()->elementsForName("line"))
        if (const auto line = marshaller.unmarshallElement(element, error))
            cost += line->valueForKey("price").doubleValue();
    return cost;
}
// end of sample

} // namespace

TEST(FromDomCodePage, ElementsOfATreeBecomeObjects) {
    const TemporaryFolder folder;
    const qx::String path =
        folder.write("order.xml", "<order><line price='1.5'/><note/><line price='2'/></order>");
    const auto marshaller =
        scenario::marshaller("<FromDom.Line xml='line'><price node='attribute'/></FromDom.Line>");
    qx::Ref<qx::Error> error;
    EXPECT_EQ(costOf(path.str(), *marshaller, &error), 3.5);
    EXPECT_FALSE(error);
    EXPECT_EQ(costOf(path.str() + ".missing", *marshaller, &error), 0);
    EXPECT_TRUE(error);
}
