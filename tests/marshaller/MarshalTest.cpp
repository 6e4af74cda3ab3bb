// Objects become XML: what each kind of field writes, and which values are left out or refused.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
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

constexpr const char* classes =
    "<Line xml='line'><text node='text'/></Line><Address xml='adr' ns-uri='urn:a'>"
    "<street node='attribute'/></Address>";

// What a field is given, and what its Order is written as: a record, and a struct where that is
// another.
struct Case {
    const char* question;
    const char* fields;
    Value x;
    std::string expected;
    std::string ofStruct = expected;
};

struct Order {
    Value x, a, e;
};

void run(const std::vector<Case>& table) {
    for (const Case& row : table) {
        SCOPED_TRACE(row.question);
        const auto marshaller =
            scenario::marshaller("<Order>" + std::string(row.fields) + "</Order>" + classes);
        const auto order = record("Order", {{"x", row.x}, {"a", "1"}, {"e", "2"}});
        EXPECT_EQ(scenario::write(*marshaller, order), row.expected);
        qx::Class::define<Order>("Order").members<&Order::x, &Order::a, &Order::e>();
        const auto box = qx::make<qx::Boxed<Order>>(Order{row.x, "1", "2"});
        EXPECT_EQ(scenario::write(*marshaller, box), row.ofStruct);
        qx::Class::forget("Order");
    }
}

} // namespace

TEST(Marshal, WritesAttributesUnlessTheyAreOptionalAndZeroOrEmpty) {
    const char* optional = "<x node='attribute'/>";
    const char* required = "<x required='true' node='attribute'/>";
    const char* flag = "<x type='boolean' node='attribute'/>";
    const char* requiredFlag = "<x type='boolean' required='true' node='attribute'/>";
    run({
        {"text", optional, "1<2", R"(<Order x="1&lt;2"></Order>)"},
        {"a number", optional, 3.5, R"(<Order x="3.5"></Order>)"},
        {"zero", optional, 0, "<Order></Order>", R"(<Order x="0"></Order>)"},
        {"cut to zero", optional, 0.5, "<Order></Order>", R"(<Order x="0.5"></Order>)"},
        {"false", optional, false, "<Order></Order>", R"(<Order x="0"></Order>)"},
        {"the text 0", optional, "0", R"(<Order x="0"></Order>)"},
        {"empty text", optional, "", "<Order></Order>", R"(<Order x=""></Order>)"},
        {"no value", optional, {}, "<Order></Order>"},
        {"required zero", required, 0, R"(<Order x="0"></Order>)"},
        {"required empty text", required, "", R"(<Order x=""></Order>)"},
        {"required without a value", required, {}, R"(<Order x="0"></Order>)"},
        {"true", flag, true, R"(<Order x="true"></Order>)"},
        {"a text that says yes", flag, "yes", R"(<Order x="true"></Order>)"},
        {"a required flag, no value", requiredFlag, {}, R"(<Order x="false"></Order>)"},
        {"in a wrapper", "<x name='v' node='attribute' location='h'/>", "v",
         R"(<Order><h v="v"></h></Order>)"},
    });
}

TEST(Marshal, WritesElementsUnderTheFieldsNameOrTheClasses) {
    const char* plain = "<x name='e' node='element'/>";
    const char* typed = "<x type='Address' name='to' node='element'/>";
    const char* flat = "<x type='Address' container='false' node='element'/>";
    const Value address = record("Address", {{"street", "s"}});
    run({
        {"a simple value", plain, "v", "<Order><e>v</e></Order>"},
        {"zero is written here", plain, 0, "<Order><e>0</e></Order>"},
        {"the null marker is not", plain, qx::Null::marker(), "<Order></Order>"},
        {"an object under its class's name", plain, address,
         R"(<Order><adr xmlns="urn:a" street="s"></adr></Order>)"},
        {"an object of a declared class under the field's", typed, address,
         R"(<Order><to xmlns="urn:a" street="s"></to></Order>)"},
        {"a declared class that is not mapped", "<x type='Nowhere' node='element'/>", "v",
         "-207: No mapping for class: Nowhere (Invalid XML)"},
        {"text where an object is declared", typed, "v",
         "-211: No mapping definition for class: <string> (Invalid XML)"},
        {"a flattened object", flat, address, R"(<Order street="s"></Order>)"},
        {"no flattened object",
         flat,
         {},
         "-211: No class name for marshalling defined: QXGenericRecord (Invalid XML)",
         "-211: No class name for marshalling defined: Order (Invalid XML)"},
        {"a required number without a value",
         "<x type='int' required='true' node='element'/>",
         {},
         "<Order><x>0</x></Order>"},
    });
    const auto marshaller = scenario::marshaller(
        "<Order><x type='Address' required='true' node='element'/></Order><Address/>");
    const auto order = record("Order");
    EXPECT_EQ(scenario::write(*marshaller, order),
              "-212: Required value missing for field: x in object: " + order->description().str() +
                  " (Invalid Value)");
}

