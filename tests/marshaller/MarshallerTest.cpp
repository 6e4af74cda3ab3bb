// The marshaller itself: construction, options, what it asks of host objects, and its limits.

#include "Host.h"
#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/base/Exception.h>
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
    qx::String title;
    int count = 0;
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

class Listening {
public:
    Listening() {
        Listener::heard.clear();
        qx::Class::define<Listener>("Listener")
            .property<&Listener::child>("child")
            .property<&Listener::title>("title")
            .property<&Listener::count>("count")
            .operation<&Listener::setClassName>("setClassNameForMarshalling:")
            .operation<&Listener::setNotify>("setNotifyBindingsObservers:")
            .operation<&Listener::setUndoManager>("setUndoManager:")
            .operation<&Listener::rootObject>("rootObject")
            .operation<&Listener::setParent>("setParent:");
    }
    ~Listening() { qx::Class::forget("Listener"); }
    Listening(const Listening&) = delete;
    Listening& operator=(const Listening&) = delete;
};

std::string field(std::string_view name, std::string_view attributes, std::string_view binding) {
    return "<field name='" + std::string(name) + "' " + std::string(attributes) + "><bind-xml " +
           std::string(binding) + "/></field>";
}

// One class of elements called "item", with those fields.
std::string listenerMapping(const std::string& fields) {
    return "<class name='Item' type='Listener'>" + fields + "</class>";
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
    EXPECT_EQ(scenario::show(error),
              "-211: No definition to handle element: (null) (Invalid Mapping)");
}

TEST(Marshaller, PassesTheParsersErrorOn) {
    Ref<Error> error;
    EXPECT_FALSE(QXXMLMarshaller::initWithMappingFile("/nowhere/mapping.xml", &error));
    EXPECT_EQ(error->code(), 260);
    error = nullptr;
    const auto marshaller = scenario::marshaller("<class name='A'/>");
    EXPECT_FALSE(marshaller->readString("<a>\n <b></a>", &error));
    EXPECT_EQ(error->domain(), Error::parserDomain);
    EXPECT_EQ(error->line(), 2U);
}

TEST(Marshaller, AsksHostObjectsOnlyWhatTheyAnswer) {
    const Listening listening;
    const auto marshaller =
        scenario::marshaller(listenerMapping(field("child", "type='Item'", "node='element'")));
    const auto object = marshaller->readString("<item><child/></item>");
    ASSERT_TRUE(object);
    EXPECT_EQ(Listener::heard, (std::vector<std::string>{"class Item", "quiet", "undo manager",
                                                         "class Item", "quiet", "undo manager",
                                                         "notify", "parent Listener", "notify"}));
}

TEST(Marshaller, NeverTellsAnObjectThatFailedToNotifyAgain) {
    const Listening listening;
    const auto marshaller =
        scenario::marshaller(listenerMapping(field("title", "required='true'", "node='element'")));
    EXPECT_FALSE(marshaller->readString("<item/>"));
    EXPECT_EQ(Listener::heard.back(), "undo manager");
}

TEST(Marshaller, ReportsValuesThatAPropertyDoesNotTake) {
    const Listening listening;
    const auto marshaller =
        scenario::marshaller(listenerMapping(field("count", "", "node='attribute'") +
                                             field("missing", "", "name='m' node='attribute'")));
    const std::pair<const char*, const char*> cases[] = {
        {"<item count='x'/>", "-222: Unable to set value: x for key: count in class: Listener "
                              "(Invalid Value)"},
        {"<item count='99999999999'/>", "-222: Unable to set value: 99999999999 for key: count in "
                                        "class: Listener (Invalid Value)"},
        {"<item m='1'/>",
         "-222: Unable to set value: 1 for key: missing in class: Listener (Invalid Value)"},
    };
    for (const auto& [document, expected] : cases)
        EXPECT_EQ(scenario::read(*marshaller, document), expected);
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
    const auto marshaller = scenario::marshaller(
        "<class name='Book'>" + field("page", "", "node='element'") +
        field("last", "", "node='element' name='page'") + "</class>" + "<class name='Page'>" +
        field("page", "", "node='element'") + "</class>");
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
        "<class name='Order'>" + field("lines", "collection='array'", "") + "</class>" +
        "<class name='Leaver'>" + field("name", "", "node='attribute'") + "</class>");
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

