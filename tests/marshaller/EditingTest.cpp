// Documents are read, edited and written: undoing all that was edited gives the text again that
// they would have been written with.

#include "support/Page.h"
#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/undo/UndoableObject.h>

#include <functional>
#include <random>

namespace {

using qx::Ref;
using qx::UndoManager;
using qx::Value;

class Line : public qx::UndoableObject {
public:
    qx::String text;
    int count = 0;
    Value unboundChildren, unboundAttributes, namespaces;
    bool isRemovable() const { return false; }
};

// Takes part in undo while it is read: it answers rootObject.
class Page : public qx::UndoableObject {
public:
    qx::String title, text;
    const qx::Object* rootObject() const { return this; }
};

const bool described = [] {
    qx::Class::define<Line, qx::UndoableObject>("EditingTest.Line")
        .property<&Line::text>("text")
        .property<&Line::count>("count")
        .property<&Line::unboundChildren>("unboundChildren")
        .property<&Line::unboundAttributes>("unboundAttributes")
        .property<&Line::namespaces>("__namespaces")
        .operation<&Line::isRemovable>("isRemovable");
    qx::Class::define<Page, qx::UndoableObject>("EditingTest.Page")
        .property<&Page::title>("title")
        .property<&Page::text>("text")
        .operation<&Page::rootObject>("rootObject");
    return true;
}();

const auto blocks = support::blocksOf(QX_SOURCE_DIR "/tests/marshaller/editing.md");
const std::string &mapping = blocks.at(0).text, &document = blocks.at(1).text;

TEST(EditingTest, UndoneToTheStartADocumentIsWrittenAsBeforeAndRedoneAsAfter) {
    const auto marshaller = scenario::marshaller(mapping);
    const unsigned first = std::random_device()();
    for (unsigned seed = first; seed != first + 200; ++seed) {
        SCOPED_TRACE("seed " + std::to_string(seed));
        std::mt19937 random(seed);
        const auto below = [&](std::size_t limit) { return random() % limit; };
        const auto manager = qx::make<UndoManager>();
        const auto order = marshaller->readString(document);
        const auto item = [&](const char* list, std::size_t index) {
            return order->valueForKey(list).as<qx::Array>()->at(index);
        };
        const Value owner = order->valueForKey("owner"), note = item("notes", 0);
        const Value lines[] = {item("lines", 0), item("lines", 1)};
        for (const Value& object : {Value(order), owner, note, lines[0], lines[1]})
            object.object()->perform("setUndoManager:", manager);

        const auto word = [&]() -> Value {
            if (below(3) == 0)
                return nullptr;
            return std::string(1 + below(3), static_cast<char>('a' + below(26)));
        };
        const auto number = [&]() -> Value { return below(100); };
        // What has no unknown XML may stand in several places.
        const auto list = [&](const Value& head, const Value& repeated) {
            return [&]() -> Value {
                if (below(4) == 0)
                    return nullptr;
                std::vector<Value> items(below(3), repeated);
                items.insert(items.begin() + below(items.size() + 1), below(2), head);
                return qx::make<qx::Array>(items);
            };
        };
        const struct {
            Value object;
            const char* key;
            std::function<Value()> value;
        } edits[] = {
            {order, "title", word},
            {order, "novel", word},
            {owner, "name", word},
            {owner, "count", number},
            {lines[0], "text", word},
            {lines[0], "count", number},
            {lines[1], "text", word},
            {lines[1], "count", number},
            {note, "text", word},
            {order, "lines", list(lines[0], lines[1])},
            {order, "notes", list(note, note)},
        };
        const auto text = [&] { return scenario::write(*marshaller, order); };
        const std::string before = text();
        ASSERT_EQ(before.find("<order"), 0U) << before;
        for (int i = 0; i < 40; ++i) {
            const auto& [object, key, value] = edits[below(std::size(edits))];
            object.object()->setValueForKey(value(), key);
            if (below(3) == 0)
                manager->endEventGroup();
        }
        const std::string after = text();
        while (manager->canUndo())
            manager->undo();
        ASSERT_EQ(text(), before);
        while (manager->canRedo())
            manager->redo();
        ASSERT_EQ(text(), after);
        manager->removeAllActions();
    }
}

// Whether it succeeds or fails halfway: what a class registers while it is read is one step. A host
// that reads between two changes of one event undoes both at once, and the reading with them.
TEST(EditingTest, OneReadingIsOneStepToUndoAndStaysInTheGroupOfTheEventAroundIt) {
    const auto marshaller = scenario::marshaller(mapping);
    const Ref<UndoManager>& manager = marshaller->undoManager();
    const auto undone = qx::make<qx::Array>();
    for (const std::size_t changes : {0U, 1U}) {
        const auto change = [&] {
            if (changes != 0)
                manager->registerUndo(*undone, [](qx::Array& array) { array.add(1); });
        };
        change();
        const auto page =
            marshaller->readString("<page title='t'><text>x</text></page>").as<Page>();
        EXPECT_EQ(page->undoManager(), manager);
        EXPECT_EQ(manager->groupingLevel(), changes);
        change();
        manager->undo();
        EXPECT_EQ(undone->count(), 2 * changes);
        EXPECT_TRUE(page->title.isNull() && page->text.isNull());
        EXPECT_FALSE(manager->canUndo());
        change();
        EXPECT_FALSE(marshaller->readString("<page title='t'/>"));
        EXPECT_EQ(manager->groupingLevel(), changes);
        manager->endEventGroup();
        EXPECT_EQ(manager->canUndo(), changes != 0); // without the page, which was dropped
    }
}

TEST(EditingTest, RecordsAreNotHandedTheMarshallersUndoManager) {
    const auto marshaller = scenario::marshaller(mapping);
    const auto order = marshaller->readString(document).as<QXGenericRecord>();
    EXPECT_FALSE(order->undoManager());
    EXPECT_FALSE(marshaller->undoManager()->canUndo());
}

} // namespace
