// The marshaller itself: construction, options, what it asks of host objects, and its limits.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Dictionary.h>

#include <ctime>
#include <sstream>

namespace {

using qx::Error;
using qx::Ref;
using qx::Value;

// Writes down what the marshaller asks of it.
class Listener : public qx::Object {
public:
    static std::vector<std::string> heard;

    Value child;
    qx::String thrown() const { return {}; }
    int count = 0;
    void setThrown(const qx::String&) { throw std::runtime_error("no"); }
    void setClassName(const qx::String& name) { heard.push_back("class " + name.str()); }
    void setNotify(bool notify) { heard.push_back(notify ? "notify" : "quiet"); }
    void setUndoManager(qx::UndoManager* manager) {
        heard.push_back(manager != nullptr ? "undo manager" : "no undo manager");
    }
    qx::Object* rootObject() { return this; }
    void setParent(qx::Object* parent) {
        heard.push_back("parent " + parent->classNameForMarshalling().str());
    }
};
std::vector<std::string> Listener::heard;

const bool described = [] {
    qx::Class::define<Listener>("MarshallerTest.Listener")
        .property<&Listener::child>("child")
        .property<&Listener::count>("count")
        .property<&Listener::thrown, &Listener::setThrown>("thrown")
        .operation<&Listener::setClassName>("setClassNameForMarshalling:")
        .operation<&Listener::setNotify>("setNotifyBindingsObservers:")
        .operation<&Listener::setUndoManager>("setUndoManager:")
        .operation<&Listener::rootObject>("rootObject")
        .operation<&Listener::setParent>("setParent:");
    return true;
}();

// Elements called "item" become listeners, with those fields.
Ref<QXXMLMarshaller> listening(const std::string& fields) {
    Listener::heard.clear();
    return scenario::marshaller("<Item type='MarshallerTest.Listener'>" + fields + "</Item>");
}

} // namespace

TEST(Marshaller, IsLenientAndKeepsUnknownXMLAndNamespacesFromTheStart) {
    const auto marshaller = QXXMLMarshaller::initWithMapping(nullptr);
    EXPECT_TRUE(marshaller->isLenient() && marshaller->saveUnknownXML() &&
                marshaller->isUsingNamespaceURIs());
    EXPECT_EQ(marshaller->undoManager(), marshaller->undoManager());
}

TEST(Marshaller, HoldsNoClassWithoutAMapping) {
    const auto marshaller = QXXMLMarshaller::initWithMapping(nullptr);
    Ref<Error> error;
    const auto document = qx::XMLDocument::initWithData("<a/>");
    EXPECT_FALSE(marshaller->unmarshall(document, &error) || error);
    // Reading in one step tells of it even so.
    for (const bool lenient : {true, false}) {
        marshaller->setLenient(lenient);
        EXPECT_EQ(scenario::read(*marshaller, "<a/>"),
                  "-211: No definition to handle element: <a></a> (Invalid Mapping)");
    }
    EXPECT_FALSE(marshaller->unmarshall(nullptr, &error));
    EXPECT_EQ(scenario::told(error),
              "-211: No definition to handle element: (null) (Invalid Mapping)");
}

TEST(Marshaller, PassesTheParsersErrorOn) {
    Ref<Error> error;
    EXPECT_FALSE(QXXMLMarshaller::initWithMappingFile("/nowhere/mapping.xml", &error));
    EXPECT_EQ(error->code(), 260);
    error = nullptr;
    const auto marshaller = scenario::marshaller("<A/>");
    EXPECT_FALSE(marshaller->readString("<a>\n <b></a>", &error));
    EXPECT_EQ(error->domain(), Error::parserDomain);
    EXPECT_EQ(error->line(), 2U);
}

TEST(Marshaller, AsksHostObjectsOnlyWhatTheyAnswer) {
    EXPECT_TRUE(
        listening("<child type='Item' node='element'/>")->readString("<item><child/></item>"));
    const std::vector<std::string> made = {"class Item", "quiet", "undo manager"};
    auto all = made;
    all.insert(all.end(), made.begin(), made.end());
    all.insert(all.end(), {"notify", "parent MarshallerTest.Listener", "notify"});
    EXPECT_EQ(Listener::heard, all);
    // One that failed is never told to notify again.
    EXPECT_FALSE(listening("<count required='true' node='element'/>")->readString("<item/>"));
    EXPECT_EQ(Listener::heard, made);
}

