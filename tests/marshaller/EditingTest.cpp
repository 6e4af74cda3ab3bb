// Documents are read, edited and written: undoing all that was edited gives the text again that
// they would have been written with.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/undo/UndoableObject.h>

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

constexpr const char* mapping =
    "<Order xml='order' ns-uri='urn:order'><title node='attribute'/>"
    "<owner type='Owner' node='element'/>"
    "<lines collection='array' type='EditingTest.Line' name='line' location='lines'/>"
    "<notes collection='array' type='Note' name='note'/></Order><Owner><name node='attribute'/>"
    "<count type='int' node='element'/></Owner><Note><text node='text'/></Note><EditingTest.Line>"
    "<count type='int' node='attribute'/><text node='text'/></EditingTest.Line>"
    "<EditingTest.Page xml='page'><title required='true' node='attribute'/>"
    "<text required='true' node='element'/></EditingTest.Page>";

constexpr const char* document =
    "<order title='t' xmlns='urn:order' late='yes'><owner name='Ada'><count>3</count><vat/>"
    "</owner><lines><line count='1' id='a'>one</line><line count='2'>two</line></lines>"
    "<note>n</note><extra><deep/></extra></order>";

class Editing {
public:
    explicit Editing(unsigned seed) : _random(seed) {
        const auto object = [&](const Value& value) {
            value.object()->perform("setUndoManager:", _manager);
            return value.as<qx::Object>();
        };
        const auto owner = object(_order->valueForKey("owner"));
        const auto lines = _order->valueForKey("lines").as<qx::Array>();
        const auto note = object(_order->valueForKey("notes").as<qx::Array>()->at(0));
        const auto first = object(lines->at(0)), last = object(lines->at(1));
        object(_order);
        _texts = {{_order, "title"}, {_order, "novel"}, {owner, "name"},
                  {first, "text"},   {last, "text"},    {note, "text"}};
        _numbers = {{owner, "count"}, {first, "count"}, {last, "count"}};
        // Those are added once more that have no unknown XML, which can stand in one place only.
        _lists = {{last, "lines"}, {note, "notes"}};
    }
    ~Editing() { _manager->removeAllActions(); }

    std::string text() { return scenario::write(*_marshaller, _order); }
    UndoManager& manager() { return *_manager; }

    void changeSomething() {
        switch (below(3)) {
        case 0: {
            const auto& [object, key] = _texts[below(_texts.size())];
            object->setValueForKey(below(3) == 0 ? Value() : Value(word()), key);
            break;
        }
        case 1: {
            const auto& [object, key] = _numbers[below(_numbers.size())];
            object->setValueForKey(below(100), key);
            break;
        }
        default: {
            const auto& [item, key] = _lists[below(_lists.size())];
            _order->setValueForKey(
                below(4) == 0 ? Value() : changed(_order->valueForKey(key).as<qx::Array>(), item),
                key);
        }
        }
        if (below(3) == 0)
            _manager->endEventGroup();
    }

private:
    using Keys = std::vector<std::pair<Ref<qx::Object>, const char*>>;

    std::size_t below(std::size_t limit) { return _random() % limit; }
    std::string word() { return std::string(1 + below(3), static_cast<char>('a' + below(26))); }

    Value changed(const Ref<qx::Array>& former, const Ref<qx::Object>& item) {
        const auto list = former ? former->mutableCopy() : qx::make<qx::Array>();
        if (!list->isEmpty() && below(2) == 0)
            list->remove(below(list->count()));
        else
            list->insert(below(list->count() + 1), item);
        return list;
    }

    std::mt19937 _random;
    Ref<QXXMLMarshaller> _marshaller = scenario::marshaller(mapping);
    Ref<UndoManager> _manager = qx::make<UndoManager>();
    Ref<qx::Object> _order = _marshaller->readString(document);
    Keys _texts, _numbers, _lists;
};

TEST(EditingTest, UndoneToTheStartADocumentIsWrittenAsBeforeAndRedoneAsAfter) {
    const unsigned first = std::random_device()();
    for (unsigned seed = first; seed != first + 200; ++seed) {
        SCOPED_TRACE("seed " + std::to_string(seed));
        Editing editing(seed);
        const std::string before = editing.text();
        ASSERT_EQ(before.find("<order"), 0U) << before;
        for (int i = 0; i < 40; ++i)
            editing.changeSomething();
        const std::string after = editing.text();
        while (editing.manager().canUndo())
            editing.manager().undo();
        ASSERT_EQ(editing.text(), before);
        while (editing.manager().canRedo())
            editing.manager().redo();
        ASSERT_EQ(editing.text(), after);
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
