#include <QXXMLMarshalling/QXGenericRecord.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/observe/Observation.h>

#include "base/BulkObjects.h"

#include <gtest/gtest.h>

#include <regex>
#include <thread>

namespace {

using namespace qx;
using Record = QXGenericRecord;

// A record that handles one key itself and announces its changes itself.
class Book : public Record {
public:
    int pages = 0;
    static Ref<CountedSet> known() {
        return make<CountedSet>(std::initializer_list<std::string_view>{"pages"});
    }
};

// The same, with the keys in an array.
class Leaflet : public Book {
public:
    static std::vector<String> knownToo() { return {"pages"}; }
};

const bool described = [] {
    Class::define<Book, Record>("Book")
        .property<&Book::pages>("pages")
        .classOperation<&Book::known>("allKnownKeyPaths");
    Class::define<Leaflet, Book>("Leaflet").classOperation<&Leaflet::knownToo>("allKnownKeyPaths");
    return true;
}();

TEST(QXGenericRecordTest, WhoeverIsToldOfAChangeMayTakeTheContentsAway) {
    const auto record = make<Record>();
    record->setValueForKey("old", "title");
    const auto token = record->observe(
        "title", [&](const ValueChange&) { record->setContents(nullptr); },
        Observing::prior | Observing::newValue);
    record->setValueForKey("new", "title");
    EXPECT_FALSE(record->contents());
    record->setValueForKey("new", "other");
    EXPECT_EQ(record->keys(), std::vector<String>{"other"});
}

TEST(QXGenericRecordTest, FiveKeysArePropertiesAndNoContent) {
    const auto record = make<Record>();
    const auto contents = make<Dictionary>(), cache = make<Dictionary>();
    const auto manager = make<UndoManager>();
    record->setValueForKey(contents, "contents");
    record->setValueForKey("Order", "className");
    record->setValueForKey(false, "notifyBindingsObservers");
    record->setValueForKey(manager, "undoManager");
    EXPECT_EQ(record->classNameForMarshalling(), "Order");
    EXPECT_FALSE(record->notifyBindingsObservers());
    EXPECT_EQ(record->valueForKey("undoManager").object(), manager.get());
    EXPECT_EQ(record->contents(), contents);
    EXPECT_TRUE(contents->isEmpty());
    // Announcing the change must not put the cache into itself.
    EXPECT_EQ(record->trySetValueForKey("text", "changeCache"), SetOutcome::refused);
    EXPECT_FALSE(record->changeCache()->contains("changeCache"));
    manager->removeAllActions();
    record->setValueForKey(cache, "changeCache");
    EXPECT_EQ(record->changeCache(), cache);
    EXPECT_TRUE(cache->isEmpty());
    EXPECT_FALSE(manager->canUndo());
}

TEST(QXGenericRecordTest, ACopyHasItsOwnDictionaryAndNoHistory) {
    const auto author = make<Record>();
    const auto book = make<Book>();
    book->setClassName(std::string("a name of its own"));
    book->setNotifyBindingsObservers(false);
    book->setUndoManager(make<UndoManager>());
    book->setValueForKey(author, "author");
    const auto copy = book->copyWithZone();
    EXPECT_EQ(&copy->isa(), &book->isa());
    EXPECT_EQ(copy->className().view().data(), book->className().view().data());
    EXPECT_FALSE(copy->notifyBindingsObservers());
    EXPECT_FALSE(copy->undoManager());
    EXPECT_TRUE(copy->changeCache()->isEmpty());
    copy->setValueForKey("new", "title");
    EXPECT_TRUE(book->valueForKey("title").isNull());
    EXPECT_EQ(copy->valueForKey("author").object(), author.get());
    EXPECT_FALSE(make<Record>()->copyWithZone()->contents());
    EXPECT_TRUE(book->perform("copyWithZone:", nullptr).as<Book>());
    struct Undescribed : Record {};
    EXPECT_THROW(make<Undescribed>()->copyWithZone(), Exception);
}

TEST(QXGenericRecordTest, ACopyIsDeepWhereTheHostSaysHow) {
    struct Restore {
        ~Restore() { Dictionary::setDeepCopyFunction(nullptr); }
    } restore;
    Dictionary::setDeepCopyFunction([](const Dictionary& dictionary) {
        const auto copy = make<Dictionary>();
        for (const auto& entry : dictionary)
            if (const auto record = entry.value.as<Record>())
                copy->set(entry.key, record->copyWithZone());
        return copy;
    });
    const auto book = make<Record>();
    book->setValueForKey(make<Record>(), "author");
    const auto copy = book->copyWithZone();
    EXPECT_TRUE(copy->valueForKey("author").as<Record>());
    EXPECT_NE(copy->valueForKey("author").object(), book->valueForKey("author").object());
}

TEST(QXGenericRecordTest, TheDescriptionTellsClassNameAndContentsWhereThereAreAny) {
    const auto printed = [](const Ref<Record>& record) {
        return std::regex_replace(record->description().str(), std::regex("0x[0-9a-f]+"), "...");
    };
    const auto book = make<Book>();
    book->setContents(make<Dictionary>());
    for (const String& name : {String(), String("Book"), String("")}) {
        book->setClassName(name);
        EXPECT_EQ(printed(book), "<Book: ...>") << name.view();
    }
    book->setClassName("Novel");
    book->setValueForKey("t", "title");
    EXPECT_EQ(printed(book), "<Book: ...> className: Novel contents:\n"
                             "{\n    title = t;\n}");
    EXPECT_EQ(book->perform("description"), Value(book->description()));
    // A ring of records is printed once.
    const auto one = make<Record>(), two = make<Record>();
    one->setValueForKey(two, "next");
    two->setValueForKey(one, "next");
    EXPECT_EQ(printed(one), "<QXGenericRecord: ...> contents:\n"
                            "{\n"
                            "    next = <QXGenericRecord: ...> contents:\n"
                            "    {\n"
                            "        next = <QXGenericRecord: ...> contents:\n"
                            "...;\n"
                            "    };\n"
                            "}");
    two->setContents(nullptr);
}

TEST(QXGenericRecordTest, RecordsOutliveTheThreadThatMadeThemTogetherAndEndElsewhere) {
    struct alignas(64) Wide : Record {
        char bytes[64] = {};
    };
    std::vector<Ref<Record>> kept;
    std::thread([&] {
        const BulkObjects bulk;
        for (int i = 0; i < 2000; ++i) {
            auto record = i % 10 == 0 ? Ref<Record>(make<Wide>()) : make<Record>();
            record->setValueForKey(i, "number");
            const auto address = reinterpret_cast<std::uintptr_t>(record.get());
            EXPECT_EQ(address % (i % 10 == 0 ? 64 : 16), 0U);
            if (i % 3 == 0)
                kept.push_back(std::move(record));
        }
    }).join();
    kept.front()->setValueForKey(make<Array>(std::vector<Value>(1000, "x")), "list");
    EXPECT_EQ(kept.back()->get<int>("number"), 1998);
}

} // namespace
