// Objects become XML: what each kind of field writes, and which values are left out or refused.

#include "Host.h"
#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/base/Exception.h>
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

Ref<qx::Array> lines(std::initializer_list<const char*> texts) {
    auto array = qx::make<qx::Array>();
    for (const char* text : texts)
        array->add(record("Line", {{"text", text}}));
    return array;
}

constexpr const char* classes =
    "<class name='Line'><map-to xml='line'/><field name='text'><bind-xml node='text'/></field>"
    "</class>"
    "<class name='Address'><map-to xml='adr' ns-uri='urn:a'/><field name='street'>"
    "<bind-xml node='attribute'/></field></class>";

// A record of class Order with the members, under one field or more.
struct Case {
    const char* question;
    const char* fields;
    Members members;
    const char* expected;
};

void run(const std::vector<Case>& table) {
    for (const Case& scenario : table) {
        SCOPED_TRACE(scenario.question);
        const auto marshaller = scenario::marshaller(
            "<class name='Order'>" + std::string(scenario.fields) + "</class>" + classes);
        EXPECT_EQ(scenario::write(*marshaller, record("Order", scenario.members)),
                  scenario.expected);
    }
}

std::string field(std::string_view attributes, std::string_view binding) {
    return "<field name='x' " + std::string(attributes) + "><bind-xml " + std::string(binding) +
           "/></field>";
}

} // namespace

TEST(Marshal, WritesAttributesUnlessTheyAreOptionalAndZeroOrEmpty) {
    const std::string optional = field("", "name='a' node='attribute'");
    const std::string required = field("required='true'", "name='a' node='attribute'");
    const std::string flag = field("type='boolean'", "name='a' node='attribute'");
    const std::string requiredFlag = field("type='boolean' required='true'", "node='attribute'");
    const std::string located = field("", "name='a' node='attribute' location='h'");
    run({
        {"text", optional.c_str(), {{"x", "1<2"}}, R"(<Order a="1&lt;2"></Order>)"},
        {"a number", optional.c_str(), {{"x", 3.5}}, R"(<Order a="3.5"></Order>)"},
        {"zero", optional.c_str(), {{"x", 0}}, "<Order></Order>"},
        {"a number that is cut to zero", optional.c_str(), {{"x", 0.5}}, "<Order></Order>"},
        {"false", optional.c_str(), {{"x", false}}, "<Order></Order>"},
        {"the text 0", optional.c_str(), {{"x", "0"}}, R"(<Order a="0"></Order>)"},
        {"empty text", optional.c_str(), {{"x", ""}}, "<Order></Order>"},
        {"no value", optional.c_str(), {}, "<Order></Order>"},
        {"required zero", required.c_str(), {{"x", 0}}, R"(<Order a="0"></Order>)"},
        {"required empty text", required.c_str(), {{"x", ""}}, R"(<Order a=""></Order>)"},
        {"required without a value", required.c_str(), {}, R"(<Order a="0"></Order>)"},
        {"true", flag.c_str(), {{"x", true}}, R"(<Order a="true"></Order>)"},
        {"a text that says yes", flag.c_str(), {{"x", "yes"}}, R"(<Order a="true"></Order>)"},
        {"required, no value", requiredFlag.c_str(), {}, R"(<Order x="false"></Order>)"},
        {"in a wrapper", located.c_str(), {{"x", "v"}}, R"(<Order><h a="v"></h></Order>)"},
    });
}

