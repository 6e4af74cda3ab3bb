#include "platform/object/Warning.h"
#include "support/RandomHistory.h"

#include <QXXMLMarshalling/platform/Class.h>
#include <QXXMLMarshalling/platform/CountedSet.h>
#include <QXXMLMarshalling/platform/Format.h>
#include <QXXMLMarshalling/platform/Null.h>
#include <QXXMLMarshalling/platform/Observation.h>
#include <QXXMLMarshalling/platform/UndoableObject.h>

#include <gtest/gtest.h>

#include <random>

namespace {

using namespace qx;

class Person : public UndoableObject {
public:
    String name;
    String firstName;
    String nickName;
    String alias;
    int age = 0;
    Ref<Person> partner;
    bool vetoes = true;

    void rename(const String& newName) {
        const ChangeScope scope(*this, "name");
        name = newName;
    }
    bool isFirstnameUndoable() const { return !vetoes; }
    static Ref<CountedSet> disabledKeyPaths() {
        return make<CountedSet>(std::initializer_list<std::string_view>{"alias"});
    }
    static bool yes() { return true; }
};

const bool described = [] {
    Null::marker(); // lasts: made before a test counts it
    Class::define<Person, UndoableObject>("ChangeTrackingTest.Person")
        .property<&Person::name>("name")
        .property<&Person::firstName>("firstName")
        .property<&Person::nickName>("nickName")
        .property<&Person::alias>("alias")
        .property<&Person::age>("age")
        .property<&Person::partner>("partner")
        .operation<&Person::isFirstnameUndoable>("isUndoRegistrationEnabledForFirstname")
        .classOperation<&Person::yes>("isUndoRegistrationEnabledForNickname")
        .classOperation<&Person::disabledKeyPaths>("disabledKeyPathsForUndoRegistration");
    return true;
}();

struct ChangeTrackingTest : testing::Test {
    Ref<UndoManager> manager = make<UndoManager>();
    Ref<Person> person = make<Person>();

    ChangeTrackingTest() { person->setUndoManager(manager); }

    // Whether setting the key can be undone.
    bool registers(Key key, const Value& value) {
        person->setValueForKey(value, key);
        manager->endEventGroup();
        const bool can = manager->canUndo();
        manager->removeAllActions();
        return can;
    }
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

TEST_F(ChangeTrackingTest, OnlyRealChangesAreRegistered) {
    EXPECT_FALSE(registers("name", nullptr));
    EXPECT_TRUE(registers("name", "Ann"));
    EXPECT_FALSE(registers("name", String("An"
                                          "n")));
    EXPECT_TRUE(registers("name", nullptr));
    EXPECT_FALSE(registers("age", 0));
    EXPECT_FALSE(registers("age", 0.0));
    manager->disableUndoRegistration();
    EXPECT_FALSE(registers("name", "Bea"));
    EXPECT_EQ(person->name, "Bea");
}

TEST_F(ChangeTrackingTest, HooksKeepKeysOutOfUndo) {
    EXPECT_FALSE(registers("alias", "A"));     // listed by the class
    EXPECT_FALSE(registers("nickName", "N"));  // a class operation, although it says yes
    EXPECT_FALSE(registers("firstName", "F")); // the object says no
    person->vetoes = false;
    EXPECT_TRUE(registers("firstName", "G"));
    EXPECT_TRUE(person->isUndoRegistrationEnabledForKey(""));
    EXPECT_TRUE(person->isUndoRegistrationEnabledForKey("name"));
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

TEST_F(ChangeTrackingTest, FillingAnEmptyObjectWithoutUndoManagerAllocatesNothing) {
    const auto fresh = make<Person>();
    const auto before = Object::liveCount();
    fresh->setValueForKey("Ann", "name");
    fresh->setValueForKey(person, "partner");
    EXPECT_EQ(Object::liveCount(), before);
    EXPECT_TRUE(fresh->changeCache()->isEmpty());
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

TEST_F(ChangeTrackingTest, AnObjectThatDiesLeavesNoActions) {
    person->setValueForKey("Ann", "name");
    person = nullptr;
    EXPECT_FALSE(manager->canUndo());
}

std::vector<std::string> logged;

TEST_F(ChangeTrackingTest, EachRegistrationIsLoggedByWhatIsGoingOn) {
    logged.clear();
    installDebugSinkFinder([]() noexcept -> DebugSink {
        return [](std::string_view text, std::span<const Value> arguments) {
            logged.push_back(format(text, arguments).str());
        };
    });
    person->setValueForKey(7, "age");
    manager->undo();
    manager->redo();
    installDebugSinkFinder(nullptr);
    std::erase_if(logged, [](const std::string& line) { return line.starts_with('<'); });
    EXPECT_EQ(logged, (std::vector<std::string>{"Set for key: age existing: 0 value: 7",
                                                "Undo for key: age existing: 7 value: 0",
                                                "Redo for key: age existing: 0 value: 7"}));
}

TEST_F(ChangeTrackingTest, RandomHistoriesAgreeWithAPlainListOfStates) {
    const unsigned first = std::random_device()();
    for (unsigned seed = first; seed != first + 2000; ++seed) {
        std::vector<Ref<Object>> people(4);
        for (auto& one : people)
            one = make<Person>();
        support::RandomHistory history(
            seed, std::move(people),
            [](Object& object, const String& name) { static_cast<Person&>(object).rename(name); });
        ASSERT_TRUE(history.agreesFor(30)) << "seed " << seed;
    }
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
