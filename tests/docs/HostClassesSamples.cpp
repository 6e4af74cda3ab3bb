// The samples of docs/host-classes.md, between "// sample: NAME" and "// end of sample";
// SamplesTest.cpp compares them with the page. What the page says of them is tested below.

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/QXXMLMarshaller.h>
#include <QXXMLMarshalling/platform/Class.h>
#include <QXXMLMarshalling/platform/Exception.h>
#include <QXXMLMarshalling/platform/UndoableObject.h>

#include <gtest/gtest.h>

#include <cstdio>
#include <stdexcept>

namespace {

qx::Ref<QXXMLMarshaller> marshallerFor(const std::string& classes) {
    const auto mapping = qx::XMLDocument::initWithData("<mapping>" + classes + "</mapping>");
    return QXXMLMarshaller::initWithMappingXML(mapping.get());
}

// "-222: message", or nothing.
std::string errorOfReading(QXXMLMarshaller& marshaller, const char* document) {
    qx::Ref<qx::Error> error;
    marshaller.readString(document, &error);
    return error ? std::to_string(error->code()) + ": " + error->localizedDescription().str() : "";
}

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

// sample: model
class Model : public qx::Object {
public:
    bool isRemovable() const { return false; }

    qx::Value unboundChildren, unboundAttributes, namespaces;
};

void describeModel() {
    qx::Class::define<Model>("Model")
        .property<&Model::unboundChildren>("unboundChildren")
        .property<&Model::unboundAttributes>("unboundAttributes")
        .property<&Model::namespaces>("__namespaces")
        .operation<&Model::isRemovable>("isRemovable");
}
// end of sample

// sample: basket
class Basket;

class Fruit : public Model {
public:
    void setParent(Basket* basket) { _basket = basket; }
    Basket* basket() const { return _basket; }

    std::string kind;

private:
    Basket* _basket = nullptr; // owns this one
};

class Basket : public Model {
public:
    qx::Ref<Fruit> best;
    std::vector<qx::Ref<Fruit>> fruits;
};

void describeBasket() {
    qx::Class::define<Fruit, Model>("Fruit")
        .property<&Fruit::kind>("kind")
        .operation<&Fruit::setParent>("setParent:");
    qx::Class::define<Basket, Model>("Basket")
        .property<&Basket::best>("best")
        .property<&Basket::fruits>("fruits");
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
    qx::Value unboundChildren, unboundAttributes, namespaces;
};

void describeNote() {
    qx::Class::define<Note, qx::UndoableObject>("Note")
        .property<&Note::text>("text")
        .property<&Note::unboundChildren>("unboundChildren")
        .property<&Note::unboundAttributes>("unboundAttributes")
        .property<&Note::namespaces>("__namespaces")
        .operation<&Note::rootObject>("rootObject")
        .operation<&Note::setUndoManager>("setUndoManager:");
}
// end of sample

// Tells what it is asked.

class Witness : public Model {
public:
    void setClassNameForMarshalling(const qx::String& name) { heard += name.str() + "; "; }
    void setNotifyBindingsObservers(bool notify) { heard += notify ? "on; " : "off; "; }
    void setParent(qx::Object* parent) { heard += "parent " + parent->isa().name().str() + "; "; }
    void setText(const std::string& text) { heard += "text " + text + "; "; }
    std::string text() const { return "said"; }

    std::string heard;
};

void describeWitness() {
    qx::Class::define<Witness, Model>("Witness")
        .property<&Witness::text, &Witness::setText>("text")
        .operation<&Witness::setClassNameForMarshalling>("setClassNameForMarshalling:")
        .operation<&Witness::setNotifyBindingsObservers>("setNotifyBindingsObservers:")
        .operation<&Witness::setParent>("setParent:");
}

// Cannot be made without being told what for.
class Ticket : public Model {
public:
    explicit Ticket(std::string_view what) : purpose(what) {}
    std::string purpose;
};

class Fussy : public Model {
public:
    void setText(const std::string&) { throw std::runtime_error("not today"); }
    std::string text() const { return ""; }
};

class HostClasses : public testing::Test {
protected:
    void TearDown() override {
        for (const char* name : {"Product", "Invoice", "Delivery", "Model", "Fruit", "Basket",
                                 "Task", "Note", "Witness", "Ticket", "Fussy"})
            qx::Class::forget(name);
    }
};

} // namespace

