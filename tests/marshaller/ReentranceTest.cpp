// Host objects that turn on the reading that makes them: whatever their setters do to the document,
// the marshaller and its options, no freed memory is used and no list loses an item.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Class.h>

#include <functional>

namespace {

using qx::Ref;
using qx::Value;

// Does `act` at the call of the host that `countdown` names, counted from 0.
struct Meddling {
    static inline std::function<void()> act;
    static inline int countdown = -1;
    static void call() {
        if (countdown-- == 0)
            act();
    }
};

class Meddler : public qx::Object {
public:
    Meddler() { Meddling::call(); }
    void setClassName(const qx::String&) { Meddling::call(); }
    void setNotify(bool) { Meddling::call(); }
    void setUndoManager(qx::UndoManager*) { Meddling::call(); }
    qx::Object* rootObject() { return this; }
    void setParent(qx::Object*) { Meddling::call(); }
    bool isRemovable() const {
        Meddling::call();
        return false;
    }

    template <int Key>
    void set(const Value& value) {
        values[Key] = value;
        Meddling::call();
    }
    template <int Key>
    Value get() const {
        return values[Key];
    }
    Value values[13];
};

template <int Key>
void describe(qx::ClassBuilder<Meddler>& builder, const char* key) {
    builder.property<&Meddler::get<Key>, &Meddler::set<Key>>(key);
}

const bool described = [] {
    auto builder = qx::Class::define<Meddler>("ReentranceTest.Meddler");
    describe<0>(builder, "id");
    describe<1>(builder, "text");
    describe<2>(builder, "child");
    describe<3>(builder, "word");
    describe<4>(builder, "flat");
    describe<5>(builder, "typed");
    describe<6>(builder, "located");
    describe<7>(builder, "named");
    describe<8>(builder, "wrapped");
    describe<9>(builder, "all");
    describe<10>(builder, "unboundChildren");
    describe<11>(builder, "unboundAttributes");
    describe<12>(builder, "__namespaces");
    builder.operation<&Meddler::setClassName>("setClassNameForMarshalling:")
        .operation<&Meddler::setNotify>("setNotifyBindingsObservers:")
        .operation<&Meddler::setUndoManager>("setUndoManager:")
        .operation<&Meddler::rootObject>("rootObject")
        .operation<&Meddler::setParent>("setParent:")
        .operation<&Meddler::isRemovable>("isRemovable");
    return true;
}();

// What the root becomes: of a record the lists are walked until the first of its items is no
// record.
enum class Order { host, flatFirst, record };

// Every kind of field, before and after a flattened one has made its private copy.
std::string mapping(Order order) {
    const bool flatFirst = order == Order::flatFirst;
    const std::string type = "type='ReentranceTest.Meddler'";
    const std::string flat = "<field name='flat' type='Flat' container='false'>"
                             "<bind-xml node='element'/></field>";
    return "<class name='Order' " + (order == Order::record ? "" : type) +
           "><map-to xml='order'/>" + (flatFirst ? flat : "") +
           "<field name='id'><bind-xml node='attribute' location='head'/></field>"
           "<field name='located' collection='array' type='Item'>"
           "<bind-xml name='l' location='box'/></field>"
           "<field name='typed' collection='array' type='Item'><bind-xml name='t'/></field>"
           "<field name='named' collection='array'><bind-xml name='item'/></field>"
           "<field name='wrapped' collection='array'><bind-xml name='wrap'/></field>"
           "<field name='child'><bind-xml name='one' node='element'/></field>"
           "<field name='word'><bind-xml node='element'/></field>"
           "<field name='all' collection='array'><bind-xml/></field>" +
           (flatFirst ? "" : flat) +
           "<field name='text'><bind-xml node='text'/></field></class>"
           "<class name='Flat' " +
           type +
           "><field name='word'><bind-xml name='w' node='element'/></field></class>"
           "<class name='Item' " +
           type +
           "><map-to xml='item'/><field name='id'><bind-xml node='attribute'/></field>"
           "<field name='text'><bind-xml node='text'/></field></class>"
           "<class name='One' " +
           type +
           "><map-to xml='one'/><field name='id'><bind-xml node='attribute'/></field></class>";
}

std::string document() {
    const auto two = [](const std::string& name) {
        std::string items;
        for (const char* id : {"1", "2"})
            items += "<" + name + " id='" + id + "' more='m'>x<u/></" + name + ">";
        return items;
    };
    std::string padding; // so many children that an index is built of them
    for (int i = 0; i < 30; ++i)
        padding += "<p/>";
    return "<order xmlns:n='urn:n' spare='s'><head id='h'/><one id='1'/><word>w</word><w>f</w>" +
           two("t") + "<box>" + two("l") + "</box>" + two("item") + "<wrap>" + two("item") +
           "</wrap><unknown><deep/></unknown>" + padding + "</order>";
}

void takeApart(qx::XMLElement& element) {
    while (qx::XMLNode* child = element.firstChild()) {
        if (qx::XMLElement* inner = child->asElement())
            takeApart(*inner);
        child->detach();
    }
    element.setStringValue("changed");
}

struct Reading {
    Ref<QXXMLMarshaller> marshaller;
    Ref<qx::XMLDocument> source;
};

struct Act {
    const char* name;
    void (*act)(Reading&);
};

constexpr Act acts[] = {
    {"takes the document apart",
     [](Reading& reading) { takeApart(*reading.source->rootElement()); }},
    {"lets go of everything",
     [](Reading& reading) {
         reading.source = nullptr;
         reading.marshaller = nullptr;
     }},
    {"moves the document's nodes into another",
     [](Reading& reading) {
         const auto other =
             scenario::marshaller("<class name='Order'><map-to xml='order'/></class>");
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

void checkAndWrite(const Ref<qx::Object>& order, const std::string& mappingXML) {
    for (const char* key : {"typed", "located", "named", "wrapped"}) {
        const auto list = order->valueForKey(key).as<qx::Array>();
        EXPECT_TRUE(!list || list->isEmpty() || list->count() == 2) << key << list->count();
    }
    scenario::marshaller(mappingXML)->marshall(order);
}

} // namespace

TEST(Reentrance, WhateverHostObjectsDoMeanwhileListsComeWhole) {
    const std::string xml = document();
    for (const Act& act : acts) {
        for (const Order kind : {Order::host, Order::flatFirst, Order::record}) {
            const auto mappingXML = mapping(kind);
            for (int call = 0;; ++call) {
                SCOPED_TRACE(std::string(act.name) + " at call " + std::to_string(call));
                Reading reading{scenario::marshaller(mappingXML),
                                qx::XMLDocument::initWithData(xml)};
                Meddling::act = [&] { act.act(reading); };
                Meddling::countdown = call;
                QXXMLMarshaller& marshaller = *reading.marshaller;
                Ref<qx::Error> error;
                const auto order = marshaller.unmarshall(reading.source, &error);
                const bool hasActed = Meddling::countdown < 0;
                Meddling::countdown = -1;
                EXPECT_NE(!order, !error);
                if (order)
                    checkAndWrite(order, mappingXML);
                if (!hasActed)
                    break;
            }
        }
    }
}

TEST(Reentrance, OptionsHoldFromTheMomentTheyAreSet) {
    const auto marshaller =
        scenario::marshaller("<class name='One' type='ReentranceTest.Meddler'><map-to xml='one'/>"
                             "<field name='word'><bind-xml node='element'/></field>"
                             "<field name='id'><bind-xml node='attribute'/></field></class>",
                             scenario::discard);
    const auto read = [&](std::function<void()> act) {
        Meddling::act = std::move(act);
        Meddling::countdown = 4; // the setter of the first field
        const std::string shown =
            scenario::read(*marshaller, "<one id='1' b='2'><word>w</word><x/></one>");
        Meddling::countdown = -1;
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
        scenario::marshaller("<class name='ReentranceTest.Meddler'><map-to xml='one'/>"
                             "<field name='all' collection='array'><bind-xml/></field>"
                             "<field name='id'><bind-xml node='attribute'/></field></class>");
    const auto item = qx::make<Meddler>();
    item->set<0>("2");
    const auto items = qx::make<qx::Array>();
    items->add(item);
    Value object = qx::make<Meddler>();
    object.object()->setValueForKey(items, "all");
    object.object()->setValueForKey("1", "id");
    Meddling::act = [&] { object = marshaller = nullptr; };
    Meddling::countdown = 0; // asked for the item
    EXPECT_NE(marshaller->writeString(object).view().find("<one id=\"1\">\n    <one id=\"2\""),
              std::string_view::npos);
    Meddling::countdown = -1;
}

TEST(Reentrance, AnItemMayTakeItselfOutOfTheListThatItIsSetThrough) {
    const auto items = qx::make<qx::Array>();
    items->add(qx::make<Meddler>());
    Meddling::act = [&] { items->removeAll(); };
    Meddling::countdown = 0;
    EXPECT_THROW(items->trySetValueForKey("1", "id"), qx::Exception); // it changed while walked
    Meddling::countdown = -1;
    EXPECT_EQ(items->count(), 0U);
}
