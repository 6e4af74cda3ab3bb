// The samples of docs/host-classes.md, between "// sample: NAME" and "// end of sample", and what
// the page says of them. tests/docs/SamplesTest.cpp compares them with the page.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/QXMappedObject.h>
#include <QXXMLMarshalling/model/DateTime.h>
#include <QXXMLMarshalling/undo/UndoableObject.h>

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <sstream>

namespace {

// sample: point
enum class Kind { peak, hut };

struct Point {
    double lat = 0, lon = 0;
    std::optional<double> elevation;
    Kind kind = Kind::peak;
};
struct Tour {
    std::string name;
    Point start;
    std::vector<Point> stops;
};

void describeTour() {
    qx::Class::define<Point>("Point")
        .members<&Point::lat, &Point::lon, &Point::elevation>()
        .member<&Point::kind>("type")
        .names({{Kind::peak, "peak"}, {Kind::hut, "hut"}});
    qx::Class::define<Tour>("Tour").members<&Tour::name, &Tour::start, &Tour::stops>();
}
// end of sample

constexpr const char* tourMapping =
    "<class name='Tour'><map-to xml='tour'/>"
    "<field name='name'><bind-xml node='attribute'/></field>"
    "<field name='start' type='Point'><bind-xml node='element'/></field>"
    "<field name='stops' type='Point' collection='array'><bind-xml name='stop'/></field></class>"
    "<class name='Point'><map-to xml='point'/>"
    "<field name='lat'><bind-xml node='attribute'/></field>"
    "<field name='lon'><bind-xml node='attribute'/></field>"
    "<field name='elevation'><bind-xml name='ele' node='attribute'/></field>"
    "<field name='type'><bind-xml node='attribute'/></field></class>";

bool addStop(QXXMLMarshaller* marshaller, const std::string& path) {
    // sample: tour
    auto tour = marshaller->readFile<Tour>(path);
    if (!tour) {
        std::cerr << tour.error()->localizedDescription().view() << '\n';
        return false;
    }
    tour->stops.push_back({.lat = 0, .lon = -0.1276, .elevation = 0});
    return marshaller->writeFile(*tour, path);
    // end of sample
}

// sample: report
void show(const qx::Error& error, std::ostream& to) {
    for (const auto& each : error.all())
        to << each->report().view() << '\n';
}

void openTour(QXXMLMarshaller& marshaller, const char* path, std::ostream& messages) {
    marshaller.setMaximumErrors(20);
    if (const auto tour = marshaller.readFile<Tour>(path); !tour)
        show(*tour.error(), messages);
}
// end of sample

// sample: unknown
void listUnknown(QXXMLMarshaller& marshaller, std::vector<std::string>& names) {
    marshaller.setReportHandler([&names](const QXXMLReport& report) {
        if (report.kind == QXXMLReport::Kind::unboundChild)
            names.push_back(report.name.str() + " in line " + std::to_string(report.place().line));
    });
}
// end of sample

// sample: shapes
struct Shape {
    virtual ~Shape() = default;
    std::string colour;
};
struct Circle : Shape {
    double radius = 0;
};
struct Drawing {
    std::vector<std::unique_ptr<Shape>> shapes;
    std::variant<std::monostate, Point, Tour> place;
};

void describeDrawing() {
    qx::Class::define<Shape>("Shape").members<&Shape::colour>();
    qx::Class::define<Circle, Shape>("Circle").members<&Circle::radius>();
    qx::Class::define<Drawing>("Drawing").members<&Drawing::shapes, &Drawing::place>();
}
// end of sample

// sample: parcel
struct Parcel {
    double weight = 0;
    QXUnknownXML unknown;
};

void describeParcel() {
    qx::Class::define<Parcel>("Parcel").members<&Parcel::weight, &Parcel::unknown>();
}
// end of sample

// sample: product
class Product : public qx::Object {
public:
    std::string name;
    int stock = 0;
};

void describeProduct() {
    qx::Class::define<Product>("Product")
        .property<&Product::name>("name")
        .property<&Product::stock>("stock");
}
// end of sample

constexpr const char* productMapping =
    "<class name='Product'><map-to xml='product'/>"
    "<field name='name' required='true'><bind-xml name='name' node='attribute'/></field>"
    "<field name='stock' type='int'><bind-xml name='stock' node='attribute'/></field></class>";

// sample: properties
class Invoice : public qx::Object {
public:
    const std::string& number() const { return _number; }
    void setNumber(const std::string& number) { _number = number; }
    double net() const { return _net; }
    double net(double rate) const { return _net * rate; }
    void net(double net) { _net = net; }
    double gross() const { return net(1.2); }

