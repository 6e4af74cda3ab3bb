// Host objects that turn on the reading that makes them: whatever their setters do to the document,
// the marshaller and its options, no freed memory is used and no list loses an item.

#include "ObjectKinds.h"
#include "support/Meddling.h"
#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Class.h>

#include <functional>
#include <utility>

namespace {

using qx::Ref;
using qx::Value;
using support::Meddling;

class Meddler : public kinds::Host {
public:
    Meddler() { Meddling::call(); }
    void setClassName(const qx::String&) { Meddling::call(); }
    void setNotify(bool) { Meddling::call(); }
    void setUndoManager(qx::UndoManager*) { Meddling::call(); }
    qx::Object* rootObject() { return this; }
    void setParent(qx::Object*) { Meddling::call(); }
    bool isRemovable() const override {
        Meddling::call();
        return HostBase::isRemovable();
    }

protected:
    void wasSet() override { Meddling::call(); }
};

const bool described = [] {
    kinds::Keys keys = kinds::kept;
    keys.insert(keys.end(), {"id", "text", "located", "typed", "named", "wrapped", "all", "child",
                             "word", "flat"});
    kinds::describe<kinds::HostBase>(
        qx::Class::define<Meddler>("ReentranceTest.Meddler")
            .operation<&Meddler::setClassName>("setClassNameForMarshalling:")
            .operation<&Meddler::setNotify>("setNotifyBindingsObservers:")
            .operation<&Meddler::setUndoManager>("setUndoManager:")
            .operation<&Meddler::rootObject>("rootObject")
            .operation<&Meddler::setParent>("setParent:"),
        keys);
    return true;
}();

// What the root becomes: of a record the lists are walked until the first of its items is no
// record.
enum class Order { host, flatFirst, record };

// Every kind of field, before and after a flattened one has made its private copy.
std::string mapping(Order order) {
    const std::string type = "type='ReentranceTest.Meddler'";
    const std::string flat = "<flat type='Flat' container='false' node='element'/>";
    const std::string others =
        "<id node='attribute' location='head'/>"
        "<located collection='array' type='Item' name='l' location='box'/>"
        "<typed collection='array' type='Item' name='t'/><named collection='array' name='item'/>"
        "<wrapped collection='array' name='wrap'/><child name='one' node='element'/>"
        "<word node='element'/><all collection='array'/>";
    return "<Order xml='order' " + (order == Order::record ? "" : type) + ">" +
           (order == Order::flatFirst ? flat + others : others + flat) +
           "<text node='text'/></Order><Flat " + type + "><word name='w' node='element'/></Flat>" +
           "<Item xml='item' " + type + "><id node='attribute'/><text node='text'/></Item>" +
           "<One xml='one' " + type + "><id node='attribute'/></One>";
}

std::string document() {
    const auto two = [](const std::string& name) {
        std::string items;
        for (const char* id : {"1", "2"})
            items += "<" + name + " id='" + id + "' more='m'>x<u/></" + name + ">";
        return items;
    };
    return "<order xmlns:n='urn:n' spare='s'><head id='h'/><one id='1'/><word>w</word><w>f</w>" +
           two("t") + "<box>" + two("l") + "</box>" + two("item") + "<wrap>" + two("item") +
           "</wrap><unknown><deep/></unknown>" +
           // So many children that they are looked up in an index.
           scenario::repeated("<p/>", 30) + "</order>";
}

void takeApart(qx::XMLElement& element) {
    while (qx::XMLNode* child = element.firstChild()) {
        if (qx::XMLElement* inner = child->asElement())
            takeApart(*inner);
        child->detach();
    }
    while (!element.attributes().empty())
        element.removeAttributeForName(element.attributes().begin()->name());
    element.setNamespaces({});
    element.setStringValue("changed");
}

struct Reading {
    Ref<QXXMLMarshaller> marshaller;
    Ref<qx::XMLDocument> source;
};

const std::pair<const char*, void (*)(Reading&)> acts[] = {
    {"takes the document apart",
     [](Reading& reading) { takeApart(*reading.source->rootElement()); }},
    {"takes the root away",
     [](Reading& reading) {
         if (qx::XMLElement* const root = reading.source->rootElement())
             root->detach();
     }},
    {"lets go of everything", [](Reading& reading) { reading = {}; }},
    {"moves the document's nodes into another",
     [](Reading& reading) {
         const auto other = scenario::marshaller("<Order xml='order'/>");
         other->marshall(other->unmarshall(reading.source));
     }},
    {"reads the same once more",
     [](Reading& reading) { EXPECT_TRUE(reading.marshaller->unmarshall(reading.source)); }},
    {"changes the options",
     [](Reading& reading) {
         reading.marshaller->setSaveUnknownXML(false);
         reading.marshaller->setMaximumDepth(2);
         reading.marshaller->setLenient(false);
     }},
};

// Reads, acts at that call of the host, and writes what came. False when there were fewer calls.
bool actsAt(int call, void (*act)(Reading&), const std::string& mapping, bool hasNodes) {
    Reading reading{scenario::marshaller(mapping), qx::XMLDocument::initWithData(document())};
    if (hasNodes)
        reading.source->rootElement();
    QXXMLMarshaller& marshaller = *reading.marshaller;
    Ref<qx::Error> error;
    Ref<qx::Object> order;
    const bool hasActed = Meddling::during(
        call, [&] { act(reading); },
        [&] { order = marshaller.unmarshall(reading.source, &error); });
    EXPECT_NE(!order, !error);
    if (!order)
        return hasActed;
    for (const char* key : {"typed", "located", "named", "wrapped"}) {
        const auto list = order->valueForKey(key).as<qx::Array>();
        EXPECT_TRUE(!list || list->isEmpty() || list->count() == 2) << key << list->count();
    }
    scenario::marshaller(mapping)->marshall(order);
    return hasActed;
}

} // namespace

