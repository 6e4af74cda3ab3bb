#include <QXXMLMarshalling/QXGenericRecord.h>

#include "support/Texts.h"

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/host/UserDefaults.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Invocation.h>
#include <QXXMLMarshalling/observe/Observation.h>

#include <gtest/gtest.h>

namespace {

using namespace qx;
using support::raised;
using Record = QXGenericRecord;
using Texts = std::vector<std::string>;

// Notes the changes that it is told of.
class View : public Record {
public:
    void noteChange(const Dictionary* change) {
        notes.push_back(String::concat({change->get("old").description(), " > ",
                                        change->get("new").description()})
                            .str());
        if (then)
            then();
    }
    Texts notes;
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

TEST(QXGenericRecordObservationTest, AnOperationIsCalledOnceForEachChange) {
    const auto view = make<View>();
    const auto rome = place("Rome");
    rome->setUndoManager(make<UndoManager>());
    view->observeObject(*rome, "name", "noteChange:");
    rome->setValueForKey("Roma", "name");
    rome->setValueForKey("Italy", "country");
    rome->undoManager()->undo();
    rome->undoManager()->redo();
    rome->setValueForKey(nullptr, "name");
    EXPECT_EQ(view->notes, (Texts{"Rome > Roma", "Roma > Rome", "Rome > Roma", "Roma > <null>"}));
    view->removeObservation(*rome, "name");
    rome->setValueForKey("Rome", "name");
    EXPECT_EQ(view->notes.size(), 4U);
}

TEST(QXGenericRecordObservationTest, CollectionsAreObservedItemByItem) {
    const auto view = make<View>();
    const auto rome = place("Rome");
    const auto oslo = place("Oslo");
    const auto array = make<Array>(std::initializer_list<Value>{rome, "no object", oslo});
    const auto dictionary = make<Dictionary>();
    dictionary->set("oslo", oslo);
    view->observeObjects(*array, "name", "noteChange:");
    view->observeObjects(*dictionary, "name", "noteChange:");
    rome->setValueForKey("Roma", "name");
    oslo->setValueForKey("Christiania", "name");
    EXPECT_EQ(view->notes, (Texts{"Rome > Roma", "Oslo > Christiania", "Oslo > Christiania"}));
    view->removeObservations(*array, "name");
    oslo->setValueForKey("Oslo", "name");
    EXPECT_EQ(view->notes.size(), 4U);
    view->removeObservations(*dictionary, "name");
    EXPECT_THROW(view->removeObservations(*array, "name"), Exception);
}

TEST(QXGenericRecordObservationTest, ARecordMayStopObservingWhileItIsToldAndMayGo) {
    const auto rome = place("Rome");
    auto view = make<View>();
    view->observeObject(*rome, "name", "noteChange:");
    view->then = [&] { view->removeObservation(*rome, "name"); };
    rome->setValueForKey("Roma", "name");
    rome->setValueForKey("Rome", "name");
    EXPECT_EQ(view->notes, Texts{"Rome > Roma"});
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

TEST_F(QXGenericRecordForwardingTest, AccessorMessagesRaiseWhileTheUserDefaultIsNo) {
    EXPECT_EQ(record->perform("name"), Value("Rome"));
    defaults->setObject(false, AllowMethodForwardingInGenericRecords);
    EXPECT_EQ(raised([&] { record->perform("name"); }),
              "NSInvalidArgumentException: class QXGenericRecord does not answer the operation "
              "name");
    EXPECT_FALSE(record->methodSignatureForSelector("setName:"));
    EXPECT_TRUE(record->methodSignatureForSelector("className"));
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

TEST_F(QXGenericRecordForwardingTest, OtherMessagesAreNeverForwarded) {
    EXPECT_EQ(raised([&] { record->perform("setName:country:", "a", "b"); }),
              "NSInvalidArgumentException: class QXGenericRecord does not answer the operation "
              "setName:country:");
    EXPECT_EQ(raised([&] { record->perform("name", 1); }),
              "NSInvalidArgumentException: the operation name takes 0 arguments, not 1");
    // Signatures of the caller's own that fit neither a reading nor a writing.
    const struct {
        const char* message;
        std::size_t arguments;
        bool returnsValue;
    } cases[] = {{"name", 0, false}, {"name:", 1, true}, {"setName:to:", 2, false}};
    for (const auto& row : cases) {
        const std::vector<Value> arguments(row.arguments);
        const auto invocation =
            make<Invocation>(make<MethodSignature>(row.arguments, row.returnsValue), record.get(),
                             row.message, arguments);
        EXPECT_THROW(record->forwardInvocation(*invocation), Exception) << row.message;
    }
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