TEST(Marshaller, MakesRecordsInPlaceOfAClassThatNeedsArguments) {
    struct Point : qx::Object {
        explicit Point(int) {}
    };
    qx::Class::define<Point>("Point");
    const auto marshaller = scenario::marshaller("<class name='Point'/>");
    testing::internal::CaptureStderr();
    const auto point = marshaller->readString("<point/>");
    EXPECT_TRUE(point.as<QXGenericRecord>());
    EXPECT_NE(testing::internal::GetCapturedStderr().find("Class Point cannot be made"),
              std::string::npos);
    qx::Class::forget("Point");
}

TEST(Marshaller, ReportsTextThatNoDocumentCanHold) {
    const auto marshaller = scenario::marshaller("<class name='Order'>" +
                                                 field("title", "", "node='text'") + "</class>");
    const auto order = marshaller->readString("<order>t</order>");
    order->setValueForKey("\x01", "title");
    Ref<Error> error;
    EXPECT_TRUE(marshaller->writeString(order, &error).isNull());
    EXPECT_EQ(error->code(), 517);
    std::ostringstream out;
    EXPECT_FALSE(marshaller->writeStream(order, out) || !out.str().empty());
}

TEST(Marshaller, WritesNothingThatItCouldNotRead) {
    std::string fields;
    std::string document = "<order>";
    for (int i = 0; i < 5000; ++i) {
        const std::string name = "f" + std::to_string(i);
        fields += field(name, "", "name='" + name + "'");
        document += "<" + name + ">1</" + name + ">";
    }
    const auto marshaller = scenario::marshaller("<class name='Order'>" + fields +
                                                 field("note", "", "node='text'") + "</class>");
    const auto order = marshaller->readString(document + "</order>");
    ASSERT_TRUE(order);
    std::ostringstream out;
    Ref<Error> error;
    EXPECT_FALSE(marshaller->writeStream(order, out, &error) || !out.str().empty());
    EXPECT_EQ(scenario::show(error), "517: The text cannot be written: an element has more "
                                     "attributes than the limit of 4096 at /Order ()");
    // With the limits of its own depth.
    const auto nested =
        scenario::marshaller("<class name='A'><map-to xml='A'/>" +
                             field("a", "", "node='element' name='A'") + "</class>");
    nested->setMaximumDepth(1000);
    Ref<qx::Object> inner;
    for (int i = 0; i < 1000; ++i) {
        auto outer = qx::make<QXGenericRecord>();
        outer->setClassNameForMarshalling("A");
        if (inner)
            outer->setValueForKey(inner, "a");
        inner = outer;
    }
    EXPECT_TRUE(nested->readString(nested->writeString(inner)));
}

TEST(Marshaller, WritesVeryManyAttributesAndWrappersInLinearTime) {
    constexpr int count = 20'000;
    const auto object = qx::make<QXGenericRecord>();
    object->setClassNameForMarshalling("Order");
    std::string attributes;
    std::string wrapped;
    for (int i = 0; i < count; ++i) {
        const std::string name = "f" + std::to_string(i);
        attributes += field(name, "", "node='attribute'");
        wrapped += field(name, "", "node='attribute' location='" + name + "'");
        wrapped += field(name, "", "node='attribute' name='again' location='" + name + "'");
        object->setValueForKey(i + 1, name.c_str());
    }
    auto kept = qx::make<qx::Dictionary>();
    kept->set("f7", qx::make<qx::Array>(
                        std::initializer_list<Value>{qx::XMLElement::initWithName("f7")}));
    object->setValueForKey(kept, "unboundChildren");
    const std::clock_t start = std::clock();
    const auto many = scenario::marshaller("<class name='Order'>" + attributes + "</class>");
    const auto element = many->marshallObject(object);
    EXPECT_EQ(element->attributeValue("f19999"), "20000");
    // The last child of a name is written into: the one that was kept, once it is there.
    const auto wrappers = scenario::marshaller(
        "<class name='Order' extends='Base'>" + field("f7", "", "node='attribute' location='f7'") +
        "</class><class name='Base'>" + wrapped + "</class>");
    const auto wrapping = wrappers->marshallObject(object);
    EXPECT_EQ(wrapping->childCount(), count + 1U);
    EXPECT_EQ(wrapping->firstChild()->XMLString(), R"(<f0 f0="1" again="1"></f0>)");
    EXPECT_EQ(wrapping->lastChild()->XMLString(), R"(<f7 f7="8"></f7>)");
    EXPECT_LT(std::clock() - start, 15 * CLOCKS_PER_SEC);
}

