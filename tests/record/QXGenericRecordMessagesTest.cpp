#include <QXXMLMarshalling/QXGenericRecord.h>

#include "support/Texts.h"

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/host/UserDefaults.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Invocation.h>
#include <QXXMLMarshalling/observe/Observation.h>

#include <gtest/gtest.h>

#include <utility>

namespace {

using namespace qx;
using support::raised;
using Record = QXGenericRecord;

// Notes the changes that it is told of.
class View : public Record {
public:
    void noteChange(const Dictionary* change) {
        notes += String::concat(
            {change->get("old").description(), " > ", change->get("new").description(), "; "});
        if (then)
            then();
    }
    std::string takeNotes() { return std::exchange(notes, {}); }
    std::string notes;
    std::function<void()> then;
};

const bool described = [] {
    Class::define<View, Record>("QXGenericRecordMessagesTest.View")
        .operation<&View::noteChange>("noteChange:");
    return true;
}();

Ref<Record> place(const char* name) {
    auto record = Record::init();
    record->setValueForKey(name, "name");
    return record;
}

struct QXGenericRecordObservationTest : testing::Test {
    Ref<View> view = make<View>();
    Ref<Record> rome = place("Rome"), oslo = place("Oslo");
};

TEST_F(QXGenericRecordObservationTest, AnOperationIsCalledOnceForEachChange) {
    rome->setUndoManager(make<UndoManager>());
    view->observeObject(*rome, "name", "noteChange:");
    rome->setValueForKey("Roma", "name");
    rome->setValueForKey("Italy", "country");
    rome->undoManager()->undo();
    rome->undoManager()->redo();
    rome->setValueForKey(nullptr, "name");
    EXPECT_EQ(view->takeNotes(), "Rome > Roma; Roma > Rome; Rome > Roma; Roma > <null>; ");
    view->removeObservation(*rome, "name");
    rome->setValueForKey("Rome", "name");
    EXPECT_EQ(view->takeNotes(), "");
}

TEST_F(QXGenericRecordObservationTest, CollectionsAreObservedItemByItem) {
    const auto array = make<Array>(std::initializer_list<Value>{rome, "no object", oslo});
    const auto dictionary = make<Dictionary>();
    dictionary->set("oslo", oslo);
    view->observeObjects(*array, "name", "noteChange:");
    view->observeObjects(*dictionary, "name", "noteChange:");
    rome->setValueForKey("Roma", "name");
    oslo->setValueForKey("Christiania", "name");
    EXPECT_EQ(view->takeNotes(), "Rome > Roma; Oslo > Christiania; Oslo > Christiania; ");
    view->removeObservations(*array, "name");
    oslo->setValueForKey("Oslo", "name");
    EXPECT_EQ(view->takeNotes(), "Christiania > Oslo; ");
    view->removeObservations(*dictionary, "name");
    EXPECT_THROW(view->removeObservations(*array, "name"), Exception);
}

TEST_F(QXGenericRecordObservationTest, ARecordMayStopObservingWhileItIsToldAndMayGo) {
    view->observeObject(*rome, "name", "noteChange:");
    view->then = [&] { view->removeObservation(*rome, "name"); };
    rome->setValueForKey("Roma", "name");
    rome->setValueForKey("Rome", "name");
    EXPECT_EQ(view->takeNotes(), "Rome > Roma; ");
    view->observeObject(*rome, "name", "noteChange:");
    view = nullptr;
    rome->setValueForKey("Roma", "name");
}

// What is on here is off again afterwards.
struct QXGenericRecordForwardingTest : testing::Test {
    Ref<UserDefaults> defaults = UserDefaults::standardUserDefaults();
    Ref<Record> record = place("Rome");

