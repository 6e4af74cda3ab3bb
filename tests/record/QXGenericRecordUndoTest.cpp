#include <QXXMLMarshalling/QXGenericRecord.h>

#include "record/RandomHistory.h"

#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Null.h>
#include <QXXMLMarshalling/observe/Observation.h>
#include <QXXMLMarshalling/undo/UndoableObject.h>

#include <gtest/gtest.h>

#include <chrono>
#include <functional>
#include <random>
#include <stdexcept>

namespace {

using namespace qx;
using Record = QXGenericRecord;

// A record or a host's object that is asked whether its name is undone.
template <class Base>
class Asked : public Base {
public:
    int age = 0; // where other records have a key
    std::function<void()> whenAsked = [] {};
    bool nameIsUndoable() {
        whenAsked();
        return true;
    }
};

// Keeps some of its keys out of undo.
class Book : public Asked<Record> {
public:
    bool allows = false;
    bool titleIsUndoable() const { return allows; }
    static std::vector<String> disabled() { return {"mark"}; }
    static bool yes() { return true; }
};

class Reader : public Asked<UndoableObject> {
public:
    String name;
    Value partner;
};

const bool described = [] {
    Class::define<Book, Record>("QXGenericRecordUndoTest.Book")
        .property<&Book::age>("age")
        .operation<&Book::nameIsUndoable>("isUndoRegistrationEnabledForName")
        .operation<&Book::titleIsUndoable>("isUndoRegistrationEnabledForMaintitle")
        .classOperation<&Book::yes>("isUndoRegistrationEnabledForShelf")
        .classOperation<&Book::disabled>("disabledKeyPathsForUndoRegistration");
    Class::define<Reader, UndoableObject>("QXGenericRecordUndoTest.Reader")
        .property<&Reader::name>("name")
        .property<&Reader::age>("age")
        .property<&Reader::partner>("partner")
        .operation<&Reader::nameIsUndoable>("isUndoRegistrationEnabledForName");
    return true;
}();

// A record does at its keys what a host's class does at its properties.
template <class T>
struct ChangeTrackingTest : testing::Test {
    Ref<UndoManager> manager = make<UndoManager>();
    Ref<T> object = make<T>();
    std::string told;
    ObservationToken token = object->observe("name", [this](const ValueChange& change) {
        told += String::concat(
            {change.oldValue.description(), ">", change.newValue.description(), " "});
    });

    ~ChangeTrackingTest() override { manager->removeAllActions(); }
    Value get() const { return object->valueForKey("name"); }
    void set(const Value& name) { object->setValueForKey(name, "name"); }
    Value cached() const { return object->changeCache()->get("name"); }
};
using Kinds = testing::Types<Book, Reader>;
TYPED_TEST_SUITE(ChangeTrackingTest, Kinds, );

TYPED_TEST(ChangeTrackingTest, WhatIsSetIsUndoneToldAndRemembered) {
    this->set("Emma"); // without an undo manager
    EXPECT_EQ(this->cached().object(), Null::marker());
    this->set("Eve");
    EXPECT_EQ(this->cached(), Value("Emma")); // as it was before the latest change
    this->object->setUndoManager(this->manager);
    this->set("Ann");
    EXPECT_EQ(this->cached(), Value("Ann")); // which is what the next is undone to
    this->manager->endEventGroup();
    this->object->willChangeValueForKey("name");
    this->set("Bea");
    this->object->didChangeValueForKey("name");
    this->manager->undo();
    EXPECT_EQ(this->get(), Value("Ann"));
    this->manager->undo();
    EXPECT_EQ(this->get(), Value("Eve"));
    EXPECT_FALSE(this->manager->canUndo());
    this->manager->redo();
    EXPECT_EQ(this->cached(), Value("Ann"));
    this->manager->redo();
    EXPECT_EQ(this->get(), Value("Bea"));
    EXPECT_FALSE(this->manager->canRedo());
    EXPECT_EQ(this->told, "(null)>Emma Emma>Eve Eve>Ann Ann>Bea Bea>Ann Ann>Eve Eve>Ann Ann>Bea ");
    this->manager->removeAllActions();
    this->object->willChangeValueForKey("mood"); // no key that can be read
    this->object->didChangeValueForKey("mood");
    EXPECT_FALSE(this->manager->canUndo());
}

TYPED_TEST(ChangeTrackingTest, AVetoMayThrowOrTakeTheManagerAway) {
    this->object->setUndoManager(this->manager);
    this->object->whenAsked = [] { throw std::runtime_error("no"); };
    EXPECT_THROW(this->set("a"), std::runtime_error);
    EXPECT_EQ(this->get(), Value("a"));
    EXPECT_THROW(this->manager->undo(), std::runtime_error);
    EXPECT_TRUE(this->get().isNull());
    this->manager->removeAllActions();
    this->object->whenAsked = [this] { this->object->setUndoManager(nullptr); };
    this->set("b");
    this->set("c");
    EXPECT_EQ(this->told, "(null)>a a>(null) (null)>b b>c ");
    EXPECT_TRUE(this->manager->canUndo());
}

TYPED_TEST(ChangeTrackingTest, ManySetsKeepABoundedNumberOfObjects) {
    this->manager->setLevelsOfUndo(100);
    this->object->setUndoManager(this->manager);
    const auto before = Object::liveCount();
    for (int i = 0; i < 20000; ++i) {
        this->object->setValueForKey(make<Object>(), "partner");
        this->manager->endEventGroup();
        if (i % 64 == 0)
            this->manager->undo();
    }
    EXPECT_LE(Object::liveCount() - before, 106);
}

struct QXGenericRecordUndoTest : testing::Test {
    Ref<UndoManager> manager = make<UndoManager>();
    Ref<Book> book = make<Book>();