TEST(Marshaller, ReportsValuesThatAPropertyDoesNotTake) {
    const auto marshaller =
        listening("<count node='attribute'/><missing name='m' node='attribute'/>");
    const std::pair<const char*, const char*> cases[] = {
        {"<item count='x'/>", "x for key: count"},
        {"<item count='99999999999'/>", "99999999999 for key: count"},
        {"<item m='1'/>", "1 for key: missing"},
    };
    for (const auto& [document, expected] : cases)
        EXPECT_EQ(scenario::read(*marshaller, document),
                  "-222: Unable to set value: " + std::string(expected) +
                      " in class: MarshallerTest.Listener (Invalid Value)");
    EXPECT_EQ(marshaller->readString("<item count=' 12 '/>")->valueForKey("count"), Value(12));
}

TEST(Marshaller, ReportsAnOwnerThatSetParentDoesNotTake) {
    struct Page : qx::Object {
        void setParent(QXGenericRecord*) {
            if (heard++ > 0)
                throw std::runtime_error("no");
        }
        int heard = 0;
        Value page;
    };
    qx::Class::define<Page>("Page").property<&Page::page>("page").operation<&Page::setParent>(
        "setParent:");
    const auto marshaller =
        scenario::marshaller("<Book><page node='element'/><last name='page' node='element'/></Book>"
                             "<Page><page node='element'/></Page>");
    EXPECT_TRUE(marshaller->readString("<book><page/></book>"));
    EXPECT_TRUE(scenario::read(*marshaller, "<book><page><page/></page></book>")
                    .ends_with("for key: parent in class: Page (Invalid Value)"));
    qx::Class::forget("Page");
}

TEST(Marshaller, WritesItemsThatChangeTheirListMeanwhile) {
    struct Leaver : QXGenericRecord {
        Ref<qx::Array> list;
        Value name() const {
            list->removeAll();
            return "gone";
        }
    };
    qx::Class::define<Leaver, QXGenericRecord>("Leaver").property<&Leaver::name>("name");
    const auto marshaller = scenario::marshaller(
        "<Order><lines collection='array'/></Order><Leaver><name node='attribute'/></Leaver>");
    const auto list = qx::make<qx::Array>();
    for (int i = 0; i < 3; ++i) {
        auto leaver = qx::make<Leaver>();
        leaver->list = list;
        list->add(leaver);
    }
    const auto order = qx::make<QXGenericRecord>();
    order->setClassNameForMarshalling("Order");
    order->setValueForKey(list, "lines");
    EXPECT_EQ(scenario::write(*marshaller, order),
              "<Order><Leaver name=\"gone\"></Leaver></Order>");
    qx::Class::forget("Leaver");
}

TEST(Marshaller, WritesNothingThatItCouldNotRead) {
    std::string fields;
    std::string document;
    for (int i = 0; i < 5000; ++i) {
        const std::string name = "f" + std::to_string(i);
        fields += "<" + name + "/>";
        document += "<" + name + ">1</" + name + ">";
    }
    const auto marshaller =
        scenario::marshaller("<Order>" + fields + "</Order><Note><text node='text'/></Note>");
    const auto note = marshaller->readString("<note>t</note>");
    note->setValueForKey("\x01", "text");
    const std::pair<Ref<qx::Object>, const char*> cases[] = {
        {note, "517: The text cannot be written: "},
        {marshaller->readString("<order>" + document + "</order>"),
         "517: The text cannot be written: an element has more attributes than the limit of 4096 "
         "at /Order ()"}};
    for (const auto& [object, expected] : cases) {
        ASSERT_TRUE(object);
        std::ostringstream out;
        Ref<Error> error;
        EXPECT_FALSE(marshaller->writeStream(object, out, &error) || !out.str().empty());
        EXPECT_TRUE(scenario::told(error).starts_with(expected)) << scenario::told(error);
        EXPECT_TRUE(marshaller->writeString(object).isNull());
    }
}

TEST(Marshaller, WritesVeryManyAttributesAndWrappersInLinearTime) {
    constexpr int count = 20'000;
    const auto object = qx::make<QXGenericRecord>();
    object->setClassNameForMarshalling("Order");
    std::string attributes;
    std::string wrapped;
    for (int i = 0; i < count; ++i) {
        const std::string name = "f" + std::to_string(i);
        const std::string field = "<" + name + " node='attribute' ";
        attributes += field + "/>";
        wrapped += field + "location='" + name + "'/>";
        wrapped += field + "name='again' location='" + name + "'/>";
        object->setValueForKey(i + 1, name.c_str());
    }
    auto kept = qx::make<qx::Dictionary>();
    kept->set("f7", qx::make<qx::Array>(std::vector<Value>{qx::XMLElement::initWithName("f7")}));
    object->setValueForKey(kept, "unboundChildren");
    const std::clock_t start = std::clock();
    const auto many = scenario::marshaller("<Order>" + attributes + "</Order>");
    EXPECT_EQ(many->marshallObject(object)->attributeValue("f19999"), "20000");
    EXPECT_TRUE(many->writeString(object).isNull()) << "more attributes than can be read";
    // The last child of a name is written into: the one that was kept, once it is there.
    const auto wrappers =
        scenario::marshaller("<Order extends='Base'><f7 node='attribute' location='f7'/></Order>"
                             "<Base>" +
                             wrapped + "</Base>");
    EXPECT_TRUE(wrappers->writeString(object).view().ends_with("<f7 f7=\"8\"></f7>\n</Order>\n"));
    const auto wrapping = wrappers->marshallObject(object);
    EXPECT_EQ(wrapping->childCount(), count + 1U);
    EXPECT_EQ(wrapping->firstChild()->XMLString(), R"(<f0 f0="1" again="1"></f0>)");
    EXPECT_EQ(wrapping->lastChild()->XMLString(), R"(<f7 f7="8"></f7>)");
    EXPECT_LT(std::clock() - start, 15 * CLOCKS_PER_SEC);
}

