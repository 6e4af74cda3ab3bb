// Objects become XML: what writing.md cannot say.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Null.h>

namespace {

using qx::Ref;
using qx::Value;

using Members = std::vector<std::pair<const char*, Value>>;

Ref<QXGenericRecord> record(const char* className, const Members& members = {}) {
    auto made = qx::make<QXGenericRecord>();
    made->setClassNameForMarshalling(className);
    for (const auto& [key, value] : members)
        made->setValueForKey(value, key);
    return made;
}

} // namespace

TEST(Marshal, RefusesARequiredObjectThatIsMissing) {
    const auto marshaller = scenario::marshaller(
        "<Order><x type='Address' required='true' node='element'/></Order><Address/>");
    const auto order = record("Order");
    EXPECT_EQ(scenario::write(*marshaller, order),
              "-212: Required value missing for field: x in object: " + order->description().str() +
                  " (Invalid Value)");
}

TEST(Marshal, WritesNoElementForTheNullMarker) {
    const auto marshaller = scenario::marshaller("<Order><x node='element'/></Order>");
    EXPECT_EQ(scenario::write(*marshaller, record("Order", {{"x", qx::Null::marker()}})),
              "<Order></Order>");
}

TEST(Marshal, WritesHostItemsOnlyWhenTheySayThatTheyCannotBeRemoved) {
    struct Silent : qx::Object {
        qx::String classNameForMarshalling() const override { return "Item"; }
        Value valueForUndefinedKey(qx::Key) const override { return {}; }
    };
    const auto marshaller = scenario::marshaller("<Order><x name='all'/></Order><Item/>");
    const auto items = qx::make<qx::Array>(std::vector<Value>{qx::make<Silent>()});
    EXPECT_EQ(scenario::write(*marshaller, record("Order", {{"x", items}})),
              "<Order><all></all></Order>");
}

TEST(Marshal, EndsAtTheDepthLimitForObjectsThatContainThemselves) {
    const auto marshaller = scenario::marshaller("<Node><x node='element'/></Node>");
    const auto node = record("Node");
    node->setValueForKey(node, "x");
    EXPECT_EQ(scenario::write(*marshaller, node),
              "-223: Objects nest deeper than the limit of 256: Node (Invalid Value)");
    EXPECT_LT(node->description().size(), 1000U);
    node->setValueForKey(nullptr, "x");
    node->setChangeCache(nullptr); // which holds the value before the change: the node itself
}
