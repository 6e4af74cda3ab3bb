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

// Keeps some of its keys out of undo.
class Book : public Record {
public:
    int age = 0; // where other records have a key
    bool allows = false;
    std::function<void()> whenAsked = [] {};
    bool titleIsUndoable() const { return allows; }
    bool nameIsUndoable() {
        whenAsked();
        return true;
    }
    static std::vector<String> disabled() { return {"mark"}; }
    static bool yes() { return true; }
};

class Reader : public UndoableObject {
public:
    String name;
    int age = 0;
    Value partner;
    std::function<void()> whenAsked = [] {};
    bool nameIsUndoable() {
        whenAsked();
        return true;
    }
};

// A record does at its keys what a host's class does at its properties.
struct Kind {
    Ref<Object> (*made)();
    Ref<Dictionary> (*cacheOf)(const Ref<Object>&);
    void (*setWhenAsked)(Object&, std::function<void()>);
};
template <class T>
constexpr Kind kindOf{[] { return Ref<Object>(make<T>()); },
                      [](const Ref<Object>& object) { return object.as<T>()->changeCache(); },
                      [](Object& object, std::function<void()> then) {
                          static_cast<T&>(object).whenAsked = std::move(then);
                      }};

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

TEST_F(QXGenericRecordUndoTest, WhatIsSetIsUndoneToldAndRememberedInBothKinds) {
    for (const Kind& kind : {kindOf<Book>, kindOf<Reader>}) {
        const auto object = kind.made();
        const auto cached = [&] { return kind.cacheOf(object)->get("name"); };
        std::string told;
        const auto token = object->observe("name", [&](const ValueChange& change) {
            told += String::concat(
                {change.oldValue.description(), ">", change.newValue.description(), " "});
        });
        object->setValueForKey("Emma", "name"); // without an undo manager
        EXPECT_EQ(cached().object(), Null::marker());
        object->setValueForKey("Eve", "name");
        EXPECT_EQ(cached(), Value("Emma")); // as it was before the latest change
        object->perform("setUndoManager:", manager);
        object->setValueForKey("Ann", "name");
        EXPECT_EQ(cached(), Value("Ann")); // which is what the next is undone to
        manager->endEventGroup();
        object->willChangeValueForKey("name");
        object->setValueForKey("Bea", "name");
        object->didChangeValueForKey("name");
        manager->undo();
        EXPECT_EQ(object->valueForKey("name"), Value("Ann"));
        manager->undo();
        EXPECT_EQ(object->valueForKey("name"), Value("Eve"));
        EXPECT_FALSE(manager->canUndo());
        manager->redo();
        EXPECT_EQ(cached(), Value("Ann"));
        manager->redo();
        EXPECT_EQ(object->valueForKey("name"), Value("Bea"));
        EXPECT_FALSE(manager->canRedo());
        EXPECT_EQ(told, "(null)>Emma Emma>Eve Eve>Ann Ann>Bea Bea>Ann Ann>Eve Eve>Ann Ann>Bea ");
        manager->removeAllActions();
        object->willChangeValueForKey("mood"); // no key that can be read
        object->didChangeValueForKey("mood");
        EXPECT_FALSE(manager->canUndo());
        object->perform("setUndoManager:", nullptr);
    }
}

TEST_F(QXGenericRecordUndoTest, AVetoMayThrowOrTakeTheManagerAway) {
    for (const Kind& kind : {kindOf<Book>, kindOf<Reader>}) {
        const auto object = kind.made();
        object->perform("setUndoManager:", manager);
        int told = 0;
        const auto token = object->observe("name", [&](const ValueChange&) { ++told; });
        kind.setWhenAsked(*object, [] { throw std::runtime_error("no"); });
        EXPECT_THROW(object->setValueForKey("a", "name"), std::runtime_error);
        EXPECT_EQ(object->valueForKey("name"), Value("a"));
        EXPECT_THROW(manager->undo(), std::runtime_error);
        EXPECT_TRUE(object->valueForKey("name").isNull());
        manager->removeAllActions();
        kind.setWhenAsked(*object, [&] { object->perform("setUndoManager:", nullptr); });
        object->setValueForKey("b", "name");
        object->setValueForKey("c", "name");
        EXPECT_EQ(told, 4);
        EXPECT_TRUE(manager->canUndo());
        manager->removeAllActions();
    }
}

TEST_F(QXGenericRecordUndoTest, ManySetsKeepABoundedNumberOfObjects) {
    manager->setLevelsOfUndo(100);
    for (const Kind& kind : {kindOf<Book>, kindOf<Reader>}) {
        const auto object = kind.made();
        object->perform("setUndoManager:", manager);
        const auto before = Object::liveCount();
        for (int i = 0; i < 20000; ++i) {
            object->setValueForKey(make<Object>(), "partner");
            manager->endEventGroup();
            if (i % 64 == 0)
                manager->undo();
        }
        EXPECT_LE(Object::liveCount() - before, 106);
        manager->removeAllActions();
    }
}

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

TEST_F(QXGenericRecordUndoTest, OnlyRealChangesAreRegistered) {
    EXPECT_FALSE(registers("name", nullptr));
    EXPECT_TRUE(registers("name", "Emma"));
    EXPECT_FALSE(registers("name", std::string("Emma")));
    EXPECT_TRUE(registers("name", nullptr));
    EXPECT_TRUE(registers("size", 3));
    EXPECT_FALSE(registers("size", 3.0));
    EXPECT_FALSE(registers("self", Null::marker())); // stands for null
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

TEST_F(QXGenericRecordUndoTest, TheClassOrTheRecordMayKeepKeysOutOfUndo) {
    const struct {
        const char* key;
        bool allows, registered;
    } cases[] = {
        {"name", false, true},
        {"mark", true, false},       // listed by the class
        {"shelf", true, false},      // a class operation, although it says yes
        {"mainTitle", false, false}, // the record's own operation, by the capitalized key
        {"mainTitle", true, true},
        {"main title", false, true}, // its operation would be …ForMain Title
        {"", false, true},
    };
    int value = 0;
    for (const auto& row : cases) {
        book->allows = row.allows;
        EXPECT_EQ(book->isUndoRegistrationEnabledForKey(row.key), row.registered) << row.key;
        EXPECT_EQ(registers(row.key, ++value), row.registered) << row.key;
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
        std::vector<Ref<Object>> objects{make<Record>(), make<Reader>(), make<Book>(),
                                         make<Reader>(), make<Record>()};
        RandomHistory history(seed, std::move(objects), [](Object& object, const String& name) {
            const ChangeScope scope(object, "name");
            if (auto* reader = dynamic_cast<Reader*>(&object))
                reader->name = name;
            else
                object.setValueForKey(name, "name");
        });
        ASSERT_TRUE(history.agreesFor(30)) << "seed " << seed;
    }
}

} // namespace