TEST(Marshaller, LetsWhatAHostsSetterThrowsThroughAndClosesItsUndoGroup) {
    const auto marshaller = listening("<thrown node='attribute'/>");
    EXPECT_THROW(marshaller->readString("<item thrown='t'/>"), std::runtime_error);
    EXPECT_EQ(marshaller->undoManager()->groupingLevel(), 0U);
}

TEST(Marshaller, SkipsFailedItemsOfACollectionForACallerWithoutASlot) {
    const auto marshaller =
        scenario::marshaller("<Order><lines collection='array' type='Line' name='line'/></Order>"
                             "<Line><text required='true' node='attribute'/></Line>",
                             scenario::discard);
    const auto order = marshaller->readString("<order><line/><line text='a'/></order>");
    EXPECT_EQ(support::show(order), R"(Order{lines: [Line{text: "a"}]})");
}

TEST(Marshaller, StopsForASlotThatHoldsAnErrorAlready) {
    const auto marshaller = scenario::marshaller("<A/>");
    Ref<Error> error = qx::make<Error>(Error::cocoaDomain, 7, "old", "old");
    EXPECT_FALSE(marshaller->unmarshallElement(qx::XMLElement::initWithName("a").get(), &error));
    EXPECT_EQ(error->code(), 7);
}

TEST(Marshaller, TakesSingleStepsForAHostThatCallsThem) {
    const auto marshaller = scenario::marshaller(
        "<Order><title name='t' node='attribute'/><note node='text'/>"
        "<word name='w' node='element'/><line type='Line' node='element'/>"
        "<lines type='Line' collection='array' name='l'/><items collection='array'/></Order>"
        "<Line/><Flat><word name='w' node='element'/><note node='text'/></Flat>");
    const QXXMLClassMapping& order = *marshaller->mapping()->mappingForClassName("Order");
    const auto& fields = order.fields();
    const auto document =
        qx::XMLDocument::initWithData("<o t='1'>x<w>1</w><w>2</w><line/><l/><l/></o>");
    qx::XMLElement& element = *document->rootElement();
    const auto names = qx::make<qx::CountedSet>(), attributes = qx::make<qx::CountedSet>();
    const auto record = marshaller->allocateClassWithMapping(order);
    EXPECT_TRUE(
        marshaller->bindFieldAsAttribute(*fields[0], *record, 0, element, *names, *attributes) &&
        marshaller->bindFieldAsText(*fields[1], *record, 0, element, *names, *attributes) &&
        marshaller->bindFieldAsElement(*fields[2], *record, 0, element, *names, *attributes,
                                       true) &&
        marshaller->bindField(*fields[3], *record, 0, element, *names, *attributes, false) &&
        marshaller->bindArrayFieldByType(*fields[4], *record, element, *names, *attributes) &&
        marshaller->bindCollectionField(*fields[5], *record, element, *names, *attributes));
    EXPECT_EQ(support::show(record),
              "Order{items: [Line{}], line: Line{}, "
              "lines: [Line{}, Line{}], note: \"x12\", title: \"1\", word: \"1\"}");
    EXPECT_EQ(names->description(), "(w [1], line [2], l [2])");
    EXPECT_EQ(attributes->description(), "(t [1])");
    // Flattened: the first of several was taken out of the element.
    EXPECT_EQ(element.XMLString(), R"(<o t="1">x<w>2</w><line></line><l></l><l></l></o>)");
    EXPECT_FALSE(marshaller->buildClassWithMapping(order, nullptr, false));
    // What one field took, another does not find.
    const QXXMLClassMapping& flat = *marshaller->mapping()->mappingForClassName("Flat");
    EXPECT_EQ(support::show(marshaller->buildClassWithMapping(
                  flat, support::parsed("<o>x<w>1</w><w>2</w></o>")->rootElement(), true)),
              "Flat{note: \"x2\", word: \"1\"}");
    // Whatever the options, the counts are the caller's and stay.
    marshaller->setSaveUnknownXML(false);
    EXPECT_TRUE(
        marshaller->bindFieldsWithMapping(order, *record, element, *names, *attributes, false));
    marshaller->setLenient(false);
    EXPECT_TRUE(marshaller->validateBoundFields(*names, *attributes, element, *record));
    EXPECT_EQ(names->description(), "(w [2], line [4], l [4])");

    const auto written = qx::XMLElement::initWithName("w");
    EXPECT_TRUE(
        marshaller->mapField(*fields[0], *written, *record) &&
        marshaller->mapArray(*record->valueForKey("lines").as<qx::Array>(), *written, *fields[4]));
    EXPECT_EQ(written->XMLString(), "<w t=\"1\"><l></l><l></l></w>");
    const QXXMLClassMapping& line = *marshaller->mapping()->mappingForClassName("Line");
    EXPECT_TRUE(marshaller->bindFieldMappings(line, *written, *record));
    const auto copy = line.copyWithZone().as<QXXMLClassMapping>();
    copy->setMapTo("other");
    EXPECT_EQ(marshaller->elementWithMapping(*copy, *record)->XMLString(), "<other></other>");
    EXPECT_TRUE(TakeValueForKey(*record, "number", "7", *fields[0]));
    EXPECT_EQ(StringValueOfObjectWithMapping(record->valueForKey("number"), *fields[0]), "7");
}

