// Documents become objects: one table, run on records and on host classes.

#include "Plain.h"
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
     "<Order><title name='t' node='attribute'/></Order>", "<order t='x'/>", usual,
     R"(Order{title: "x"})"},
    {"without a bind name the attribute has the field's name",
     "<Order><title node='ATTRIBUTE'/></Order>", "<order title=''/>", usual, R"(Order{title: ""})"},
    {"a field without a binding binds nothing", "<Order><field name='title'/></Order>",
     "<order title='x'/>", discard, "Order{}"},
    {"the first alternative whose attribute is there wins",
     "<Order><title name='a' node='attribute'><alt-xml name='b'/><alt-xml name='c'/></title>"
     "</Order>",
     "<order c='3' b='2'/>", discard, R"(Order{title: "2"})"},
    {"a location names the child that carries the attribute",
     "<Order><title name='t' node='attribute' location='head'/></Order>",
     "<order t='0'><head t='1'/></order>", discard, R"(Order{title: "1"})"},
    {"a wrapper read through a location is kept as unknown all the same",
     "<Order><title name='t' node='attribute' location='head'/></Order>",
     "<order><head t='1'/></order>", usual,
     R"(Order{title: "1", unboundChildren: {head: [<head t="1"></head>]}})"},
    {"a missing location leads on to the alternative",
     "<Order><title name='t' node='attribute' location='head'><alt-xml name='u'/></title></Order>",
     "<order t='0' u='2'/>", discard, R"(Order{title: "2"})"},
    {"a required attribute is missed by its own name",
     "<Order><title required='true' name='a' node='attribute'><alt-xml name='b'/></title></Order>",
     "<order/>", usual,
     "-202: Required attribute missing for field: b in element: <order></order> (Invalid XML)"},
    {"a required attribute without a binding has no name",
     "<Order><field name='title' required='true'/></Order>", "<order/>", usual,
     "-202: Required attribute missing for field: (null) in element: <order></order> "
     "(Invalid XML)"},
    {"booleans are true, yes and 1 in any case",
     "<Order><flag type='BOOLEAN' name='a' node='attribute'/><note type='boolean' name='b' "
     "node='attribute'/><extra type='boolean' name='c' node='attribute'/></Order>",
     "<order a='Yes' b='1' c='on'/>", usual, "Order{extra: false, flag: true, note: true}"},
    {"integers are cut off at the first character that is no digit",
     "<Order><count type='int' name='a' node='attribute'/><note type='Integer' name='b' "
     "node='attribute'/><extra type='int' name='c' node='attribute'/></Order>",
     "<order a=' -42 ' b='7.5' c='99999999999999999999'/>", usual,
     "Order{count: -42, extra: 9223372036854775807, note: 7}"},
    {"an empty integer sets null", "<Order><count type='int' name='a' node='attribute'/></Order>",
     "<order a=''/>", usual, "Order{}"},
    {"text is all the text inside", "<Order><text node='text'/></Order>",
     "<order>a<b>c</b>d</order>", discard, R"(Order{text: "acd"})"},
    {"text of a bind name is that child's, and the child counts",
     "<Order><text name='b' node='text'/></Order>", "<order>a<b>c</b></order>", strict | discard,
     R"(Order{text: "c"})"},
    {"text without such a child is the element's", "<Order><text name='x' node='text'/></Order>",
     "<order>a</order>", strict | discard, R"(Order{text: "a"})"},
    {"empty text is not set", "<Order><text node='text'/></Order>", "<order><b/></order>", discard,
     "Order{}"},
    {"required text is missed by the field's name",
     "<Order><text required='true' node='text'/></Order>", "<order/>", usual,
     "-202: Required text missing for field: text in element: <order></order> (Invalid XML)"},
};

