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
    Class::define<Book, Record>("Novel")
        .property<&Book::age>("age")
        .property<&Book::allows>("allows")
        .operation<&Book::nameIsUndoable>("isUndoRegistrationEnabledForName")
        .operation<&Book::titleIsUndoable>("isUndoRegistrationEnabledForMaintitle")
        .classOperation<&Book::yes>("isUndoRegistrationEnabledForShelf")
        .classOperation<&Book::disabled>("disabledKeyPathsForUndoRegistration");
    Class::define<Reader, UndoableObject>("Reader")
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
};
using Kinds = testing::Types<Book, Reader>;
TYPED_TEST_SUITE(ChangeTrackingTest, Kinds, );

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