TEST(Marshaller, EndsDeepNestingInAnErrorInBothDirections) {
    const auto marshaller = scenario::marshaller("<Node xml='node'><node node='element'/></Node>");
    const auto read = [&](std::size_t depth) {
        return marshaller->readString(scenario::nested("node", depth));
    };
    constexpr std::size_t highest = QXXMLMarshaller::highestMaximumDepth;
    EXPECT_TRUE(read(256));
    Ref<Error> error;
    EXPECT_FALSE(marshaller->readString(scenario::nested("node", 600), &error));
    EXPECT_EQ(error->domain(), Error::parserDomain);
    // As deep as it goes: whatever a host asks for, the stack suffices.
    marshaller->setMaximumDepth(1'000'000);
    EXPECT_FALSE(marshaller->writeString(read(highest)).isNull());
    EXPECT_FALSE(read(highest + 1));
    marshaller->setMaximumDepth(1000);
    const auto deep = read(1000);
    ASSERT_TRUE(deep);
    EXPECT_TRUE(marshaller->readString(marshaller->writeString(deep)));
    marshaller->setMaximumDepth(999);
    const char* tooDeep = "-223: Objects nest deeper than the limit of 999: Node (Invalid Value)";
    EXPECT_EQ(scenario::write(*marshaller, deep), tooDeep);
    qx::XMLParseOptions options;
    options.maximumDepth = 1000;
    const auto source = qx::XMLDocument::initWithData(scenario::nested("node", 1000), options);
    error = nullptr;
    EXPECT_FALSE(marshaller->unmarshall(source, &error));
    EXPECT_EQ(scenario::told(error), tooDeep);
}

TEST(Marshaller, FindsManyNamesAmongManyChildrenInAnIndex) {
    std::string fields;
    std::string document = "<order>";
    std::string expected;
    for (int i = 0; i < 100; ++i) {
        const std::string name = "f" + std::to_string(100 + i);
        fields += "<" + name + " node='element'/>";
        document += "<x/><" + name + ">" + std::to_string(i) + "</" + name + ">";
        expected += (i > 0 ? ", " : "") + name + ": \"" + std::to_string(i) + "\"";
    }
    const auto marshaller =
        scenario::marshaller("<Order>" + fields + "</Order>", scenario::discard);
    EXPECT_EQ(scenario::read(*marshaller, document + "</order>"), "Order{" + expected + "}");
}

TEST(Marshaller, ReadsAndWritesStreams) {
    const auto marshaller =
        scenario::marshaller("<Order xml='order'><title node='element'/></Order>");
    std::istringstream in("<order><title>t</title></order>");
    const auto order = marshaller->readStream(in);
    std::ostringstream out;
    EXPECT_TRUE(marshaller->writeStream(order, out));
    EXPECT_EQ(out.str(), "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
                         "<order>\n    <title>t</title>\n</order>\n");
    out.setstate(std::ios::badbit);
    Ref<Error> error;
    EXPECT_FALSE(marshaller->writeStream(order, out, &error));
    EXPECT_TRUE(error);
}