    std::optional<int> daysToPay;
    const std::string currency = "EUR";

private:
    std::string _number;
    double _net = 0;
};

void describeInvoice() {
    qx::Class::define<Invoice>("Invoice")
        .property<&Invoice::daysToPay>("daysToPay")
        .property<&Invoice::number, &Invoice::setNumber>("number")
        .property<double>("net", &Invoice::net, &Invoice::net)
        .property<&Invoice::gross>("gross")
        .property<&Invoice::currency>("currency");
}
// end of sample

} // namespace

// sample: enumeration
enum class Fix { none, flat, full };

template <>
struct qx::EnumNames<Fix> {
    static constexpr auto table = std::to_array<qx::EnumName<Fix>>(
        {{Fix::none, "none"}, {Fix::flat, "2d"}, {Fix::full, "3d"}});
};
// end of sample

namespace {

// sample: waypoint
class Waypoint : public qx::Object {
public:
    Fix fix = Fix::none;
    std::chrono::sys_seconds time{};
};

void describeWaypoint() {
    qx::Class::define<Waypoint>("Waypoint")
        .property<&Waypoint::fix>("fix")
        .property<&Waypoint::time>("time");
}
// end of sample

} // namespace

// sample: date
struct Date {
    int year = 0, month = 0, day = 0;
};

template <>
struct qx::ValueTraits<Date> {
    static Value toValue(const Date& date) {
        char text[32];
        std::snprintf(text, sizeof text, "%04d-%02d-%02d", date.year, date.month, date.day);
        return text;
    }
    static bool fromValue(const Value& value, Date& date) {
        Date read;
        int length = 0;
        const qx::String text = value.string();
        if (std::sscanf(text.c_str(), "%4d-%2d-%2d%n", &read.year, &read.month, &read.day,
                        &length) != 3 ||
            static_cast<std::size_t>(length) != text.size())
            return false;
        date = read;
        return true;
    }
};
// end of sample

namespace {

class Delivery : public qx::Object {
public:
    Date day;
};

// sample: basket
class Basket;

class Fruit : public QXMappedObject {
public:
    void setParent(Basket* basket) { _basket = basket; }
    Basket* basket() const { return _basket; }

    std::string kind;

private:
    Basket* _basket = nullptr; // owns this one
};

class Basket : public QXMappedObject {
public:
    qx::Ref<Fruit> best;
    std::vector<qx::Ref<Fruit>> fruits;
};

void describeBasket() {
    qx::Class::define<Fruit, QXMappedObject>("Fruit")
        .members<&Fruit::kind>()
        .operation<&Fruit::setParent>("setParent:");
    qx::Class::define<Basket, QXMappedObject>("Basket").members<&Basket::best, &Basket::fruits>();
}
// end of sample

constexpr const char* basketMapping =
    "<class name='Basket'><map-to xml='basket'/>"
    "<field name='best' type='Fruit'><bind-xml name='best' node='element'/></field>"
    "<field name='fruits' type='Fruit' collection='array'><bind-xml name='fruit'/></field></class>"
    "<class name='Fruit'>"
    "<field name='kind'><bind-xml name='kind' node='attribute'/></field></class>";

// sample: task
class Task : public QXGenericRecord {
public:
    int minutes = 0;
};

void describeTask() {
    qx::Class::define<Task, QXGenericRecord>("Task").property<&Task::minutes>("minutes");
}
// end of sample

// sample: note
class Note : public qx::UndoableObject {
public:
    // Only asked for: an object that answers takes the marshaller's undo manager.
    Note* rootObject() { return this; }

