// The samples of docs/records.md, between "// sample: NAME" and "// end of sample", and what the
// page says of them. tests/docs/SamplesTest.cpp compares them with the page.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/host/UserDefaults.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/WeakRef.h>
#include <QXXMLMarshalling/observe/Observation.h>
#include <QXXMLMarshalling/undo/UndoableObject.h>

#include <algorithm>
#include <iostream>
#include <sstream>

namespace {

TEST(RecordsPage, Keys) {
    // sample: keys
    auto order = qx::make<QXGenericRecord>();
    order["number"] = "A-17"; // the same as order->setValueForKey("A-17", "number")
    order["count"] = 3;

    auto number = order["number"].get<std::string>();    // "A-17"; raises where it is no text
    std::optional<int> count = order->get<int>("count"); // 3
    std::optional<int> none = order->get<int>("number"); // no number: none
    qx::Value unknown = order["colour"];                 // null
    order["count"] = nullptr;                            // the key is gone

    for (const qx::String& key : order->keys()) // in the order in which they were first set
        std::cout << key << '\n';
    // end of sample
    EXPECT_EQ(number, "A-17");
    EXPECT_EQ(count, 3);
    EXPECT_EQ(none, std::nullopt);
    EXPECT_TRUE(unknown.isNull());
    EXPECT_EQ(order->keys(), std::vector<qx::String>{"number"});
}

TEST(RecordsPage, Ranges) {
    const auto order = qx::make<QXGenericRecord>();
    // sample: ranges
    order["sizes"] = std::vector{40, 36, 38};
    auto sizes = order["sizes"].get<qx::Ref<qx::Array>>(); // the list itself, not a copy
    std::ranges::sort(*sizes);
    sizes[0] = sizes[0].get<int>() - 1; // 35
    auto large = std::ranges::count_if(*sizes, [](const qx::Value& size) { return size > 37; });

    for (const auto& [key, value] : *order->contents())
        std::cout << key + ": " << value.description() << '\n';
    // end of sample
    EXPECT_EQ(large, 2);
    EXPECT_EQ(order["sizes"].get<std::vector<int>>(), (std::vector{35, 38, 40}));
}

TEST(RecordsPage, ClassNamesAndReservedKeys) {
    const auto marshaller = scenario::marshaller(
        "<class name='Order'><map-to xml='order'/>"
        "<field name='number'><bind-xml name='number' node='attribute'/></field>"
        "<field name='className'><bind-xml name='class' node='attribute'/></field>"
        "<field name='contents'><bind-xml name='contents' node='element'/></field></class>");
    EXPECT_EQ(marshaller->readString("<order class='Bill'/>")->classNameForMarshalling(), "Bill");
    EXPECT_EQ(
        scenario::read(*marshaller, "<order><contents>c</contents></order>"),
        "-222: Unable to set value: c for key: contents in class: QXGenericRecord (Invalid Value)");
    // sample: class-names
    auto order = qx::make<QXGenericRecord>();
    order->setClassNameForMarshalling("Order"); // <class name="Order"> of the mapping
    order->setValueForKey("A-18", "number");
    qx::String text = marshaller->writeString(order); // … <order number="A-18">…
    // end of sample
    EXPECT_NE(text.view().find("<order number=\"A-18\" class=\"Order\">"), std::string_view::npos);
}

// sample: give-manager
void giveUndoManager(const qx::Value& value, const qx::Ref<qx::UndoManager>& manager) {
    if (const auto array = value.as<qx::Array>()) {
        for (const qx::Value& item : *array)
            giveUndoManager(item, manager);
    } else if (const auto record = value.as<QXGenericRecord>()) {
        for (const qx::String& key : record->keys())
            giveUndoManager(record->valueForKey(key), manager);
        record->setUndoManager(manager);
    }
}
// end of sample

TEST(RecordsPage, Undo) {
    const auto order = qx::make<QXGenericRecord>();
    const auto buyer = qx::make<QXGenericRecord>();
    order->setValueForKey(buyer, "buyer");
    // sample: undo
    auto manager = qx::make<qx::UndoManager>();
    giveUndoManager(order, manager);

    {
        const qx::UndoGroup group(manager, "Change the address"); // one step, however many changes
        buyer->setValueForKey("Mill Lane 3", "street");
        buyer->setValueForKey("Bath", "city");
    }
    order->setValueForKey("shipped", "state"); // a step of its own …
    manager->endEventGroup();                  // … which ends here

    manager->undo();                             // the state
    qx::String next = manager->undoActionName(); // "Change the address", for a menu
    manager->undo();                             // both keys of the address are gone
    bool canRedo = manager->canRedo();           // true
    manager->redo();                             // the address is back
    // end of sample
    EXPECT_TRUE(order->valueForKey("state").isNull());
    EXPECT_EQ(next, "Change the address");
    EXPECT_TRUE(canRedo);
    EXPECT_EQ(buyer->valueForKey("city"), qx::Value("Bath"));

    const auto lines = qx::make<qx::Array>();
    order->setValueForKey(lines, "lines");
    manager->removeAllActions();
    const auto line = qx::make<QXGenericRecord>();
    // sample: lists
    auto longer = order->valueForKey("lines").as<qx::Array>()->mutableCopy();
    longer->add(line);
    order->setValueForKey(longer, "lines"); // registered; adding to the old array would not be
    // end of sample
    manager->undo();
    EXPECT_EQ(order->valueForKey("lines").object(), lines.get());
    manager->removeAllActions();
}

// sample: vetoes
class Novel : public QXGenericRecord {
public:
    static std::vector<qx::String> notUndone() { return {"lastOpened", "window"}; }
    bool isPriceUndoable() const { return !valueForKey("sold").boolValue(); }
};

void registerNovel() {
    qx::Class::define<Novel, QXGenericRecord>("Novel")
        .classOperation<&Novel::notUndone>("disabledKeyPathsForUndoRegistration")
        .operation<&Novel::isPriceUndoable>("isUndoRegistrationEnabledForPrice");
}
// end of sample

// sample: host-class
class Person : public qx::UndoableObject {
public:
    void marry(const qx::String& newName) { // plain C++: announced by a scope
        const qx::ChangeScope scope(*this, "name");
        name = newName;
    }
    qx::String name;
    int age = 0;
};

void registerPerson() {
    qx::Class::define<Person, qx::UndoableObject>("Person")
        .property<&Person::name>("name")
        .property<&Person::age>("age");
}
// end of sample

TEST(RecordsPage, HostClassesAndVetoes) {
    registerNovel();
    registerPerson();
    const auto manager = qx::make<qx::UndoManager>();
    const auto novel = qx::make<Novel>();
    novel->setUndoManager(manager);
    novel->setValueForKey("today", "lastOpened");
    EXPECT_FALSE(manager->canUndo());
    novel->setValueForKey(12, "price");
    manager->undo();
    novel->setValueForKey(true, "sold");
    manager->removeAllActions();
    novel->setValueForKey(14, "price");
    EXPECT_FALSE(manager->canUndo());

    const auto person = qx::make<Person>();
    person->setUndoManager(manager);
    person->setValueForKey(30, "age");
    person->marry("Bennet");
    manager->undo();
    EXPECT_TRUE(person->name.isNull() && person->age == 0);
    manager->removeAllActions();
}

// sample: closing
class Editor {
public:
    ~Editor() {
        _manager->removeAllActions(); // first: an old value may hold the order, and so the manager
    }

private:
    qx::Ref<qx::UndoManager> _manager = qx::make<qx::UndoManager>();
    qx::Ref<QXGenericRecord> _order;
    // end of sample
public:
    void open(const qx::Ref<QXGenericRecord>& order) {
        _order = order;
        giveUndoManager(_order, _manager);
        const auto item = qx::make<QXGenericRecord>();
        item->setUndoManager(_manager);
        item->setValueForKey(_order, "order");
        _order->setValueForKey(item, "item");
        _manager->endEventGroup();
        _order->setValueForKey(nullptr, "item"); // in the manager only now, with the order
        _watched = _order;
    }
    qx::WeakRef<QXGenericRecord> watched() const { return _watched; }

private:
    qx::WeakRef<QXGenericRecord> _watched;
};

TEST(RecordsPage, Closing) {
    qx::WeakRef<QXGenericRecord> watched;
    {
        Editor editor;
        editor.open(qx::make<QXGenericRecord>());
        watched = editor.watched();
        EXPECT_TRUE(watched);
    }
    EXPECT_FALSE(watched);
}

TEST(RecordsPage, ChangeCache) {
    auto first = qx::make<QXGenericRecord>();
    auto second = qx::make<QXGenericRecord>();
    const qx::WeakRef<QXGenericRecord> watched(first);
    // sample: cache
    first->setValueForKey(second, "next"); // a ring …
    second->setValueForKey(first, "next");
    first->setValueForKey(nullptr, "next"); // … taken apart, but the cache of `first` has `second`

    first->setChangeCache(nullptr); // now both can go
    // end of sample
    first = nullptr;
    second = nullptr;
    EXPECT_FALSE(watched);
}

TEST(RecordsPage, Observation) {
    std::ostringstream out;
    const auto order = qx::make<QXGenericRecord>();
    const auto buyer = qx::make<QXGenericRecord>();
    order->setValueForKey(buyer, "buyer");
    buyer->setValueForKey("Bath", "city");
    // sample: observe
    qx::ObservationToken token = order->observe("buyer.city", [&](const qx::ValueChange& change) {
        out << change.oldValue.description().view() << " -> "
            << change.newValue.description().view() << '\n';
    });
    buyer->setValueForKey("York", "city");   // Bath -> York
    order->setValueForKey(nullptr, "buyer"); // York -> (null): the path leads nowhere now
    token.end();                             // or with the token's scope
    // end of sample
    order->setValueForKey(buyer, "buyer");
    order->setValueForKey(nullptr, "buyer");
    EXPECT_EQ(out.str(), "Bath -> York\nYork -> (null)\n");
    order->setChangeCache(nullptr);
}

// sample: observing-record
class Summary : public QXGenericRecord {
public:
    void priceChanged(const qx::Dictionary* change) {
        const qx::Value before = change->get(qx::ChangeKey::oldValue); // the null marker for null
        const qx::Value now = change->get(qx::ChangeKey::newValue);
        total += now.intValue() - before.intValue();
    }
    std::int64_t total = 0;
};

void registerSummary() {
    qx::Class::define<Summary, QXGenericRecord>("Summary").operation<&Summary::priceChanged>(
        "priceChanged:");
}
// end of sample

TEST(RecordsPage, ObservingRecord) {
    registerSummary();
    const auto item = qx::make<QXGenericRecord>();
    const auto items = qx::make<qx::Array>(std::initializer_list<qx::Value>{item});
    const auto summary = qx::make<Summary>();
    // sample: observe-objects
    summary->observeObjects(*items, "price", "priceChanged:");
    item->setValueForKey(40, "price"); // summary->total is 40
    item->setValueForKey(30, "price"); // … and 30
    summary->removeObservations(*items, "price");
    // end of sample
    EXPECT_EQ(summary->total, 30);
}

TEST(RecordsPage, Messages) {
    const auto order = qx::make<QXGenericRecord>();
    EXPECT_THROW(order->perform("number"), qx::Exception);
    // sample: messages
    qx::UserDefaults::standardUserDefaults()->setObject(true,
                                                        AllowMethodForwardingInGenericRecords);
    order->perform("setNumber:", "A-17");
    qx::Value number = order->perform("number"); // "A-17"
    order->perform("setNumber:", nullptr);       // removes it
    // end of sample
    qx::UserDefaults::standardUserDefaults()->removeObjectForKey(
        AllowMethodForwardingInGenericRecords);
    EXPECT_EQ(number, qx::Value("A-17"));
    EXPECT_TRUE(order->keys().empty());
}

} // namespace
