// Objects become XML: what writing.md cannot say.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Dictionary.h>
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

// What is kept moves to the object that is written last, comes last into the start tag, and counts
// for the layout of all that stands before.
TEST(Marshal, WritesTextsWithoutATreeAsItWritesTrees) {
    const auto marshaller = scenario::marshaller(
        "<Order><all collection='array'/><one type='Part' container='false' node='element'/>"
        "<at name='a' node='attribute' location='x'/><end node='element'/></Order>"
        "<Part><text name='w' node='element'/><a name='a' node='attribute' location='w'/></Part>");
    const auto source =
        qx::XMLDocument::initWithData("<s xml:space='preserve' b='1'><x><y/> <!--c--></x><x/></s>");
    const auto root = source->rootElement();
    const auto keep = [&](const Ref<QXGenericRecord>& object) {
        const auto children = qx::make<qx::Dictionary>();
        children->set("x", qx::make<qx::Array>(std::vector<Value>{root->elementsForName("x")[0],
                                                                  root->elementsForName("x")[1]}));
        object->setValueForKey(children, "unboundChildren");
        const auto attributes = qx::make<qx::Array>();
        for (qx::XMLNode& attribute : root->attributes())
            attributes->add(Value(&attribute));
        object->setValueForKey(attributes, "unboundAttributes");
        return object;
    };
    const auto part = keep(record("Part", {{"text", "<t>"}, {"a", 1}}));
    const auto order = keep(record("Order", {{"all", qx::make<qx::Array>(std::vector<Value>{part})},
                                             {"one", part},
                                             {"at", "&"},
                                             {"end", 2}}));
    for (const auto layout : {qx::XMLPrettyPrint, qx::XMLNoOptions, qx::XMLCompactEmptyElements})
        for (const bool isLast : {false, true}) {
            order->setValueForKey(isLast ? part : record("Part"), "one");
            const auto tree = marshaller->marshall(order)->XMLString(layout, {});
            EXPECT_EQ(marshaller->writeString(order, nullptr, layout), tree);
            EXPECT_FALSE(root->firstChild());
        }
    EXPECT_EQ(marshaller->writeString(order, nullptr, qx::XMLCompactEmptyElements).view(),
              R"(<?xml version="1.0" encoding="UTF-8"?><Order xml:space="preserve" b="1"><Part>)"
              R"(<w a="1">&lt;t&gt;</w></Part><w a="1">&lt;t&gt;</w><end>2</end>)"
              R"(<x><y/> <!--c--></x><x a="&amp;"/></Order>)");
}

// They are copied and looked at in blocks of several sizes.
TEST(Marshal, WritesEachByteOfATextAsItWritesTrees) {
    const auto marshaller =
        scenario::marshaller("<Order><a node='attribute'/><c node='element'/></Order>");
    for (const std::size_t size : {1, 3, 4, 7, 8, 15, 16, 17, 32, 35})
        for (std::size_t at = 0; at < size; ++at) {
            for (const char* unusual : {"<", ">", "&", "\"", "\n", "\u00e9", "x"}) {
                const auto text = std::string(size, '-').replace(at, 1, unusual);
                const auto order = record("Order", {{"a", text}, {"c", text}});
                const auto tree = marshaller->marshall(order)->XMLString(qx::XMLPrettyPrint, {});
                ASSERT_EQ(marshaller->writeString(order), tree);
            }
            const auto refused = std::string(size, '-').replace(at, 1, "\1");
            for (const char* key : {"a", "c"})
                ASSERT_TRUE(marshaller->writeString(record("Order", {{key, refused}})).isNull());
        }
}

// Where values are is looked up once for a class, and records have them mostly in order.
TEST(Marshal, FindsValuesOfEachObjectInWhateverOrderTheyStand) {
    struct Host : qx::Object {
        qx::String classNameForMarshalling() const override { return "Part"; }
        Value valueForUndefinedKey(qx::Key key) const override { return "host's " + key.string(); }
    };
    const auto marshaller =
        scenario::marshaller("<Order><p type='Part' node='element'/><q type='Part' node='element'/>"
                             "<r type='Part' node='element'/></Order>"
                             "<Part><a node='element'/><b node='attribute'/></Part>");
    const auto reversed = record("Part", {{"x", 0}, {"b", 1}, {"a", 2}});
    const auto removed = record("Part", {{"a", 3}, {"b", 4}});
    removed->setValueForKey(Value(), "a");
    const Value host = qx::make<Host>();
    EXPECT_EQ(scenario::write(*marshaller,
                              record("Order", {{"p", reversed}, {"q", host}, {"r", removed}})),
              "<Order><p b=\"1\"><a>2</a></p><q b=\"host's b\"><a>host's a</a></q>"
              "<r b=\"4\"></r></Order>");
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