TEST_F(HostClasses, AreFilledByTheirProperties) {
    describeProduct();
    const auto marshaller = marshallerFor(productMapping);
    const auto product = marshaller->readString("<product name='Pen' stock='7'/>").as<Product>();
    ASSERT_TRUE(product);
    EXPECT_EQ(product->name, "Pen");
    EXPECT_EQ(product->stock, 7);
    // sample: forget
    qx::Class::forget("Product");
    // end of sample
    EXPECT_TRUE(marshaller->readString("<product name='Pen'/>").as<QXGenericRecord>());
}

TEST_F(HostClasses, RefuseWhatTheyDoNotTakeOrHave) {
    describeProduct();
    const auto marshaller = marshallerFor(productMapping);
    EXPECT_EQ(errorOfReading(*marshaller, "<product name='Pen' stock='99999999999'/>"),
              "-222: Unable to set value: 99999999999 for key: stock in class: Product");
    EXPECT_EQ(errorOfReading(*marshaller, "<product name='Pen' stock=''/>"),
              "-222: Unable to set value: (null) for key: stock in class: Product");
    const char* reserved[][2] = {
        {"<product name='Pen' a='1'/>", "unboundAttributes"},
        {"<product name='Pen'><b/></product>", "unboundChildren"},
        {"<product name='Pen' xmlns='urn:x'/>", "__namespaces"},
    };
    for (const auto& [document, key] : reserved)
        EXPECT_NE(errorOfReading(*marshaller, document).find("for key: " + std::string(key)),
                  std::string::npos);
    marshaller->setSaveUnknownXML(false);
    EXPECT_EQ(errorOfReading(*marshaller, reserved[0][0]), "");
    EXPECT_EQ(errorOfReading(*marshaller, reserved[1][0]), "");
    EXPECT_NE(errorOfReading(*marshaller, reserved[2][0]), "");
}