    QXGenericRecordForwardingTest() {
        defaults->setObject("YES", AllowMethodForwardingInGenericRecords);
    }
    ~QXGenericRecordForwardingTest() override {
        defaults->removeObjectForKey(AllowMethodForwardingInGenericRecords);
    }
};

TEST_F(QXGenericRecordForwardingTest, MessagesRaiseThatCannotBeForwarded) {
    const std::string unanswered = "class QXGenericRecord does not answer the operation ";
    const struct {
        bool isAllowed;
        const char* message;
        std::vector<Value> arguments;
        std::string reason;
    } cases[] = {
        {false, "name", {}, unanswered + "name"},
        {true, "setName:country:", {"a", "b"}, unanswered + "setName:country:"},
        {true, "name", {1}, "the operation name takes 0 arguments, not 1"},
    };
    for (const auto& row : cases) {
        defaults->setObject(row.isAllowed, AllowMethodForwardingInGenericRecords);
        EXPECT_EQ(raised([&] { record->performWithArguments(row.message, row.arguments); }),
                  "NSInvalidArgumentException: " + row.reason);
        EXPECT_EQ(bool(record->methodSignatureForSelector("setName:")), row.isAllowed);
        EXPECT_TRUE(record->methodSignatureForSelector("className"));
    }
    // Signatures of the caller's own that fit neither a reading nor a writing.
    for (const auto& [message, arguments, returnsValue] :
         {std::tuple{"name", 0U, false}, {"name:", 1U, true}, {"setName:to:", 2U, false}}) {
        const auto invocation =
            make<Invocation>(make<MethodSignature>(arguments, returnsValue), record.get(), message,
                             std::vector<Value>(arguments));
        EXPECT_THROW(record->forwardInvocation(*invocation), Exception) << message;
    }
}

TEST_F(QXGenericRecordForwardingTest, MessagesWithOneArgumentWriteTheKeyThatTheyName) {
    const struct {
        const char* message;
        const char* key;
    } cases[] = {{"setTitle:", "title"},
                 {"title:", "title"},
                 {"setURL:", "uRL"},
                 {"setÄnderung:", "änderung"},
                 {"setup:", "up"},
                 {"set:", ""},
                 {"Set:", "Set"},
                 {"se:", "se"},
                 {":", ""},
                 {"setA:b", "a:b"}};
    int value = 0;
    for (const auto& row : cases) {
        EXPECT_TRUE(record->perform(row.message, ++value).isNull()) << row.message;
        EXPECT_EQ(record->valueForKey(row.key), Value(value)) << row.message;
    }
    record->perform("setTitle:", nullptr);
    EXPECT_FALSE(record->contents()->contains("title"));
    // A message that the record answers itself is not forwarded.
    record->perform("setClassName:", "Town");
    EXPECT_FALSE(record->contents()->contains("className"));
}

TEST_F(QXGenericRecordForwardingTest, MessagesWithoutArgumentsReadKeysAndPaths) {
    record->setValueForKey(place("Italy"), "within");
    EXPECT_EQ(record->perform("within.name"), Value("Italy"));
    EXPECT_TRUE(record->perform("setTitle").isNull());
    EXPECT_FALSE(record->respondsTo("name"));
    const auto signature = record->methodSignatureForSelector("name");
    EXPECT_EQ(signature->numberOfArguments(), 2U);
    EXPECT_NE(signature->methodReturnLength(), 0U);
}

TEST_F(QXGenericRecordForwardingTest, WhatEveryObjectAnswersIsNoKey) {
    EXPECT_EQ(record->perform("valueForKey:", "name"), Value("Rome"));
    EXPECT_EQ(record->perform("isEqual:", record), Value(true));
    record->perform("willChangeValueForKey:", "name");
    record->perform("_cacheValueForKey:", "name");
    EXPECT_EQ(record->changeCache()->get("name"), Value("Rome"));
    EXPECT_EQ(record->keys(), std::vector<String>{"name"});
}

TEST_F(QXGenericRecordForwardingTest, WhatIsWrittenByMessageIsUndoneAndMayBeAnUndoAction) {
    const auto manager = make<UndoManager>();
    record->setUndoManager(manager);
    record->perform("setName:", "Roma");
    manager->undo();
    EXPECT_EQ(record->valueForKey("name"), Value("Rome"));
    manager->prepareWithInvocationTarget(record.get()).perform("setName:", "Caput Mundi");
    manager->undo();
    EXPECT_EQ(record->valueForKey("name"), Value("Caput Mundi"));
}

} // namespace