    std::string text;
    QXUnknownXML unknown;
};

void describeNote() {
    qx::Class::define<Note, qx::UndoableObject>("Note")
        .members<&Note::text, &Note::unknown>()
        .operation<&Note::rootObject>("rootObject")
        .operation<&Note::setUndoManager>("setUndoManager:");
}
// end of sample

// Cannot be made without being told what for.
class Ticket : public QXMappedObject {
public:
    explicit Ticket(std::string_view what) : purpose(what) {}
    std::string purpose;
};

class HostClasses : public testing::Test {
protected:
    void TearDown() override {
        for (const char* name :
             {"Product", "Invoice", "Delivery", "Fruit", "Basket", "Task", "Note", "Ticket",
              "Waypoint", "Point", "Tour", "Shape", "Circle", "Drawing", "Parcel"})
            qx::Class::forget(name);
    }
};

} // namespace

TEST_F(HostClasses, AreFilledByTheirProperties) {
    describeProduct();
    const auto marshaller = scenario::marshaller(productMapping);
    const auto product = marshaller->readString("<product name='Pen' stock='7'/>").as<Product>();
    ASSERT_TRUE(product);
    EXPECT_EQ(product->name, "Pen");
    EXPECT_EQ(product->stock, 7);
    // sample: forget
    qx::Class::forget("Product");
    // end of sample
    EXPECT_TRUE(marshaller->readString("<product name='Pen'/>").as<QXGenericRecord>());
}

TEST_F(HostClasses, MayBePlainStructs) {
    describeTour();
    const auto marshaller = scenario::marshaller(tourMapping);
    const std::string path = std::filesystem::temp_directory_path() / "host-classes-tour.xml";
    Tour tour;
    tour.name = "t";
    tour.start.kind = Kind::hut;
    ASSERT_TRUE(marshaller->writeFile(tour, path));
    EXPECT_TRUE(addStop(marshaller.get(), path));
    EXPECT_EQ(scenario::write(*marshaller, marshaller->readFile(path)),
              R"(<tour name="t"><start lat="0" lon="0" type="hut"></start>)"
              R"(<stop lat="0" lon="-0.1276" ele="0" type="peak"></stop></tour>)");
    std::filesystem::remove(path);
    testing::internal::CaptureStderr();
    EXPECT_FALSE(addStop(marshaller.get(), path));
    EXPECT_NE(testing::internal::GetCapturedStderr(), "");
}

TEST_F(HostClasses, HoldStructsOfDerivedClassesAndOneOfSeveral) {
    describeTour();
    describeDrawing();
    const auto marshaller = scenario::marshaller(
        std::string(tourMapping) +
        "<class name='Drawing'><map-to xml='drawing'/>"
        "<field name='shapes' collection='array'><bind-xml name='shapes'/></field>"
        "<field name='place'><bind-xml name='point' node='element'/><alt-xml name='tour'/></field>"
        "</class><class name='Shape'><map-to xml='shape'/>"
        "<field name='colour'><bind-xml node='attribute'/></field></class>"
        "<class name='Circle' extends='Shape'><map-to xml='circle'/>"
        "<field name='radius'><bind-xml node='attribute'/></field></class>");
    const std::string document = R"(<drawing><shapes><circle colour="red" radius="2"></circle>)"
                                 R"(<shape colour=""></shape></shapes><tour name="t">)"
                                 R"(<start lat="0" lon="0" type="peak"></start></tour></drawing>)";
    const auto drawing = marshaller->readString<Drawing>(document);
    ASSERT_TRUE(drawing);
    EXPECT_EQ(std::get<Tour>(drawing->place).name, "t");
    EXPECT_EQ(marshaller->marshall(*drawing)->rootElement()->XMLString().view(), document);
}