TEST_F(HostClasses, NeedTheReservedKeysToBeWritten) {
    describeProduct();
    const auto marshaller = marshallerFor(productMapping);
    const auto product = qx::make<Product>();
    for (const auto& [save, key] : {std::pair(true, "unboundChildren"), {false, "__namespaces"}}) {
        marshaller->setSaveUnknownXML(save);
        try {
            marshaller->marshall(product);
            ADD_FAILURE() << key;
        } catch (const qx::Exception& exception) {
            EXPECT_STREQ(exception.name(), qx::Exception::undefinedKey);
            EXPECT_NE(exception.reason().find(key), std::string_view::npos);
        }
    }
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

TEST_F(HostClasses, HaveTypesOfTheirOwn) {
    qx::Class::define<Delivery>("Delivery").property<&Delivery::day>("day");
    const auto marshaller = marshallerFor("<class name='Delivery'><field name='day'>"
                                          "<bind-xml name='on' node='attribute'/></field></class>");
    const auto delivery = marshaller->readString("<delivery on='2026-03-02'/>").as<Delivery>();
    EXPECT_EQ(delivery->day.month, 3);
    EXPECT_EQ(delivery->valueForKey("day").string(), "2026-03-02");
    EXPECT_EQ(errorOfReading(*marshaller, "<delivery on='soon'/>"),
              "-222: Unable to set value: soon for key: day in class: Delivery");
}

TEST_F(HostClasses, KnowTheirOwners) {
    describeModel();
    describeBasket();
    const auto marshaller = marshallerFor(basketMapping);
    const char* document =
        "<basket a='1'><best kind='pear'/><fruit kind='fig'><b/></fruit></basket>";
    const auto basket = marshaller->readString(document).as<Basket>();
    ASSERT_TRUE(basket);
    EXPECT_EQ(basket->best->basket(), basket.get());
    EXPECT_EQ(basket->fruits.at(0)->basket(), basket.get());
    EXPECT_EQ(
        marshaller->marshallObject(basket)->XMLString(),
        R"(<basket a="1"><best kind="pear"></best><fruit kind="fig"><b></b></fruit></basket>)");
}

TEST_F(HostClasses, MayBeRecordsWithMembers) {
    describeTask();
    const auto marshaller =
        marshallerFor("<class name='Task'><map-to xml='task'/>"
                      "<field name='minutes' type='int'><bind-xml node='attribute'/></field>"
                      "<field name='title'><bind-xml node='attribute'/></field></class>");
    const auto task = marshaller->readString("<task minutes='5' title='Tea' a='1'/>").as<Task>();
    ASSERT_TRUE(task);
    EXPECT_EQ(task->minutes, 5);
    EXPECT_EQ(task->get<std::string>("title"), "Tea");
    EXPECT_EQ(marshaller->marshallObject(task)->XMLString(),
              R"(<task minutes="5" title="Tea" a="1"></task>)");
}

TEST_F(HostClasses, AreHandedTheUndoManager) {
    describeNote();
    const auto marshaller =
        marshallerFor("<class name='Note'><map-to xml='note'/>"
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

TEST_F(HostClasses, AreAskedInOrder) {
    describeModel();
    describeWitness();
    const auto marshaller =
        marshallerFor("<class name='Case'><field name='witness' type='Person'>"
                      "<bind-xml node='element'/></field></class>"
                      "<class name='Person' type='Witness'>"
                      "<field name='text'><bind-xml node='text'/></field></class>");
    const auto object = marshaller->readString("<case><witness>hm</witness></case>");
    const auto witness = object->valueForKey("witness").as<Witness>();
    ASSERT_TRUE(witness);
    EXPECT_EQ(witness->heard, "Person; off; text hm; on; parent QXGenericRecord; ");
}

TEST_F(HostClasses, AreWrittenUnderTheirClassName) {
    describeModel();
    describeWitness();
    const std::string text =
        "<field name='text'><bind-xml name='text' node='attribute'/></field></class>";
    const auto marshaller = marshallerFor("<class name='Person' type='Witness'>" + text);
    qx::Ref<qx::Error> error;
    EXPECT_FALSE(marshaller->marshall(qx::make<Witness>(), &error));
    EXPECT_EQ(error->localizedDescription(), "No mapping definition for class: Witness");
    const auto named = marshallerFor("<class name='Witness'>" + text);
    EXPECT_EQ(named->marshallObject(qx::make<Witness>())->XMLString(),
              R"(<Witness text="said"></Witness>)");
}

TEST_F(HostClasses, ThatCannotBeMadeBecomeRecords) {
    describeModel();
    qx::Class::define<Ticket, Model>("Ticket").property<&Ticket::purpose>("purpose");
    const auto marshaller = marshallerFor("<class name='Ticket'><map-to xml='ticket'/>"
                                          "<field name='purpose'><bind-xml node='attribute'/>"
                                          "</field></class>");
    EXPECT_TRUE(marshaller->readString("<ticket/>").as<QXGenericRecord>());
    EXPECT_EQ(marshaller->marshallObject(qx::make<Ticket>("tea"))->XMLString(),
              R"(<ticket purpose="tea"></ticket>)");
}

TEST_F(HostClasses, MayThrow) {
    describeModel();
    qx::Class::define<Fussy, Model>("Fussy").property<&Fussy::text, &Fussy::setText>("text");
    const auto marshaller = marshallerFor(
        "<class name='Fussy'><field name='text'><bind-xml node='attribute'/></field></class>");
    EXPECT_THROW(marshaller->readString("<fussy text='t'/>"), std::runtime_error);
    EXPECT_EQ(marshaller->undoManager()->groupingLevel(), 0U);
}

TEST_F(HostClasses, AreWrittenAsItemsWhenTheySaySo) {
    describeModel();
    describeNote();
    describeBasket();
    const auto marshaller = marshallerFor(
        "<class name='List'><map-to xml='list'/><field name='items' collection='array'>"
        "<bind-xml name='items'/></field></class>"
        "<class name='Note'><map-to xml='note'/></class><class name='Fruit'/>");
    const auto list = marshaller->readString("<list/>");
    list->setValueForKey(
        qx::make<qx::Array>(std::vector<qx::Value>{qx::make<Note>(), qx::make<Fruit>()}), "items");
    EXPECT_EQ(marshaller->marshallObject(list)->XMLString(),
              "<list><items><Fruit></Fruit></items></list>");
}

TEST_F(HostClasses, CannotTakeANameThatIsTaken) {
    class Impostor : public qx::Object {};
    describeProduct();
    qx::Class::define<Impostor>("Product");
    EXPECT_TRUE(qx::Class::named("Product")->create().as<Product>());
}