TEST(Marshal, WritesElementsUnderTheFieldsNameOrTheClasses) {
    const std::string plain = field("", "name='e' node='element'");
    const std::string typed = field("type='Address'", "name='to' node='element'");
    const std::string flat = field("type='Address' container='false'", "node='element'");
    const std::string unmapped = field("type='Nowhere'", "node='element'");
    const std::string required = field("type='Address' required='true'", "node='element'");
    const std::string number = field("type='int' required='true'", "node='element'");
    const Value address(record("Address", {{"street", "s"}}));
    run({
        {"a simple value", plain.c_str(), {{"x", "v"}}, "<Order><e>v</e></Order>"},
        {"zero is written here", plain.c_str(), {{"x", 0}}, "<Order><e>0</e></Order>"},
        {"the null marker is not", plain.c_str(), {{"x", qx::Null::marker()}}, "<Order></Order>"},
        {"an object under its class's name",
         plain.c_str(),
         {{"x", address}},
         R"(<Order><adr xmlns="urn:a" street="s"></adr></Order>)"},
        {"an object of a declared class under the field's",
         typed.c_str(),
         {{"x", address}},
         R"(<Order><to xmlns="urn:a" street="s"></to></Order>)"},
        {"a declared class that is not mapped",
         unmapped.c_str(),
         {{"x", "v"}},
         "-207: No mapping for class: Nowhere (Invalid XML)"},
        {"text where an object is declared",
         typed.c_str(),
         {{"x", "v"}},
         "-211: No mapping definition for class: <string> (Invalid XML)"},
        {"a flattened object", flat.c_str(), {{"x", address}}, R"(<Order street="s"></Order>)"},
        {"no flattened object",
         flat.c_str(),
         {},
         "-211: No class name for marshalling defined: QXGenericRecord (Invalid XML)"},
        {"a required number without a value", number.c_str(), {}, "<Order><x>0</x></Order>"},
    });
    const auto marshaller =
        scenario::marshaller("<class name='Order'>" + required + "</class>" + classes);
    const auto order = record("Order");
    EXPECT_EQ(scenario::write(*marshaller, order),
              "-212: Required value missing for field: x in object: " + order->description().str() +
                  " (Invalid Value)");
}

TEST(Marshal, WritesTextOverWhatStoodThereAndAutomaticFieldsAsAttributes) {
    const std::string text = "<field name='a'><bind-xml node='attribute'/></field>"
                             "<field name='e'><bind-xml node='element'/></field>" +
                             field("", "name='ignored' node='text'");
    const std::string automatic = field("", "name='n'");
    const std::string required = field("required='true'", "name='n'");
    const std::string flat = field("container='false'", "name='n'");
    const Value address(record("Address", {{"street", "s"}}));
    run({
        {"children go, attributes stay",
         text.c_str(),
         {{"a", "1"}, {"e", "2"}, {"x", "3"}},
         R"(<Order a="1">3</Order>)"},
        {"a simple value", automatic.c_str(), {{"x", "v"}}, R"(<Order n="v"></Order>)"},
        {"an optional zero", automatic.c_str(), {{"x", 0}}, "<Order></Order>"},
        {"a required empty text", required.c_str(), {{"x", ""}}, R"(<Order n=""></Order>)"},
        {"an object",
         automatic.c_str(),
         {{"x", address}},
         R"(<Order><adr xmlns="urn:a" street="s"></adr></Order>)"},
        {"an object's children without its attributes",
         flat.c_str(),
         {{"x", address}},
         "<Order></Order>"},
    });
}

TEST(Marshal, WritesArraysWithOrWithoutAWrapper) {
    const std::string typed = field("type='Line'", "name='item'");
    const std::string located = field("type='Line'", "name='item' location='items'");
    const std::string named = field("", "name='line'");
    const std::string wrapped = field("", "name='all'");
    const std::string required = field("required='true'", "name='all'");
    const std::string nameless = field("type='Line'", "");
    const std::string undeclared = field("type='Nowhere'", "name='item'");
    const Value two(lines({"1", "2"}));
    const Value bad(qx::make<qx::Array>(std::initializer_list<Value>{record("Who")}));
    run({
        {"a declared class under the item name",
         typed.c_str(),
         {{"x", two}},
         "<Order><item>1</item><item>2</item></Order>"},
        {"a location",
         located.c_str(),
         {{"x", two}},
         "<Order><items><item>1</item><item>2</item></items></Order>"},
        {"a mapped item name",
         named.c_str(),
         {{"x", two}},
         "<Order><line>1</line><line>2</line></Order>"},
        {"any other name is a wrapper",
         wrapped.c_str(),
         {{"x", two}},
         "<Order><all><line>1</line><line>2</line></all></Order>"},
        {"no name at all falls back on the class's",
         nameless.c_str(),
         {{"x", two}},
         "<Order><Line>1</Line><Line>2</Line></Order>"},
        {"an optional empty array", wrapped.c_str(), {{"x", lines({})}}, "<Order></Order>"},
        {"a required empty array",
         required.c_str(),
         {{"x", lines({})}},
         "<Order><all></all></Order>"},
        {"a class that is not mapped",
         undeclared.c_str(),
         {{"x", two}},
         "-207: No mapping for declared class: Nowhere (Invalid XML)"},
        {"an item without a mapping",
         wrapped.c_str(),
         {{"x", bad}},
         "-211: No mapping definition for class: Who (Invalid XML)"},
    });
}