constexpr Case elements[] = {
    {"a child without a class gives its text",
     "<Order><count type='int' name='n' node='element'/></Order>", "<order><n>12</n></order>",
     strict | discard, "Order{count: 12}"},
    {"the alternative that is there is the one that counts",
     "<Order><title name='a' node='element'><alt-xml name='b'/></title></Order>",
     "<order><b>x</b></order>", strict | discard, R"(Order{title: "x"})"},
    {"a declared class is built from whatever element the field names",
     "<Order><address type='Address' name='to' node='element'/></Order><Address>"
     "<street node='element'/></Address>",
     "<order><to><street>s</street></to></order>", strict | discard,
     R"(Order{address: Address{street: "s"}})"},
    {"a required child is missed by the last name tried",
     "<Order><title required='true' name='a' node='element'><alt-xml name='b'/></title></Order>",
     "<order/>", usual,
     "-202: Missing required element named: b in element: <order></order> (Invalid XML)"},
    {"an error inside a child comes up as it is",
     "<Order><address node='element'/></Order><Address><street required='true' node='element'/>"
     "</Address>",
     "<order><address/></order>", usual,
     "-202: Missing required element named: street in element: <address></address> "
     "(Invalid XML)"},
    {"an automatic field takes the attribute first", "<Order><title node='any'/></Order>",
     "<order title='a'><title>b</title></order>", discard, R"(Order{title: "a"})"},
    {"an automatic field takes the child where there is no attribute, required or not",
     "<Order><title required='true' node='any'/></Order>", "<order><title>b</title></order>",
     discard, R"(Order{title: "b"})"},
    {"a required automatic field complains of the element",
     "<Order><title required='true'/></Order>", "<order/>", usual,
     "-202: Missing required element named: title in element: <order></order> (Invalid XML)"},
};

constexpr Case flattened[] = {
    {"a flattened object takes its fields from its parent's element",
     "<Order><title node='element'/><address type='Address' container='false' node='element'/>"
     "</Order><Address><street node='element'/><city node='attribute'/></Address>",
     "<order city='c'><title>t</title><street>s</street></order>", discard,
     R"(Order{address: Address{city: "c", street: "s"}, title: "t"})"},
    {"two flattened objects share children of one name out",
     "<Order><address type='Address' container='false' node='element'/><extra type='Address' "
     "container='false' node='element'/></Order><Address><street node='element'/></Address>",
     "<order><street>1</street><street>2</street></order>", strict | discard,
     R"(Order{address: Address{street: "1"}, extra: Address{street: "2"}})"},
    {"a flattened object keeps what is left of its parent as its own unknown XML",
     "<Order><address type='Address' container='false' node='element'/><title node='element'/>"
     "</Order><Address><street node='element'/></Address>",
     "<order><street>1</street><title>t</title></order>", usual,
     R"(Order{address: Address{street: "1", unboundChildren: {title: [<title>t</title>]}}, title: "t"})"},
    {"a flattened class with a flattened field works on a copy of its own",
     "<Order><address type='Address' container='false' node='element'/><city "
     "node='element'/></Order><Address><street node='element'/><owner type='Owner' "
     "container='false' node='element'/></Address><Owner><city node='element'/></Owner>",
     "<order><street>s</street><city>c</city></order>", discard,
     R"(Order{address: Address{owner: Owner{city: "c"}, street: "s"}, city: "c"})"},
    {"a field that flattens its own class is refused",
     "<Order><base type='Order' container='false' node='element'/></Order>", "<order/>", usual,
     "-211: No definition to handle element: <order></order> (Invalid Mapping)"},
    {"so is one that leads back over another class",
     "<Order><address type='Address' container='false' node='element'/></Order><Address>"
     "<owner type='Order' container='false' node='element'/></Address>",
     "<order/>", usual, "-211: No definition to handle element: <order></order> (Invalid Mapping)"},
    {"and one whose type names no class, by way of the element's own",
     "<Order><address type='Nowhere' container='false' node='element'/></Order>", "<order/>", usual,
     "-211: No definition to handle element: <order></order> (Invalid Mapping)"},
};

constexpr const char* lineClass = "<Line xml='line'><text node='text'/></Line>";