TEST(Reentrance, WhateverHostObjectsDoMeanwhileListsComeWhole) {
    for (const auto& [name, act] : acts) {
        for (const Order kind : {Order::host, Order::flatFirst, Order::record}) {
            SCOPED_TRACE(name);
            for (const bool hasNodes : {false, true})
                for (int call = 0; actsAt(call, act, mapping(kind), hasNodes); ++call)
                    ASSERT_FALSE(testing::Test::HasFailure()) << "at call " << call;
        }
    }
}

TEST(Reentrance, TheTextThatIsReadMayBeChangedMeanwhile) {
    const auto marshaller = scenario::marshaller(mapping(Order::host));
    std::string text = document();
    const std::string expected = scenario::read(*marshaller, text);
    const auto forgetText = [&] { text = std::string(); };
    std::string shown;
    for (int call = 0;
         Meddling::during(call, forgetText, [&] { shown = scenario::read(*marshaller, text); });
         ++call) {
        ASSERT_EQ(shown, expected) << "at call " << call;
        text = document();
    }
}

TEST(Reentrance, OptionsHoldFromTheMomentTheyAreSet) {
    const auto marshaller =
        scenario::marshaller("<One type='ReentranceTest.Meddler' xml='one'><word "
                             "node='element'/><id node='attribute'/></One>",
                             scenario::discard);
    const auto read = [&](std::function<void()> act) {
        std::string shown;
        Meddling::during(4, std::move(act), [&] { // in the setter of the first field
            shown = scenario::read(*marshaller, "<one id='1' b='2'><word>w</word><x/></one>");
        });
        return shown;
    };
    EXPECT_EQ(read([&] { marshaller->setLenient(false); }),
              "-214: Unknown fields found in XML document: (x [1]) element: one (Invalid XML)");
    marshaller->setLenient(true);
    const std::string kept = read([&] { marshaller->setSaveUnknownXML(true); });
    EXPECT_NE(kept.find("unboundAttributes: [b=\"2\"], unboundChildren: {x: [<x></x>]}"),
              std::string::npos)
        << kept;
}

TEST(Reentrance, AWritingHoldsWhatItsGettersLetGoOf) {
    auto marshaller =
        scenario::marshaller("<ReentranceTest.Meddler xml='one'><all collection='array'/><id "
                             "node='attribute'/></ReentranceTest.Meddler>");
    const auto item = qx::make<Meddler>();
    item->setValueForKey("2", "id");
    Value object = qx::make<Meddler>();
    object.object()->setValueForKey(qx::make<qx::Array>(std::vector<Value>{item}), "all");
    object.object()->setValueForKey("1", "id");
    qx::String text;
    Meddling::during(
        0, [&] { object = marshaller = nullptr; }, // asked for the item
        [&] { text = marshaller->writeString(object); });
    EXPECT_NE(text.view().find("<one id=\"1\">\n    <one id=\"2\""), std::string_view::npos);
}

TEST(Reentrance, AnItemMayTakeItselfOutOfTheListThatItIsSetThrough) {
    const auto items = qx::make<qx::Array>(std::vector<Value>{qx::make<Meddler>()});
    Meddling::during(
        0, [&] { items->removeAll(); },
        [&] { EXPECT_THROW(items->trySetValueForKey("1", "id"), qx::Exception); });
    EXPECT_EQ(items->count(), 0U);
}