TEST_F(HostClasses, KeepUnknownXMLInAMember) {
    describeParcel();
    describeProduct();
    const auto marshaller = scenario::marshaller(
        std::string(productMapping) +
        "<class name='Parcel'><field name='weight'><bind-xml node='attribute'/></field></class>");
    const auto parcel = marshaller->readString<Parcel>("<parcel weight='2' a='1'><b/></parcel>");
    ASSERT_TRUE(parcel);
    EXPECT_EQ(marshaller->marshall(*parcel)->rootElement()->XMLString(),
              R"(<Parcel weight="2" a="1"><b></b></Parcel>)");
    const auto product = marshaller->readString("<product name='Pen' a='1'/>");
    EXPECT_EQ(scenario::write(*marshaller, product), R"(<product name="Pen"></product>)");
}

TEST_F(HostClasses, HavePropertiesOfFourKinds) {
    describeInvoice();
    const auto invoice = qx::make<Invoice>();
    invoice->setValueForKey("A-17", "number");
    invoice->setValueForKey(100, "net");
    invoice->setValueForKey("14", "daysToPay");
    EXPECT_EQ(invoice->number(), "A-17");
    EXPECT_EQ(invoice->daysToPay, 14);
    invoice->setValueForKey(nullptr, "daysToPay");
    EXPECT_FALSE(invoice->daysToPay);
    EXPECT_DOUBLE_EQ(invoice->valueForKey("gross").doubleValue(), 120);
    EXPECT_EQ(invoice->trySetValueForKey(1, "gross"), qx::SetOutcome::refused);
    EXPECT_EQ(invoice->trySetValueForKey("USD", "currency"), qx::SetOutcome::refused);
    EXPECT_EQ(invoice->trySetValueForKey(1, "tax"), qx::SetOutcome::unknownKey);
}

TEST_F(HostClasses, HaveNamedValuesAndTimes) {
    describeWaypoint();
    const auto marshaller =
        scenario::marshaller("<class name='Waypoint'><map-to xml='wpt'/>"
                             "<field name='fix'><bind-xml name='fix' node='element'/></field>"
                             "<field name='time'><bind-xml name='time' node='element'/></field>"
                             "</class>");
    const auto waypoint =
        marshaller->readString("<wpt><fix>2d</fix><time>2026-03-01T10:30:00+01:00</time></wpt>")
            .as<Waypoint>();
    ASSERT_TRUE(waypoint);
    EXPECT_EQ(waypoint->fix, Fix::flat);
    EXPECT_EQ(waypoint->valueForKey("time"), "2026-03-01T09:30:00Z");
    EXPECT_EQ(scenario::read(*marshaller, "<wpt><fix>4d</fix></wpt>"),
              "-222: Unable to set value: 4d for key: fix in class: Waypoint (Invalid Value)");
}

TEST_F(HostClasses, HaveTypesOfTheirOwn) {
    qx::Class::define<Delivery>("Delivery").property<&Delivery::day>("day");
    const auto marshaller =
        scenario::marshaller("<class name='Delivery'><field name='day'>"
                             "<bind-xml name='on' node='attribute'/></field></class>");
    const auto delivery = marshaller->readString("<delivery on='2026-03-02'/>").as<Delivery>();
    EXPECT_EQ(delivery->day.month, 3);
    EXPECT_EQ(delivery->valueForKey("day").string(), "2026-03-02");
    EXPECT_EQ(scenario::read(*marshaller, "<delivery on='soon'/>"),
              "-222: Unable to set value: soon for key: day in class: Delivery (Invalid Value)");
}

