// Documents become objects: one table, run on records and on host classes.

#include "Host.h"
#include "support/Scenario.h"

namespace {

using scenario::discard;
using scenario::strict;
using scenario::usual;

struct Case {
    const char* question;
    const char* mapping;
    const char* document;
    unsigned options;
    const char* expected;
};

constexpr Case values[] = {
    {"an attribute goes under the field's name",
     "<class name='Order'><field name='title'><bind-xml name='t' "
     "node='attribute'/></field></class>",
     "<order t='x'/>", usual, R"(Order{title: "x"})"},
    {"without a bind name the attribute has the field's name",
     "<class name='Order'><field name='title'><bind-xml node='ATTRIBUTE'/></field></class>",
     "<order title=''/>", usual, R"(Order{title: ""})"},
    {"a field without a binding binds nothing", "<class name='Order'><field name='title'/></class>",
     "<order title='x'/>", discard, "Order{}"},
    {"the first alternative whose attribute is there wins",
     "<class name='Order'><field name='title'><bind-xml name='a' node='attribute'/>"
     "<alt-xml name='b'/><alt-xml name='c'/></field></class>",
     "<order c='3' b='2'/>", discard, R"(Order{title: "2"})"},
    {"a location names the child that carries the attribute",
     "<class name='Order'><field name='title'>"
     "<bind-xml name='t' node='attribute' location='head'/></field></class>",
     "<order t='0'><head t='1'/></order>", discard, R"(Order{title: "1"})"},
    {"a wrapper read through a location is kept as unknown all the same",
     "<class name='Order'><field name='title'>"
     "<bind-xml name='t' node='attribute' location='head'/></field></class>",
     "<order><head t='1'/></order>", usual,
     R"(Order{title: "1", unboundChildren: {head: [<head t="1"></head>]}})"},
    {"a missing location leads on to the alternative",
     "<class name='Order'><field name='title'>"
     "<bind-xml name='t' node='attribute' location='head'/><alt-xml name='u'/></field></class>",
     "<order t='0' u='2'/>", discard, R"(Order{title: "2"})"},
    {"two wrappers of a location are too many, wherever the attribute is",
     "<class name='Order'><field name='title'>"
     "<bind-xml name='t' node='attribute' location='h'/></field></class>",
     "<order t='0'><h/><h/></order>", usual,
     R"(-220: Too many elements defined for field: t in element: <order t="0"><h></h><h></h></order> (Invalid XML))"},
    {"a required attribute is missed by its own name",
     "<class name='Order'><field name='title' required='true'>"
     "<bind-xml name='a' node='attribute'/><alt-xml name='b'/></field></class>",
     "<order/>", usual,
     "-202: Required attribute missing for field: b in element: <order></order> (Invalid XML)"},
    {"a required attribute without a binding has no name",
     "<class name='Order'><field name='title' required='true'/></class>", "<order/>", usual,
     "-202: Required attribute missing for field: (null) in element: <order></order> "
     "(Invalid XML)"},
    {"booleans are true, yes and 1 in any case",
     "<class name='Order'><field name='flag' type='BOOLEAN'><bind-xml name='a' node='attribute'/>"
     "</field><field name='note' type='boolean'><bind-xml name='b' node='attribute'/></field>"
     "<field name='extra' type='boolean'><bind-xml name='c' node='attribute'/></field></class>",
     "<order a='Yes' b='1' c='on'/>", usual, "Order{extra: false, flag: true, note: true}"},
    {"integers are cut off at the first character that is no digit",
     "<class name='Order'><field name='count' type='int'><bind-xml name='a' node='attribute'/>"
     "</field><field name='note' type='Integer'><bind-xml name='b' node='attribute'/></field>"
     "<field name='extra' type='int'><bind-xml name='c' node='attribute'/></field></class>",
     "<order a=' -42 ' b='7.5' c='99999999999999999999'/>", usual,
     "Order{count: -42, extra: 9223372036854775807, note: 7}"},
    {"an empty integer sets null",
     "<class name='Order'><field name='count' type='int'><bind-xml name='a' node='attribute'/>"
     "</field></class>",
     "<order a=''/>", usual, "Order{}"},
    {"an unreadable integer fails, even leniently",
     "<class name='Order'><field name='count' type='int'><bind-xml name='a' node='attribute'/>"
     "</field></class>",
     "<order a='abc'/>", usual, "-221: <a>: Unable to convert value to integer: abc (Invalid XML)"},
    {"any other type leaves the text alone",
     "<class name='Order'><field name='title' type='date'><bind-xml node='attribute'/></field>"
     "</class>",
     "<order title='2026-01-01'/>", usual, R"(Order{title: "2026-01-01"})"},
    {"text is all the text inside",
     "<class name='Order'><field name='text'><bind-xml node='text'/></field></class>",
     "<order>a<b>c</b>d</order>", discard, R"(Order{text: "acd"})"},
    {"text of a bind name is that child's, and the child counts",
     "<class name='Order'><field name='text'><bind-xml name='b' node='text'/></field></class>",
     "<order>a<b>c</b></order>", strict | discard, R"(Order{text: "c"})"},
    {"text without such a child is the element's",
     "<class name='Order'><field name='text'><bind-xml name='x' node='text'/></field></class>",
     "<order>a</order>", strict | discard, R"(Order{text: "a"})"},
    {"two children of a text's bind name are too many",
     "<class name='Order'><field name='text'><bind-xml name='b' node='text'/></field></class>",
     "<order><b/><b/></order>", usual,
     "-210: Too many children with name: b in element: <order><b></b><b></b></order> "
     "(Invalid XML)"},
    {"empty text is not set",
     "<class name='Order'><field name='text'><bind-xml node='text'/></field></class>",
     "<order><b/></order>", discard, "Order{}"},
    {"required text is missed by the field's name",
     "<class name='Order'><field name='text' required='true'><bind-xml node='text'/></field>"
     "</class>",
     "<order/>", usual,
     "-202: Required text missing for field: text in element: <order></order> (Invalid XML)"},
};

constexpr Case elements[] = {
    {"a child without a class gives its text",
     "<class name='Order'><field name='count' type='int'><bind-xml name='n' "
     "node='element'/></field>"
     "</class>",
     "<order><n>12</n></order>", strict | discard, "Order{count: 12}"},
    {"the alternative that is there is the one that counts",
     "<class name='Order'><field name='title'><bind-xml name='a' node='element'/>"
     "<alt-xml name='b'/></field></class>",
     "<order><b>x</b></order>", strict | discard, R"(Order{title: "x"})"},
    {"a declared class is built from whatever element the field names",
     "<class name='Order'><field name='address' type='Address'><bind-xml name='to' node='element'/>"
     "</field></class><class name='Address'><field name='street'><bind-xml node='element'/></field>"
     "</class>",
     "<order><to><street>s</street></to></order>", strict | discard,
     R"(Order{address: Address{street: "s"}})"},
    {"without a type the child's own name finds its class",
     "<class name='Order'><field name='address'><bind-xml node='element'/></field></class>"
     "<class name='Address'><field name='street'><bind-xml node='element'/></field></class>",
     "<order><address><street>s</street></address></order>", strict | discard,
     R"(Order{address: Address{street: "s"}})"},
    {"two children of one name are too many",
     "<class name='Order'><field name='title'><bind-xml node='element'/></field></class>",
     "<order><title/><title/></order>", usual,
     "-210: Too many child elements of name: title in element: "
     "<order><title></title><title></title></order> (Invalid XML)"},
    {"a required child is missed by the last name tried",
     "<class name='Order'><field name='title' required='true'><bind-xml name='a' node='element'/>"
     "<alt-xml name='b'/></field></class>",
     "<order/>", usual,
     "-202: Missing required element named: b in element: <order></order> (Invalid XML)"},
    {"an error inside a child comes up as it is",
     "<class name='Order'><field name='address'><bind-xml node='element'/></field></class>"
     "<class name='Address'><field name='street' required='true'><bind-xml node='element'/></field>"
     "</class>",
     "<order><address/></order>", usual,
     "-202: Missing required element named: street in element: <address></address> "
     "(Invalid XML)"},
    {"an automatic field takes the attribute first",
     "<class name='Order'><field name='title'><bind-xml node='any'/></field></class>",
     "<order title='a'><title>b</title></order>", discard, R"(Order{title: "a"})"},
    {"an automatic field takes the child where there is no attribute, required or not",
     "<class name='Order'><field name='title' required='true'><bind-xml node='any'/></field>"
     "</class>",
     "<order><title>b</title></order>", discard, R"(Order{title: "b"})"},
    {"a required automatic field complains of the element",
     "<class name='Order'><field name='title' required='true'><bind-xml/></field></class>",
     "<order/>", usual,
     "-202: Missing required element named: title in element: <order></order> (Invalid XML)"},
};

constexpr Case flattened[] = {
    {"a flattened object takes its fields from its parent's element",
     "<class name='Order'><field name='title'><bind-xml node='element'/></field>"
     "<field name='address' type='Address' container='false'><bind-xml node='element'/></field>"
     "</class><class name='Address'><field name='street'><bind-xml node='element'/></field>"
     "<field name='city'><bind-xml node='attribute'/></field></class>",
     "<order city='c'><title>t</title><street>s</street></order>", discard,
     R"(Order{address: Address{city: "c", street: "s"}, title: "t"})"},
    {"two flattened objects share children of one name out",
     "<class name='Order'><field name='address' type='Address' container='false'>"
     "<bind-xml node='element'/></field><field name='extra' type='Address' container='false'>"
     "<bind-xml node='element'/></field></class>"
     "<class name='Address'><field name='street'><bind-xml node='element'/></field></class>",
     "<order><street>1</street><street>2</street></order>", strict | discard,
     R"(Order{address: Address{street: "1"}, extra: Address{street: "2"}})"},
    {"a flattened object keeps what is left of its parent as its own unknown XML",
     "<class name='Order'><field name='address' type='Address' container='false'>"
     "<bind-xml node='element'/></field><field name='title'><bind-xml node='element'/></field>"
     "</class><class name='Address'><field name='street'><bind-xml "
     "node='element'/></field></class>",
     "<order><street>1</street><title>t</title></order>", usual,
     R"(Order{address: Address{street: "1", unboundChildren: {title: [<title>t</title>]}}, title: "t"})"},
    {"a flattened class with a flattened field works on a copy of its own",
     "<class name='Order'><field name='address' type='Address' container='false'>"
     "<bind-xml node='element'/></field><field name='city'><bind-xml "
     "node='element'/></field></class>"
     "<class name='Address'><field name='street'><bind-xml node='element'/></field>"
     "<field name='owner' type='Owner' container='false'><bind-xml node='element'/></field></class>"
     "<class name='Owner'><field name='city'><bind-xml node='element'/></field></class>",
     "<order><street>s</street><city>c</city></order>", discard,
     R"(Order{address: Address{owner: Owner{city: "c"}, street: "s"}, city: "c"})"},
    {"a field that flattens its own class is refused",
     "<class name='Order'><field name='base' type='Order' container='false'>"
     "<bind-xml node='element'/></field></class>",
     "<order/>", usual, "-211: No definition to handle element: <order></order> (Invalid Mapping)"},
    {"so is one that leads back over another class",
     "<class name='Order'><field name='address' type='Address' container='false'>"
     "<bind-xml node='element'/></field></class>"
     "<class name='Address'><field name='owner' type='Order' container='false'>"
     "<bind-xml node='element'/></field></class>",
     "<order/>", usual, "-211: No definition to handle element: <order></order> (Invalid Mapping)"},
    {"and one whose type names no class, by way of the element's own",
     "<class name='Order'><field name='address' type='Nowhere' container='false'>"
     "<bind-xml node='element'/></field></class>",
     "<order/>", usual, "-211: No definition to handle element: <order></order> (Invalid Mapping)"},
};

constexpr const char* lineClass =
    "<class name='Line'><map-to xml='line'/><field name='text'><bind-xml node='text'/></field>"
    "</class>";

constexpr Case collections[] = {
    {"typed items are found by the bind name, whatever their class's own",
     "<class name='Order'><field name='lines' type='Line' collection='Vector'>"
     "<bind-xml name='item' node='element'/></field></class>",
     "<order><item>1</item><item>2</item></order>", strict | discard,
     R"(Order{lines: [Line{text: "1"}, Line{text: "2"}]})"},
    {"typed items stand in the wrapper of a location, which counts for them",
     "<class name='Order'><field name='lines' type='Line' collection='array'>"
     "<bind-xml name='item' location='items'/></field></class>",
     "<order><items><item>1</item></items></order>", strict | discard,
     R"(Order{lines: [Line{text: "1"}]})"},
    {"an empty wrapper sets nothing, and counts",
     "<class name='Order'><field name='lines' type='Line' collection='array'>"
     "<bind-xml name='item' location='items'/><alt-xml name='line'/></field></class>",
     "<order><items/></order>", strict | discard, "Order{}"},
    {"without the wrapper the next binding is tried",
     "<class name='Order'><field name='lines' type='Line' collection='array'>"
     "<bind-xml name='item' location='items'/><alt-xml name='line'/></field></class>",
     "<order><line>1</line></order>", strict | discard, R"(Order{lines: [Line{text: "1"}]})"},
    {"two wrappers are ignored",
     "<class name='Order'><field name='lines' type='Line' collection='array'>"
     "<bind-xml name='item' location='items'/></field></class>",
     "<order><items/><items/><item>1</item></order>", discard,
     R"(Order{lines: [Line{text: "1"}]})"},
    {"typed items need a class",
     "<class name='Order'><field name='lines' type='Nowhere' collection='array'><bind-xml/></field>"
     "</class>",
     "<order/>", usual, "-207: No mapping for class: Nowhere (Invalid XML)"},
    {"a collection is one of four kinds",
     "<class name='Order'><field name='lines' collection='list'><bind-xml/></field></class>",
     "<order/>", usual, "-208: Unable to process collection class: list (Invalid XML)"},
    {"untyped items of a mapped name are the elements themselves, counted once",
     "<class name='Order'><field name='lines' collection='set'><bind-xml name='line'/></field>"
     "</class>",
     "<order><line>1</line><line>2</line></order>", usual,
     R"(Order{lines: [Line{text: "1"}, Line{text: "2"}], unboundChildren: {line: [<line>1</line>, <line>2</line>]}})"},
    {"under any other name stands a wrapper, the last of several",
     "<class name='Order'><field name='lines' collection='collection'><bind-xml "
     "name='all'/></field>"
     "</class>",
     "<order><all><line>0</line></all><all><line>1</line></all></order>", discard,
     R"(Order{lines: [Line{text: "1"}]})"},
    {"unnamed items are all children that a class maps to, each counted",
     "<class name='Order'><field name='lines' collection='array'><bind-xml/></field></class>",
     "<order><line>1</line>between<line>2</line></order>", discard,
     R"(Order{lines: [Line{text: "1"}, Line{text: "2"}]})"},
    {"a strict marshaller refuses a child that no class maps to",
     "<class name='Order'><field name='lines' collection='array'><bind-xml/></field></class>",
     "<order><line>1</line><other/></order>", strict | discard,
     "-211: No definition to handle element: <other></other> (Invalid Mapping)"},
    {"an item that fails fails the collection",
     "<class name='Order'><field name='lines' type='Owner' collection='array'>"
     "<bind-xml name='item'/></field></class>"
     "<class name='Owner'><field name='city' required='true'><bind-xml node='attribute'/></field>"
     "</class>",
     "<order><item/></order>", usual,
     "-202: Required attribute missing for field: city in element: <item></item> "
     "(Invalid XML)"},
    {"no items leave the key alone",
     "<class name='Order'><field name='lines' type='Line' collection='array'>"
     "<bind-xml name='item'/></field></class>",
     "<order/>", usual, "Order{}"},
};

constexpr Case wholes[] = {
    {"ancestors' fields come after the class's own, the last binding wins",
     "<class name='Order' extends='Base'><field name='title'><bind-xml node='attribute'/></field>"
     "</class><class name='Base'><field name='title'><bind-xml name='b' node='attribute'/></field>"
     "<field name='note'><bind-xml node='attribute'/></field></class>",
     "<order title='1' b='2' note='3'/>", strict | discard, R"(Order{note: "3", title: "2"})"},
    {"an unknown ancestor fails", "<class name='Order' extends='Nobody'/>", "<order/>", usual,
     "-211: No extends definition for class: Nobody (Invalid XML)"},
    {"a class among its own ancestors fails",
     "<class name='Order' extends='Base'/><class name='Base' extends='Order'/>", "<order/>", usual,
     "-211: No extends definition for class: Order (Invalid XML)"},
    {"an unknown root is an error", "<class name='Order'/>", "<other/>", usual,
     "-211: No definition to handle element: <other></other> (Invalid Mapping)"},
    {"a prefix is part of the name", "<class name='Order'><map-to xml='x:order'/></class>",
     "<x:order xmlns:x='urn:x'/>", usual, R"(Order{__namespaces: [xmlns:x="urn:x"]})"},
    {"unknown children and attributes are kept as they stand",
     "<class name='Order'><field name='title'><bind-xml node='attribute'/></field></class>",
     "<order title='t' a='1' b='2'><note>n</note><!--c--><note/>text<?pi x?></order>", strict,
     R"(Order{title: "t", unboundAttributes: [a="1", b="2"], )"
     R"(unboundChildren: {note: [<note>n</note>, <note></note>], pi: []}})"},
    {"a child that is bound twice does not make up for one that is not bound",
     "<class name='Order'><field name='text'><bind-xml name='t' node='element'/></field>"
     "<field name='note'><bind-xml name='t' node='element'/></field></class>",
     "<order><t>1</t><other/></order>", usual,
     R"(Order{note: "1", text: "1", unboundChildren: {other: [<other></other>]}})"},
    {"unknown children fail before unknown attributes", "<class name='Order'/>",
     "<order a='1'><note/><note/></order>", strict | discard,
     "-214: Unknown fields found in XML document: (note [2]) element: order (Invalid XML)"},
    {"unknown attributes fail", "<class name='Order'/>", "<order a='1' b='1'/>", strict | discard,
     "-215: Unknown attributes found in XML document: (a [1], b [1]) element: order "
     "(Invalid XML)"},
    {"text and comments are never unknown", "<class name='Order'/>", "<order>t<!--c--></order>",
     strict | discard, "Order{}"},
    {"a name left over is kept with the elements that were consumed",
     "<class name='Order'><field name='lines' collection='array'><bind-xml name='line'/></field>"
     "</class>",
     "<order><line>1</line><line>2</line></order>", usual,
     R"(Order{lines: [Line{text: "1"}, Line{text: "2"}], unboundChildren: {line: [<line>1</line>, <line>2</line>]}})"},
};

void run(const Case& scenario) {
    SCOPED_TRACE(scenario.question);
    const auto marshaller =
        scenario::marshaller(std::string(scenario.mapping) + lineClass, scenario.options);
    EXPECT_EQ(scenario::read(*marshaller, scenario.document), scenario.expected);
}

template <class Table>
void runOnRecordsAndHosts(const Table& table) {
    for (const Case& scenario : table)
        run(scenario);
    SCOPED_TRACE("on host classes");
    const host::Defined defined;
    for (const Case& scenario : table)
        run(scenario);
}

} // namespace

TEST(Unmarshal, BindsAttributesAndText) { runOnRecordsAndHosts(values); }
TEST(Unmarshal, BindsChildElements) { runOnRecordsAndHosts(elements); }
TEST(Unmarshal, FlattensObjects) { runOnRecordsAndHosts(flattened); }
TEST(Unmarshal, BindsCollections) { runOnRecordsAndHosts(collections); }
TEST(Unmarshal, BindsWholeObjects) { runOnRecordsAndHosts(wholes); }
