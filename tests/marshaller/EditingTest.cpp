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
    "<class name='Order'><map-to xml='order' ns-uri='urn:order'/>"
    "<field name='title'><bind-xml node='attribute'/></field>"
    "<field name='owner' type='Owner'><bind-xml node='element'/></field>"
    "<field name='lines' collection='array' type='EditingTest.Line'>"
    "<bind-xml name='line' location='lines'/></field>"
    "<field name='notes' collection='array' type='Note'><bind-xml name='note'/></field></class>"
    "<class name='Owner'><field name='name'><bind-xml node='attribute'/></field>"
    "<field name='count' type='int'><bind-xml node='element'/></field></class>"
    "<class name='Note'><field name='text'><bind-xml node='text'/></field></class>"
    "<class name='EditingTest.Line'><field name='count' type='int'><bind-xml node='attribute'/>"
    "</field><field name='text'><bind-xml node='text'/></field></class>"
    "<class name='EditingTest.Page'><map-to xml='page'/>"
    "<field name='title' required='true'><bind-xml node='attribute'/></field>"
    "<field name='text' required='true'><bind-xml node='element'/></field></class>";

constexpr const char* document =
    "<order title='t' xmlns='urn:order' late='yes'><owner name='Ada'><count>3</count><vat/></owner>"
    "<lines><line count='1' id='a'>one</line><line count='2'>two</line></lines>"
    "<note>n</note><extra><deep/></extra></order>";

// The objects of a document that can be edited, each with its keys.
struct Editable {
    Ref<qx::Object> object;
    std::vector<const char*> texts, numbers, lists;
};

class Editing {
public:
    explicit Editing(unsigned seed) : _random(seed) {
        _order = _marshaller->readString(document);
        const Ref<qx::Object> owner = _order->valueForKey("owner").as<qx::Object>();
        _editable = {{_order, {"title", "novel"}, {}, {"lines", "notes"}},
                     {owner, {"name"}, {"count"}, {}}};
        for (const Value& line : *_order->valueForKey("lines").as<qx::Array>())
            _editable.push_back({line.as<qx::Object>(), {"text"}, {"count"}, {}});
        for (const Value& note : *_order->valueForKey("notes").as<qx::Array>())
            _editable.push_back({note.as<qx::Object>(), {"text"}, {}, {}});
        for (const auto& editable : _editable)
            editable.object->perform("setUndoManager:", _manager);
    }
    ~Editing() { _manager->removeAllActions(); }

    std::string text() { return scenario::write(*_marshaller, _order); }
    UndoManager& manager() { return *_manager; }

    void changeSomething() {
        const Editable& editable = _editable[below(_editable.size())];
        qx::Object& object = *editable.object;
        switch (below(3)) {
        case 0:
            if (!editable.texts.empty())
                object.setValueForKey(below(3) == 0 ? Value() : Value(word()),
                                      editable.texts[below(editable.texts.size())]);
            break;
        case 1:
            if (!editable.numbers.empty())
                object.setValueForKey(below(100), editable.numbers.front());
            break;
        default:
            if (!editable.lists.empty())
                changeList(object, editable.lists[below(editable.lists.size())]);
        }
        if (below(3) == 0)
            _manager->endEventGroup();
    }

private:
    std::size_t below(std::size_t limit) { return _random() % limit; }
    std::string word() { return std::string(1 + below(3), static_cast<char>('a' + below(26))); }

    // The last line or note: they have no unknown XML, which can stand in one place only.
    Ref<qx::Object> editableItem(std::string_view list) const {
        return _editable[_editable.size() - (list == "lines" ? 2 : 1)].object;
    }

    void changeList(qx::Object& object, const char* key) {
        const auto former = object.valueForKey(key).as<qx::Array>();
        const auto list = former ? former->mutableCopy() : qx::make<qx::Array>();
        if (below(4) == 0)
            return object.setValueForKey(nullptr, key);
        if (!list->isEmpty() && below(2) == 0)
            list->remove(below(list->count()));
        else
            list->insert(below(list->count() + 1), editableItem(key));
        object.setValueForKey(list, key);
    }

    std::mt19937 _random;
    Ref<QXXMLMarshaller> _marshaller = scenario::marshaller(mapping);
    Ref<UndoManager> _manager = qx::make<UndoManager>();
    Ref<qx::Object> _order;
    std::vector<Editable> _editable;
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

// Whether it succeeds or fails halfway: what a class registers while it is read is one step.
TEST(EditingTest, OneReadingIsOneStepToUndo) {
    const auto marshaller = scenario::marshaller(mapping);
    const Ref<UndoManager>& manager = marshaller->undoManager();
    const auto page = marshaller->readString("<page title='t'><text>x</text></page>").as<Page>();
    EXPECT_EQ(page->undoManager(), manager);
    EXPECT_EQ(manager->groupingLevel(), 0U);
    manager->undo();
    EXPECT_TRUE(page->title.isNull() && page->text.isNull());
    EXPECT_FALSE(manager->canUndo());
    EXPECT_FALSE(marshaller->readString("<page title='t'/>"));
    EXPECT_EQ(manager->groupingLevel(), 0U);
    EXPECT_FALSE(manager->canUndo()); // with the page, which was dropped
}

// A host that reads between two changes of one event undoes both at once, and the reading with
// them.
TEST(EditingTest, AReadingStaysInTheGroupOfTheEventAroundIt) {
    const auto marshaller = scenario::marshaller(mapping);
    const Ref<UndoManager>& manager = marshaller->undoManager();
    const auto count = qx::make<qx::Array>();
    const auto change = [&] {
        manager->registerUndo(*count, [](qx::Array& undone) { undone.add(1); });
    };
    change();
    const auto page = marshaller->readString("<page title='t'><text>x</text></page>").as<Page>();
    EXPECT_EQ(manager->groupingLevel(), 1U);
    EXPECT_FALSE(marshaller->readString("<page title='t'/>"));
    EXPECT_EQ(manager->groupingLevel(), 1U);
    change();
    manager->undo();
    EXPECT_EQ(count->count(), 2U);
    EXPECT_TRUE(page->title.isNull() && page->text.isNull());
    EXPECT_FALSE(manager->canUndo());
}

TEST(EditingTest, RecordsAreNotHandedTheMarshallersUndoManager) {
    const auto marshaller = scenario::marshaller(mapping);
    const auto order = marshaller->readString(document).as<QXGenericRecord>();
    EXPECT_FALSE(order->undoManager());
    EXPECT_FALSE(marshaller->undoManager()->canUndo());
}

} // namespace