TEST(Marshaller, LetsWhatAHostsSetterThrowsThroughAndClosesItsUndoGroup) {
    struct Thrower : qx::Object {
        void setTitle(const qx::String&) { throw std::runtime_error("no"); }
        qx::String title() const { return {}; }
    };
    qx::Class::define<Thrower>("Thrower").property<&Thrower::title, &Thrower::setTitle>("title");
    const auto marshaller = scenario::marshaller(
        "<class name='Thrower'>" + field("title", "", "node='attribute'") + "</class>");
    EXPECT_THROW(marshaller->readString("<thrower title='t'/>"), std::runtime_error);
    EXPECT_EQ(marshaller->undoManager()->groupingLevel(), 0U);
    qx::Class::forget("Thrower");
}

TEST(Marshaller, SkipsFailedItemsOfACollectionForACallerWithoutASlot) {
    const auto marshaller = scenario::marshaller(
        "<class name='Order'>" + field("lines", "collection='array' type='Line'", "name='line'") +
            "</class><class name='Line'>" + field("text", "required='true'", "node='attribute'") +
            "</class>",
        scenario::discard);
    const auto order = marshaller->readString("<order><line/><line text='a'/></order>");
    EXPECT_EQ(support::show(order), R"(Order{lines: [Line{text: "a"}]})");
}

TEST(Marshaller, StopsForASlotThatHoldsAnErrorAlready) {
    const auto marshaller = scenario::marshaller("<class name='A'/>");
    Ref<Error> error = qx::make<Error>(Error::cocoaDomain, 7, "old", "old");
    EXPECT_FALSE(marshaller->unmarshallElement(qx::XMLElement::initWithName("a").get(), &error));
    EXPECT_EQ(error->code(), 7);
}

TEST(Marshaller, BindsSingleStepsForAHostThatCallsThem) {
    const auto marshaller = scenario::marshaller(
        "<class name='Order'>" + field("title", "", "name='t' node='element'") + "</class>");
    const QXXMLClassMapping& mapping = *marshaller->mapping()->mappingForClassName("Order");
    const auto element = qx::XMLDocument::initWithData("<x><t>1</t><t>2</t></x>");
    const auto fields = qx::make<qx::CountedSet>();
    const auto attributes = qx::make<qx::CountedSet>();
    const auto record = marshaller->allocateClassWithMapping(mapping);
    // Flattened: the first of several is taken out of the element.
    EXPECT_TRUE(marshaller->bindFieldAsElement(
        *mapping.fields()[0], *record, 0, *element->rootElement(), *fields, *attributes, true));
    EXPECT_EQ(record->valueForKey("title"), Value("1"));
    EXPECT_EQ(element->rootElement()->XMLString(), "<x><t>2</t></x>");
    EXPECT_EQ(fields->description(), "(t [1])");
    EXPECT_FALSE(marshaller->buildClassWithMapping(mapping, nullptr, false));
    // Whatever the options, the counts are the caller's and stay.
    marshaller->setSaveUnknownXML(false);
    EXPECT_TRUE(marshaller->bindFieldsWithMapping(mapping, *record, *element->rootElement(),
                                                  *fields, *attributes, false));
    marshaller->setLenient(false);
    EXPECT_TRUE(
        marshaller->validateBoundFields(*fields, *attributes, *element->rootElement(), *record));
    EXPECT_EQ(fields->description(), "(t [2])");

    auto copy = mapping.copyWithZone().as<QXXMLClassMapping>();
    copy->setMapTo("other");
    EXPECT_EQ(marshaller->elementWithMapping(*copy, *record)->XMLString(),
              "<other><t>2</t></other>");
}

