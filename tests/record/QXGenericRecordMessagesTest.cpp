#include <QXXMLMarshalling/QXGenericRecord.h>

#include "undo/UndoSteps.h"

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/host/UserDefaults.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Invocation.h>
#include <QXXMLMarshalling/observe/Observation.h>

#include <gtest/gtest.h>

#include <optional>
#include <utility>

namespace {

using namespace qx;
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

// Messages are forwarded to keys while it lives, where they are allowed to.
struct Forwarding {
    explicit Forwarding(bool isAllowed) {
        UserDefaults::standardUserDefaults()->setObject(isAllowed,
                                                        AllowMethodForwardingInGenericRecords);
    }
    ~Forwarding() {
        UserDefaults::standardUserDefaults()->removeObjectForKey(
            AllowMethodForwardingInGenericRecords);
    }
};

class RecordSteps : public UndoSteps {
public:
    RecordSteps() {
        know("allow", [this](auto&) { _forwarding.emplace(true); });
        know("forbid", [this](auto&) { _forwarding.emplace(false); });
        know("keys", [this](auto& words) {
            for (const String& key : objects.at(words.at(0)).template as<Record>()->keys())
                say('"' + key.str() + '"');
        });
        know("cached", [this](auto& words) {
            const auto [object, key] = place(words.at(0));
            sayValue(Value(object).as<UndoableObject>()->changeCache()->get(key));
        });
    }

private:
    std::optional<Forwarding> _forwarding;
};
const bool added = support::addSteps<RecordSteps>("tests/record/records.md");

TEST(QXGenericRecordForwardingTest, OnlyWhatCanBeForwardedHasASignature) {
    const auto record = place("Rome");
    for (const bool isAllowed : {false, true}) {
        const Forwarding forwarding(isAllowed);
        EXPECT_EQ(bool(record->methodSignatureForSelector("setName:")), isAllowed);
        EXPECT_TRUE(record->methodSignatureForSelector("className"));
        EXPECT_FALSE(record->respondsTo("name"));
    }
    const Forwarding forwarding(true);
    const auto signature = record->methodSignatureForSelector("name");
    EXPECT_EQ(signature->numberOfArguments(), 2U);
    EXPECT_NE(signature->methodReturnLength(), 0U);
    // Signatures of the caller's own that fit neither a reading nor a writing.
    for (const auto& [message, arguments, returnsValue] :
         {std::tuple{"name", 0U, false}, {"name:", 1U, true}, {"setName:to:", 2U, false}}) {
        const auto invocation =
            make<Invocation>(make<MethodSignature>(arguments, returnsValue), record.get(), message,
                             std::vector<Value>(arguments));
        EXPECT_THROW(record->forwardInvocation(*invocation), Exception) << message;
    }
}

} // namespace