TEST_F(HostClasses, KnowTheirOwners) {
    describeBasket();
    const auto marshaller = scenario::marshaller(basketMapping);
    const char* document =
        "<basket a='1'><best kind='pear'/><fruit kind='fig'><b/></fruit></basket>";
    const auto basket = marshaller->readString(document).as<Basket>();
    ASSERT_TRUE(basket);
    EXPECT_EQ(basket->best->basket(), basket.get());
    EXPECT_EQ(basket->fruits.at(0)->basket(), basket.get());
    EXPECT_EQ(
        scenario::write(*marshaller, basket),
        R"(<basket a="1"><best kind="pear"></best><fruit kind="fig"><b></b></fruit></basket>)");
}

TEST_F(HostClasses, MayBeRecordsWithMembers) {
    describeTask();
    const auto marshaller =
        scenario::marshaller("<class name='Task'><map-to xml='task'/>"
                             "<field name='minutes' type='int'><bind-xml node='attribute'/></field>"
                             "<field name='title'><bind-xml node='attribute'/></field></class>");
    const auto task = marshaller->readString("<task minutes='5' title='Tea' a='1'/>").as<Task>();
    ASSERT_TRUE(task);
    EXPECT_EQ(task->minutes, 5);
    EXPECT_EQ(task->get<std::string>("title"), "Tea");
    EXPECT_EQ(scenario::write(*marshaller, task), R"(<task minutes="5" title="Tea" a="1"></task>)");
}

TEST_F(HostClasses, AreHandedTheUndoManager) {
    describeNote();
    const auto marshaller =
        scenario::marshaller("<class name='Note'><map-to xml='note'/>"
                             "<field name='text'><bind-xml node='text'/></field></class>");
    const auto note = marshaller->readString("<note>one</note>").as<Note>();
    const auto manager = marshaller->undoManager();
    EXPECT_EQ(note->undoManager(), manager);
    manager->undo();
    EXPECT_EQ(note->text, "") << "the reading is one entry";
    manager->redo();
    manager->removeAllActions();
    note->setValueForKey("two", "text");
    manager->undo();
    EXPECT_EQ(note->text, "one");
}

TEST_F(HostClasses, ThatCannotBeMadeBecomeRecords) {
    qx::Class::define<Ticket, QXMappedObject>("Ticket").property<&Ticket::purpose>("purpose");
    const auto marshaller =
        scenario::marshaller("<class name='Ticket'><map-to xml='ticket'/>"
                             "<field name='purpose'><bind-xml node='attribute'/>"
                             "</field></class>");
    testing::internal::CaptureStderr();
    EXPECT_TRUE(marshaller->readString("<ticket/>").as<QXGenericRecord>());
    EXPECT_NE(testing::internal::GetCapturedStderr().find("Class Ticket cannot be made"),
              std::string::npos);
    EXPECT_EQ(scenario::write(*marshaller, qx::make<Ticket>("tea")),
              R"(<ticket purpose="tea"></ticket>)");
}

TEST_F(HostClasses, CannotTakeANameThatIsTaken) {
    class Impostor : public qx::Object {};
    describeProduct();
    qx::Class::define<Impostor>("Product");
    EXPECT_TRUE(qx::Class::named("Product")->create().as<Product>());
}

TEST_F(HostClasses, AreReadWithErrorsThatAreShown) {
    describeTour();
    const auto marshaller = scenario::marshaller(tourMapping);
    std::vector<std::string> unknown;
    listUnknown(*marshaller, unknown);
    const std::string path = std::filesystem::temp_directory_path() / "qx-tour.xml";
    std::ofstream(path) << "<tour>\n<start lat='x' lon='y'/>\n<note/></tour>";
    std::ostringstream messages;
    openTour(*marshaller, path.c_str(), messages);
    std::filesystem::remove(path);
    EXPECT_EQ(unknown, std::vector<std::string>{"note in line 3"});
    EXPECT_NE(messages.str().find("qx-tour.xml:2:8 /tour/start/@lat\n"), std::string::npos);
    EXPECT_NE(messages.str().find(":2:16 /tour/start/@lon\n"), std::string::npos);
}