TEST(Marshaller, ReadsAndWritesOneFieldAtATime) {
    const auto marshaller = scenario::marshaller(
        "<class name='Order'>" + field("title", "", "name='t' node='attribute'") +
        field("note", "", "node='text'") + field("line", "type='Line'", "node='element'") +
        field("lines", "type='Line' collection='array'", "name='l'") +
        field("items", "collection='array'", "") + "</class><class name='Line'/>");
    const auto& fields = marshaller->mapping()->mappingForClassName("Order")->fields();
    const auto document = qx::XMLDocument::initWithData("<o t='1'>x<line/><l/><l/></o>");
    qx::XMLElement& element = *document->rootElement();
    const auto record = qx::make<QXGenericRecord>();
    const auto names = qx::make<qx::CountedSet>();
    const auto attributes = qx::make<qx::CountedSet>();
    Ref<Error> error;
    EXPECT_TRUE(marshaller->bindFieldAsAttribute(*fields[0], *record, 0, element, *names,
                                                 *attributes, &error));
    EXPECT_TRUE(
        marshaller->bindFieldAsText(*fields[1], *record, 0, element, *names, *attributes, &error));
    EXPECT_TRUE(
        marshaller->bindField(*fields[2], *record, 0, element, *names, *attributes, false, &error));
    EXPECT_TRUE(marshaller->bindArrayFieldByType(*fields[3], *record, element, *names, *attributes,
                                                 &error));
    EXPECT_TRUE(
        marshaller->bindCollectionField(*fields[4], *record, element, *names, *attributes, &error));
    EXPECT_FALSE(error);
    EXPECT_EQ(support::show(record),
              "QXGenericRecord{items: [Line{}], line: Line{}, lines: [Line{}, Line{}], "
              "note: \"x\", title: \"1\"}");
    EXPECT_EQ(names->description(), "(line [2], l [2])");
    EXPECT_EQ(attributes->description(), "(t [1])");

    const auto written = qx::XMLElement::initWithName("w");
    EXPECT_TRUE(marshaller->mapField(*fields[0], *written, *record, &error));
    EXPECT_TRUE(marshaller->mapArray(*record->valueForKey("lines").as<qx::Array>(), *written,
                                     *fields[3], &error));
    EXPECT_EQ(written->XMLString(), "<w t=\"1\"><l></l><l></l></w>");
    EXPECT_TRUE(marshaller->bindFieldMappings(*marshaller->mapping()->mappingForClassName("Line"),
                                              *written, *record, &error));
    EXPECT_TRUE(TakeValueForKey(*record, "number", "7", *fields[0], &error));
    EXPECT_EQ(StringValueOfObjectWithMapping(record->valueForKey("number"), *fields[0]), "7");
    EXPECT_FALSE(error);
}

TEST(Marshaller, EndsDeepNestingInAnErrorInBothDirections) {
    const auto marshaller = scenario::marshaller("<class name='Node'>" +
                                                 field("node", "", "node='element'") + "</class>");
    const auto nested = [](std::size_t depth) {
        std::string xml;
        for (std::size_t i = 0; i < depth; ++i)
            xml += "<node>";
        for (std::size_t i = 0; i < depth; ++i)
            xml += "</node>";
        return xml;
    };
    EXPECT_TRUE(marshaller->readString(nested(256)));
    Ref<Error> error;
    EXPECT_FALSE(marshaller->readString(nested(600), &error));
    EXPECT_EQ(error->domain(), Error::parserDomain);
    // As deep as it goes: whatever a host asks for, the stack suffices.
    marshaller->setMaximumDepth(1'000'000);
    const auto deepest = marshaller->readString(nested(QXXMLMarshaller::highestMaximumDepth));
    EXPECT_FALSE(marshaller->writeString(deepest).isNull());
    EXPECT_FALSE(marshaller->readString(nested(QXXMLMarshaller::highestMaximumDepth + 1)));
    marshaller->setMaximumDepth(1000);
    const auto deep = marshaller->readString(nested(1000));
    ASSERT_TRUE(deep);
    EXPECT_FALSE(marshaller->writeString(deep).isNull());
    marshaller->setMaximumDepth(999);
    EXPECT_EQ(scenario::write(*marshaller, deep),
              "-223: Objects nest deeper than the limit of 999: Node (Invalid Value)");
    qx::XMLParseOptions options;
    options.maximumDepth = 1000;
    error = nullptr;
    EXPECT_FALSE(
        marshaller->unmarshall(qx::XMLDocument::initWithData(nested(1000), options), &error));
    EXPECT_EQ(scenario::show(error),
              "-223: Objects nest deeper than the limit of 999: Node (Invalid Value)");
}

TEST(Marshaller, FindsManyNamesAmongManyChildrenInAnIndex) {
    std::string fields;
    std::string document = "<order>";
    std::string expected;
    for (int i = 0; i < 100; ++i) {
        const std::string name = "f" + std::to_string(100 + i);
        fields += field(name, "", "node='element'");
        document += "<x/><" + name + ">" + std::to_string(i) + "</" + name + ">";
        expected += (i > 0 ? ", " : "") + name + ": \"" + std::to_string(i) + "\"";
    }
    const auto marshaller =
        scenario::marshaller("<class name='Order'>" + fields + "</class>", scenario::discard);
    EXPECT_EQ(scenario::read(*marshaller, document + "</order>"), "Order{" + expected + "}");
}

TEST(Marshaller, ReadsAndWritesStreams) {
    const auto marshaller = scenario::marshaller("<class name='Order'><map-to xml='order'/>" +
                                                 field("title", "", "node='element'") + "</class>");
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