    QXGenericRecordUndoTest() { book->setUndoManager(manager); }

    // Whether setting the key can be undone.
    bool registers(Key key, const Value& value) {
        book->setValueForKey(value, key);
        manager->endEventGroup();
        const bool can = manager->canUndo();
        manager->removeAllActions();
        return can;
    }
};

TEST_F(QXGenericRecordUndoTest, WhatWasNotAnnouncedIsNoChangeAndWhatWasDroppedStaysSo) {
    const auto record = make<Record>();
    record->setValueForKey(1, "a");
    record->setContents(record->contents()->mutableCopy());
    record->contents()->set("b", 2);
    EXPECT_EQ(record->changeCache()->allKeys()->count(), 1U);
    record->setChangeCache(nullptr);
    EXPECT_TRUE(record->changeCache()->isEmpty());
}

TEST_F(QXGenericRecordUndoTest, AKeyThatComesBackHasItsPlaceAgain) {
    for (const int size : {3, 8, 500}) {
        const auto record = make<Record>();
        for (int i = 0; i < size; ++i)
            record->setValueForKey(i, std::to_string(i));
        record->setUndoManager(manager);
        const std::vector<String> keys = record->keys();
        {
            const UndoGroup group(manager);
            for (int i = 0; i < size; i += 2)
                record->setValueForKey(nullptr, std::to_string(i));
            for (int i = 0; i < size; ++i)
                record->setValueForKey(i, "new" + std::to_string(i));
        }
        const std::vector<String> changed = record->keys();
        for (int round = 0; round < 2; ++round) {
            manager->undo();
            EXPECT_EQ(record->keys(), keys);
            manager->redo();
            EXPECT_EQ(record->keys(), changed);
        }
    }
}

TEST_F(QXGenericRecordUndoTest, KeysComeAndGoBesideManyOthers) {
    const auto record = make<Record>();
    for (int i = 0; i < 100000; ++i)
        record->setValueForKey(i, std::to_string(i));
    const auto begin = std::chrono::steady_clock::now();
    for (int i = 0; i < 20000; ++i) {
        record->setValueForKey(nullptr, "50000");
        record->setValueForKey(i, "50000");
    }
    EXPECT_LT(std::chrono::steady_clock::now() - begin, std::chrono::seconds(5));
    record->setUndoManager(manager);
    for (int i = 0; i < 2000; ++i)
        record->setValueForKey(nullptr, std::to_string(i));
    manager->undo();
    manager->redo();
    manager->undo();
    EXPECT_EQ(record->keys()[50000], "50000");
}

TEST_F(QXGenericRecordUndoTest, AnObserverThatThrowsDoesNotStopUndoOrRedo) {
    const auto token = book->observe("b", [&](const ValueChange&) {
        if (manager->isUndoing() || manager->isRedoing())
            throw std::runtime_error("observer");
    });
    for (const char* key : {"a", "b", "c"})
        book->setValueForKey(key, key);
    const std::vector<String> keys = book->keys();
    for (int round = 0; round < 2; ++round) {
        EXPECT_THROW(manager->undo(), std::runtime_error);
        EXPECT_TRUE(book->keys().empty());
        EXPECT_THROW(manager->redo(), std::runtime_error);
        EXPECT_EQ(book->keys(), keys);
    }
}

TEST_F(QXGenericRecordUndoTest, WithoutRegistrationValuesChangeAndObserversAreTold) {
    int told = 0;
    const auto token = book->observe("name", [&](const ValueChange&) { ++told; });
    manager->disableUndoRegistration();
    EXPECT_FALSE(registers("name", "Emma"));
    manager->enableUndoRegistration();
    book->setUndoManager(nullptr);
    EXPECT_FALSE(registers("name", "Persuasion"));
    EXPECT_EQ(told, 2);
    // What changed meanwhile is where undoing ends.
    book->setUndoManager(manager);
    book->setValueForKey("Emma", "name");
    manager->undo();
    EXPECT_EQ(book->valueForKey("name"), Value("Persuasion"));
}

TEST_F(QXGenericRecordUndoTest, RealChangesOfKeysThatTheClassAndTheRecordAllowAreRegistered) {
    const struct {
        const char* key;
        Value value;
        bool allows, registered;
    } cases[] = {
        {"name", nullptr, false, false},
        {"name", "Emma", false, true},
        {"name", std::string("Emma"), false, false},
        {"name", nullptr, false, true},
        {"size", 3, false, true},
        {"size", 3.0, false, false},
        {"self", Null::marker(), false, false}, // stands for null
        {"mark", 1, true, false},               // listed by the class
        {"shelf", 1, true, false},              // a class operation, although it says yes
        {"mainTitle", 1, false, false}, // the record's own operation, by the capitalized key
        {"mainTitle", 2, true, true},
        {"main title", 1, false, true}, // its operation would be …ForMain Title
        {"", 1, false, true},
    };
    for (const auto& row : cases) {
        book->allows = row.allows;
        EXPECT_EQ(registers(row.key, row.value), row.registered)
            << row.key << row.value.description().view();
    }
    EXPECT_FALSE(book->isUndoRegistrationEnabledForKey("mark"));
}

// That a new collection is: docs/records.md.
TEST_F(QXGenericRecordUndoTest, ItemsOfACollectionAreRememberedButNotRegistered) {
    const auto chapters = make<Array>(std::initializer_list<Value>{"one"});
    book->setContents(make<Dictionary>());
    book->contents()->set("chapters", chapters);
    const std::size_t indexes[] = {1};
    book->willChange(ChangeKind::insertion, indexes, "chapters");
    chapters->add("two");
    book->didChange(ChangeKind::insertion, indexes, "chapters");
    EXPECT_EQ(book->changeCache()->get("chapters").object(), chapters.get());
    EXPECT_FALSE(manager->canUndo());
}

TEST_F(QXGenericRecordUndoTest, FillingAFreshRecordMakesNothingButItsContents) {
#ifdef NDEBUG
    GTEST_SKIP() << "objects are counted in debug builds only";
#endif
    const auto fresh = make<Record>();
    const auto before = Object::liveCount();
    for (const char* key : {"name", "size", "shelf"})
        fresh->setValueForKey(book, key);
    EXPECT_EQ(Object::liveCount(), before + 1);
}

TEST_F(QXGenericRecordUndoTest, RandomHistoriesOfRecordsAndHostObjectsAgreeWithAList) {
    const unsigned seeds = std::random_device()();
    for (unsigned seed = seeds; seed != seeds + 3000; ++seed) {
        RandomHistory history(
            seed, {make<Record>(), make<Reader>(), make<Book>(), make<Reader>(), make<Record>()});
        ASSERT_TRUE(history.agreesFor(30)) << "seed " << seed;
    }
}

} // namespace
