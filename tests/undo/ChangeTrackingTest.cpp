// What is the same for records (vetoes, equal values, histories at random) is asked of both at
// once, in tests/record/QXGenericRecordUndoTest.cpp.

#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Null.h>
#include <QXXMLMarshalling/observe/Observation.h>
#include <QXXMLMarshalling/undo/UndoableObject.h>

#include <gtest/gtest.h>

#include <stdexcept>

namespace {

using namespace qx;

class Person : public UndoableObject {
public:
    String name;
    int age = 0;
    Ref<Person> partner;
    bool vetoThrows = false;

    bool isAgeUndoable() const {
        if (vetoThrows)
            throw std::runtime_error("no");
        return true;
    }

    void rename(const String& newName) {
        const ChangeScope scope(*this, "name");
        name = newName;
    }
};

const bool described = [] {
    Class::define<Person, UndoableObject>("ChangeTrackingTest.Person")
        .property<&Person::name>("name")
        .property<&Person::age>("age")
        .property<&Person::partner>("partner")
        .operation<&Person::isAgeUndoable>("isUndoRegistrationEnabledForAge");
    return true;
}();

struct ChangeTrackingTest : testing::Test {
    Ref<UndoManager> manager = make<UndoManager>();
    Ref<Person> person = make<Person>();

    ChangeTrackingTest() { person->setUndoManager(manager); }
};

TEST_F(ChangeTrackingTest, SettingsCanBeUndoneAndRedoneHoweverTheyAreMade) {
    person->setValueForKey("Ann", "name");
    manager->endEventGroup();
    person->rename("Bea");
    manager->undo();
    EXPECT_EQ(person->name, "Ann");
    manager->undo();
    EXPECT_EQ(person->name, nullptr);
    manager->redo();
    EXPECT_EQ(person->name, "Ann");
    EXPECT_EQ(person->changeCache()->get("name"), Value("Ann"));
    manager->redo();
    EXPECT_EQ(person->name, "Bea");
}

TEST_F(ChangeTrackingTest, TheCacheHoldsTheValuesBeforeTheLatestChange) {
    person->willChangeValueForKey("name");
    EXPECT_EQ(person->changeCache()->get("name").object(), Null::marker());
    person->name = "Ann";
    person->didChangeValueForKey("name");
    EXPECT_EQ(person->changeCache()->get("name"), Value("Ann"));
    person->willChange(ChangeKind::insertion, {}, "age");
    person->didChange(ChangeKind::insertion, {}, "age");
    EXPECT_EQ(person->changeCache()->get("age"), Value(0));
}

TEST_F(ChangeTrackingTest, ObserversAreToldOfUndoAndRedoToo) {
    std::string told;
    const auto token = person->observe("name", [&](const ValueChange& change) {
        told += String::concat(
            {change.oldValue.description(), ">", change.newValue.description(), " "});
    });
    person->setValueForKey("Ann", "name");
    manager->undo();
    manager->redo();
    EXPECT_EQ(told, "(null)>Ann Ann>(null) (null)>Ann ");
}

TEST_F(ChangeTrackingTest, AVetoMayThrowAndAnAnnouncedKeyNeedNotBeReadable) {
    int told = 0;
    const auto token = person->observe("age", [&](const ValueChange&) { ++told; });
    person->vetoThrows = true;
    EXPECT_THROW(person->setValueForKey(7, "age"), std::runtime_error);
    EXPECT_EQ(person->age, 7);
    EXPECT_EQ(told, 1);
    EXPECT_THROW(manager->undo(), std::runtime_error);
    EXPECT_EQ(person->age, 0);
    manager->removeAllActions();
    person->willChangeValueForKey("mood");
    person->didChangeValueForKey("mood");
    EXPECT_FALSE(manager->canUndo());
}

TEST_F(ChangeTrackingTest, ManySetsKeepABoundedNumberOfObjects) {
    manager->setLevelsOfUndo(100);
    const auto before = Object::liveCount();
    for (int i = 0; i < 50000; ++i) {
        person->setValueForKey(make<Person>(), "partner");
        manager->endEventGroup();
        if (i % 64 == 0)
            manager->undo();
    }
    EXPECT_LE(Object::liveCount() - before, 104);
}

} // namespace