TEST(Marshal, WritesHostItemsOnlyWhenTheySayThatTheyCannotBeRemoved) {
    struct Silent : qx::Object {
        qx::String classNameForMarshalling() const override { return "Item"; }
        Value valueForUndefinedKey(qx::Key) const override { return {}; }
    };
    const auto marshaller = scenario::marshaller("<class name='Order'>" + field("", "name='all'") +
                                                 "</class><class name='Item'/>");
    const auto items = qx::make<qx::Array>(std::initializer_list<Value>{qx::make<Silent>()});
    EXPECT_EQ(scenario::write(*marshaller, record("Order", {{"x", items}})),
              "<Order><all></all></Order>");
}

TEST(Marshal, OrdersAncestorsFieldsBySelfFirst) {
    const std::string base =
        "<class name='A'><field name='a'><bind-xml node='element'/></field>"
        "</class><class name='B' extends='A' %><field name='b'>"
        "<bind-xml node='element'/></field></class>"
        "<class name='C' extends='B'><field name='c'><bind-xml node='element'/>"
        "</field></class>";
    const auto object = record("C", {{"a", "1"}, {"b", "2"}, {"c", "3"}});
    for (const auto& [selfFirst, expected] :
         {std::pair{"", "<C><a>1</a><b>2</b><c>3</c></C>"},
          std::pair{"self-first='true'", "<C><b>2</b><a>1</a><c>3</c></C>"}}) {
        std::string mapping = base;
        mapping.replace(mapping.find('%'), 1, selfFirst);
        EXPECT_EQ(scenario::write(*scenario::marshaller(mapping), object), expected);
    }
}

TEST(Marshal, RefusesWhatNoMappingDescribes) {
    const auto marshaller = scenario::marshaller(
        "<class name='Lost' extends='Nobody'/><class name='Ring' extends='Ring'/>"
        "<class name='&lt;string>'/>");
    const std::pair<Value, const char*> cases[] = {
        {nullptr, "-211: No class name for marshalling defined: (null) (Invalid XML)"},
        {record("Who"), "-211: No mapping definition for class: Who (Invalid XML)"},
        {"text", "-211: No mapping definition for class: <string> (Invalid XML)"},
        {record("Lost"),
         "-211: No extends definition for class during marshaling: Nobody (Invalid XML)"},
        {record("Ring"),
         "-211: No extends definition for class during marshaling: Ring (Invalid XML)"},
    };
    for (const auto& [object, expected] : cases)
        EXPECT_EQ(scenario::write(*marshaller, object), expected);
}

TEST(Marshal, EndsAtTheDepthLimitForObjectsThatContainThemselves) {
    const auto marshaller =
        scenario::marshaller("<class name='Node'>" + field("", "node='element'") + "</class>");
    const auto node = record("Node");
    node->setValueForKey(node, "x");
    EXPECT_EQ(scenario::write(*marshaller, node),
              "-223: Objects nest deeper than the limit of 256: Node (Invalid Value)");
    EXPECT_LT(node->description().size(), 1000U);
    node->setValueForKey(nullptr, "x");
    node->setChangeCache(nullptr); // which holds the value before the change: the node itself
}

TEST(Marshal, DeclaresNamespacesUnlessToldNotTo) {
    const char* mapping =
        "<class name='A'><map-to xml='a' ns-uri='urn:x'/></class>"
        "<class name='B'><map-to xml='p:b' ns-uri='urn:x' ns-prefix='p'/></class>";
    const auto with = scenario::marshaller(mapping);
    EXPECT_EQ(scenario::write(*with, record("A")), R"(<a xmlns="urn:x"></a>)");
    EXPECT_EQ(scenario::write(*with, record("B")), R"(<p:b xmlns:p="urn:x"></p:b>)");
    const auto without = scenario::marshaller(mapping, scenario::noNamespaces);
    EXPECT_EQ(scenario::write(*without, record("A")), "<a></a>");
}

TEST(Marshal, GivesADocumentOfVersionOneInUTF8) {
    const auto marshaller = scenario::marshaller("<class name='A'/>");
    const auto document = marshaller->marshall(record("A"));
    EXPECT_EQ(document->version(), "1.0");
    EXPECT_EQ(document->characterEncoding(), "UTF-8");
    EXPECT_EQ(document->XMLData(), "<?xml version=\"1.0\" encoding=\"UTF-8\"?><A></A>");
}