constexpr Case collections[] = {
    {"typed items are found by the bind name, whatever their class's own",
     "<Order><lines type='Line' collection='Vector' name='item' node='element'/></Order>",
     "<order><item>1</item><item>2</item></order>", strict | discard,
     R"(Order{lines: [Line{text: "1"}, Line{text: "2"}]})"},
    {"typed items stand in the wrapper of a location, which counts for them",
     "<Order><lines type='Line' collection='array' name='item' location='items'/></Order>",
     "<order><items><item>1</item></items></order>", strict | discard,
     R"(Order{lines: [Line{text: "1"}]})"},
    {"an empty wrapper sets nothing, and counts",
     "<Order><lines type='Line' collection='array' name='item' location='items'>"
     "<alt-xml name='line'/></lines></Order>",
     "<order><items/></order>", strict | discard, "Order{}"},
    {"two wrappers are ignored",
     "<Order><lines type='Line' collection='array' name='item' location='items'/></Order>",
     "<order><items/><items/><item>1</item></order>", discard,
     R"(Order{lines: [Line{text: "1"}]})"},
    {"untyped items of a mapped name are the elements themselves, counted once",
     "<Order><lines collection='set' name='line'/></Order>",
     "<order><line>1</line><line>2</line></order>", usual,
     R"(Order{lines: [Line{text: "1"}, Line{text: "2"}], unboundChildren: {line: [<line>1</line>, <line>2</line>]}})"},
    {"under any other name stands a wrapper, the last of several",
     "<Order><lines collection='collection' name='all'/></Order>",
     "<order><all><line>0</line></all><all><line>1</line></all></order>", discard,
     R"(Order{lines: [Line{text: "1"}]})"},
    {"unnamed items are all children that a class maps to, each counted",
     "<Order><lines collection='array'/></Order>",
     "<order><line>1</line>between<line>2</line></order>", discard,
     R"(Order{lines: [Line{text: "1"}, Line{text: "2"}]})"},
    {"a strict marshaller refuses a child that no class maps to",
     "<Order><lines collection='array'/></Order>", "<order><line>1</line><other/></order>",
     strict | discard, "-211: No definition to handle element: <other></other> (Invalid Mapping)"},
    {"an item that fails fails the collection",
     "<Order><lines type='Owner' collection='array' name='item'/></Order><Owner>"
     "<city required='true' node='attribute'/></Owner>",
     "<order><item/></order>", usual,
     "-202: Required attribute missing for field: city in element: <item></item> "
     "(Invalid XML)"},
    {"no items leave the key alone",
     "<Order><lines type='Line' collection='array' name='item'/></Order>", "<order/>", usual,
     "Order{}"},
};

constexpr Case wholes[] = {
    {"ancestors' fields come after the class's own, the last binding wins",
     "<Order extends='Base'><title node='attribute'/></Order><Base>"
     "<title name='b' node='attribute'/><note node='attribute'/></Base>",
     "<order title='1' b='2' note='3'/>", strict | discard, R"(Order{note: "3", title: "2"})"},
    {"a class among its own ancestors fails", "<Order extends='Base'/><Base extends='Order'/>",
     "<order/>", usual, "-211: No extends definition for class: Order (Invalid XML)"},
    {"a prefix is part of the name", "<Order xml='x:order'/>", "<x:order xmlns:x='urn:x'/>", usual,
     R"(Order{__namespaces: [xmlns:x="urn:x"]})"},
    {"unknown children and attributes are kept as they stand",
     "<Order><title node='attribute'/></Order>",
     "<order title='t' a='1' b='2'><note>n</note><!--c--><note/>text<?pi x?></order>", strict,
     R"(Order{title: "t", unboundAttributes: [a="1", b="2"], )"
     R"(unboundChildren: {note: [<note>n</note>, <note></note>], pi: []}})"},
    {"a child that is bound twice does not make up for one that is not bound",
     "<Order><text name='t' node='element'/><note name='t' node='element'/></Order>",
     "<order><t>1</t><other/></order>", usual,
     R"(Order{note: "1", text: "1", unboundChildren: {other: [<other></other>]}})"},
    {"unknown children fail before unknown attributes", "<Order/>",
     "<order a='1'><note/><note/></order>", strict | discard,
     "-214: Unknown fields found in XML document: (note [2]) element: order (Invalid XML)"},
    {"unknown attributes fail", "<Order/>", "<order a='1' b='1'/>", strict | discard,
     "-215: Unknown attributes found in XML document: (a [1], b [1]) element: order "
     "(Invalid XML)"},
    {"text and comments are never unknown", "<Order/>", "<order>t<!--c--></order>",
     strict | discard, "Order{}"},
};

void run(const Case& row, bool isOnStructs) {
    const auto marshaller = scenario::marshaller(std::string(row.mapping) + lineClass, row.options);
    EXPECT_EQ(scenario::read(*marshaller, row.document),
              isOnStructs ? plain::withoutKept(row.expected) : row.expected);
}

} // namespace

TEST(Unmarshal, BindsAttributesAndText) { plain::forAllKinds(values, run); }
TEST(Unmarshal, BindsChildElements) { plain::forAllKinds(elements, run); }
TEST(Unmarshal, FlattensObjects) { plain::forAllKinds(flattened, run); }
TEST(Unmarshal, BindsCollections) { plain::forAllKinds(collections, run); }
TEST(Unmarshal, BindsWholeObjects) { plain::forAllKinds(wholes, run); }