TEST(Marshal, WritesTextOverWhatStoodThereAndAutomaticFieldsAsAttributes) {
    const char* text = "<a node='attribute'/><e node='element'/><x name='ignored' node='text'/>";
    const Value address = record("Address", {{"street", "s"}});
    run({
        {"children go, attributes stay", text, "3", R"(<Order a="1">3</Order>)"},
        {"a simple value", "<x name='n'/>", "v", R"(<Order n="v"></Order>)"},
        {"an optional zero", "<x/>", 0, "<Order></Order>", R"(<Order x="0"></Order>)"},
        {"a required empty text", "<x required='true'/>", "", R"(<Order x=""></Order>)"},
        {"an object", "<x/>", address, R"(<Order><adr xmlns="urn:a" street="s"></adr></Order>)"},
        {"an object's children without its attributes", "<x container='false'/>", address,
         "<Order></Order>"},
    });
}

TEST(Marshal, WritesArraysWithOrWithoutAWrapper) {
    const char* located = "<x type='Line' name='item' location='items'/>";
    const Value none = qx::make<qx::Array>();
    const Value two = qx::make<qx::Array>(
        std::vector<Value>{record("Line", {{"text", "1"}}), record("Line", {{"text", "2"}})});
    const Value bad = qx::make<qx::Array>(std::vector<Value>{record("Who")});
    const std::string lines = "<line>1</line><line>2</line>";
    run({
        {"a declared class under the item name", "<x type='Line' name='item'/>", two,
         "<Order><item>1</item><item>2</item></Order>"},
        {"a location", located, two, "<Order><items><item>1</item><item>2</item></items></Order>"},
        {"a mapped item name", "<x name='line'/>", two, "<Order>" + lines + "</Order>"},
        {"any other name is a wrapper", "<x name='all'/>", two,
         "<Order><all>" + lines + "</all></Order>"},
        {"no name at all falls back on the class's", "<x type='Line'/>", two,
         "<Order><Line>1</Line><Line>2</Line></Order>"},
        {"an optional empty array", "<x name='all'/>", none, "<Order></Order>"},
        {"a required empty array", "<x required='true' name='all'/>", none,
         "<Order><all></all></Order>"},
        {"a class that is not mapped", "<x type='Nowhere' name='item'/>", two,
         "-207: No mapping for declared class: Nowhere (Invalid XML)"},
        {"an item without a mapping", "<x name='all'/>", bad,
         "-211: No mapping definition for class: Who (Invalid XML)"},
    });
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

TEST(Marshal, OrdersAncestorsFieldsBySelfFirst) {
    const auto object = record("C", {{"a", "1"}, {"b", "2"}, {"c", "3"}});
    const auto written = [&](const std::string& selfFirst) {
        const auto marshaller =
            scenario::marshaller("<A><a node='element'/></A><B extends='A' " + selfFirst +
                                 "><b node='element'/></B><C extends='B'><c node='element'/></C>");
        return scenario::write(*marshaller, object);
    };
    EXPECT_EQ(written(""), "<C><a>1</a><b>2</b><c>3</c></C>");
    EXPECT_EQ(written("self-first='true'"), "<C><b>2</b><a>1</a><c>3</c></C>");
}

TEST(Marshal, RefusesWhatNoMappingDescribes) {
    const auto marshaller = scenario::marshaller(
        "<Lost extends='Nobody'/><Ring extends='Ring'/><class name='&lt;string>'/>");
    const std::pair<Value, const char*> cases[] = {
        {nullptr, "No class name for marshalling defined: (null)"},
        {record("Who"), "No mapping definition for class: Who"},
        {"text", "No mapping definition for class: <string>"},
        {record("Lost"), "No extends definition for class during marshaling: Nobody"},
        {record("Ring"), "No extends definition for class during marshaling: Ring"},
    };
    for (const auto& [object, expected] : cases)
        EXPECT_EQ(scenario::write(*marshaller, object),
                  "-211: " + std::string(expected) + " (Invalid XML)");
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

TEST(Marshal, DeclaresNamespacesUnlessToldNotTo) {
    const char* mapping = "<A xml='a' ns-uri='urn:x'/><B xml='p:b' ns-uri='urn:x' ns-prefix='p'/>";
    const auto with = scenario::marshaller(mapping);
    EXPECT_EQ(scenario::write(*with, record("A")), R"(<a xmlns="urn:x"></a>)");
    EXPECT_EQ(scenario::write(*with, record("B")), R"(<p:b xmlns:p="urn:x"></p:b>)");
    const auto without = scenario::marshaller(mapping, scenario::noNamespaces);
    EXPECT_EQ(scenario::write(*without, record("A")), "<a></a>");
}
