// Reading into objects that are there: what stays, who hears of it, how it is undone. That it gives
// what a reading gives is tested by the pages of cases.

#include "support/Scenario.h"
#include "support/TemporaryFolder.h"

#include <QXXMLMarshalling/QXXMLMarshalling.h>

#include <sstream>

namespace {

enum class Size { unknown, small, large };

struct Box {
    std::string label;
    Size size = Size::unknown; // has no name
    int opened = 0;            // no field
    std::vector<std::shared_ptr<Box>> boxes;
    std::vector<std::unique_ptr<Box>> owned;
    std::optional<double> weight;
};

class Part : public QXMappedObject {
public:
    int number = 0;
    Size size = Size::unknown;
    bool isSelected = false; // no field
    std::vector<qx::Ref<Part>> parts;
    qx::Ref<Part> spare;
    Box box;
    int refused = -1;
    int checked() const { return _checked; }
    void setChecked(int value) {
        if (value == refused)
            throw std::runtime_error("checked");
        _checked = value;
    }

private:
    int _checked = 0;
};

class Reloading : public testing::Test {
protected:
    void SetUp() override {
        qx::Class::define<Box>("Box")
            .members<&Box::label, &Box::size, &Box::boxes, &Box::owned, &Box::weight>()
            .names({{Size::small, "S"}, {Size::large, "L"}});
        qx::Class::define<Part, QXMappedObject>("Part")
            .members<&Part::number, &Part::size, &Part::parts, &Part::spare, &Part::box>()
            .property<&Part::checked, &Part::setChecked>("checked");
    }
    void TearDown() override {
        qx::Class::forget("Box");
        qx::Class::forget("Part");
    }

    const qx::Ref<QXXMLMarshaller> marshaller = scenario::marshaller(
        "<Box xml='box'><label node='attribute'/><size node='attribute'/>"
        "<weight node='attribute'/><boxes type='Box' collection='array' name='box'/>"
        "<owned type='Box' collection='array' name='own'/></Box>"
        "<Part xml='part'><number node='attribute'/><size node='attribute'/>"
        "<checked node='attribute'/><parts type='Part' collection='array' name='part'/>"
        "<spare type='Part' name='spare' node='element'/>"
        "<box type='Box' name='box' node='element'/></Part>"
        "<Line xml='line'><text node='attribute'/><next type='Line' node='element'/>"
        "<lines type='Line' collection='array' name='line'/></Line>");

    std::string written(const auto& object) const {
        return marshaller->marshall(object)->rootElement()->XMLString().str();
    }
    std::string errorOf(auto& object, std::string_view document) const {
        qx::Ref<qx::Error> error;
        EXPECT_FALSE(marshaller->readStringInto(object, document, &error));
        return support::told(error);
    }
};

} // namespace

TEST_F(Reloading, KeepsStructsBehindPointersByTheirPlace) {
    auto box = marshaller
                   ->readString<Box>("<box label='a' size='S' weight='1'><box label='b'/>"
                                     "<box label='c'/><own label='d'/><own/></box>")
                   .value();
    const auto b = box.boxes.at(0), c = box.boxes.at(1);
    Box* const d = box.owned.at(0).get();
    box.opened = b->opened = d->opened = 7;
    ASSERT_TRUE(marshaller->readStringInto(
        box, "<box><box/><box label='e'/><box label='f'/><own size='L'/></box>"));
    EXPECT_EQ(written(box), R"(<box label="" size="0"><box label="" size="0"></box>)"
                            R"(<box label="e" size="0"></box><box label="f" size="0"></box>)"
                            R"(<own label="" size="L"></own></box>)");
    EXPECT_TRUE(box.boxes.at(0) == b && box.boxes.at(1) == c && box.owned.at(0).get() == d);
    EXPECT_EQ(box.opened + b->opened + d->opened, 21) << "what has no field stays";
    box.boxes.at(1) = b;
    ASSERT_TRUE(marshaller->readStringInto(box, "<box><box label='1'/><box label='2'/></box>"));
    EXPECT_EQ(b->label, "1") << "what is held twice stays in one place";
    EXPECT_EQ(box.boxes.at(1)->label, "2");
}

TEST_F(Reloading, KeepsObjectsByTheirPlace) {
    const auto part =
        marshaller->readString<Part>("<part number='1' a='1'><part/><part number='2'/></part>")
            .value();
    const auto first = part->parts.at(0), second = part->parts.at(1);
    first->isSelected = true;
    part->box.opened = 3;
    ASSERT_TRUE(marshaller->readStringInto(
        *part,
        "<part b='2'><part number='3' size='S'/><spare number='4'/><box label='b'/></part>"));
    EXPECT_EQ(written(part),
              R"(<part b="2"><part number="3" size="S"><box label="" size="0"></box></part>)"
              R"(<spare number="4">)"
              R"(<box label="" size="0"></box></spare>)"
              R"(<box label="b" size="0"></box></part>)");
    EXPECT_EQ(part->parts.at(0), first);
    EXPECT_TRUE(first->isSelected);
    EXPECT_EQ(part->box.opened, 3);
    EXPECT_EQ(part->spare->parent(), part);
    part->parts.push_back(part);
    ASSERT_TRUE(marshaller->readStringInto(part, "<part><part/><part number='5'/></part>"));
    EXPECT_NE(part->parts.at(1), part);
    EXPECT_EQ(part->parts.at(1)->parent(), part);
    EXPECT_EQ(part->number, 0);
}

TEST_F(Reloading, KeepsRecordsAndWhatTheMappingDoesNotKnow) {
    const auto line = marshaller->readString("<line text='a'><next text='b'/><line/></line>")
                          .as<QXGenericRecord>();
    const auto next = line->valueForKey("next"), lines = line->valueForKey("lines");
    line->setValueForKey(true, "open");
    ASSERT_TRUE(marshaller->readStringInto(line, "<line><next x='1'/><line text='c'/></line>"));
    EXPECT_TRUE(line->valueForKey("next").isSameAs(next));
    EXPECT_TRUE(line->valueForKey("lines").isSameAs(lines));
    EXPECT_TRUE(line->valueForKey("open").boolValue());
    EXPECT_EQ(written(line), R"(<line><next x="1"></next><line text="c"></line></line>)");
    const auto blank = qx::make<QXGenericRecord>();
    ASSERT_TRUE(marshaller->readStringInto(blank, "<line text='d'/>"));
    EXPECT_EQ(written(blank), R"(<line text="d"></line>)");
}

TEST_F(Reloading, ReadsWhateverAReadingReads) {
    const TemporaryFolder folder;
    const std::string path = folder.write("box.xml", "<box label='file'/>");
    Box box;
    EXPECT_TRUE(marshaller->readInto(box, path));
    EXPECT_EQ(box.label, "file");
    std::istringstream stream("<box label='stream'/>");
    EXPECT_TRUE(marshaller->readStreamInto(box, stream));
    EXPECT_EQ(box.label, "stream");
    EXPECT_TRUE(
        marshaller->unmarshallInto(box, qx::XMLDocument::initWithData("<box label='tree'/>")));
    EXPECT_EQ(box.label, "tree");
    const auto boxed = qx::make<qx::Boxed<Box>>();
    EXPECT_TRUE(marshaller->readStringInto(boxed, "<box label='boxed'/>"));
    EXPECT_EQ((*boxed)->label, "boxed");
}

TEST_F(Reloading, LeavesAnObjectAloneWhereReadingFails) {
    Box box;
    box.label = "mine";
    const auto part = qx::make<Part>();
    const auto line = marshaller->readString("<line text='a'/>");
    qx::Ref<qx::Error> error;
    EXPECT_FALSE(marshaller->readInto(box, "/nowhere/box.xml", &error));
    EXPECT_EQ(errorOf(box, "<box label='a'>").substr(0, 3), "77:") << "the parser's";
    EXPECT_EQ(errorOf(box, "<part number='x'/>"),
              "-211: The root is of class: Part, not of class: Box (Invalid Mapping)");
    EXPECT_EQ(errorOf(*part, "<box/>"),
              "-211: The root is of class: Box, not of class: Part (Invalid Mapping)");
    EXPECT_EQ(errorOf(line, "<part/>"),
              "-211: The root is of class: Part, not of class: Line (Invalid Mapping)");
    EXPECT_EQ(errorOf(line, "<other/>"),
              "-211: No definition to handle element: <other></other> (Invalid Mapping)");
    EXPECT_EQ(errorOf(box, "<box label='a'><box size='M'/></box>"),
              "-222: Unable to set value: M for key: size in class: Box (Invalid Value)");
    EXPECT_FALSE(marshaller->readStringInto(box, "<box label='a'><box size='M'/></box>"));
    EXPECT_EQ(box.label, "mine");
    EXPECT_FALSE(marshaller->unmarshallInto(box, nullptr, &error));
    qx::Ref<Part> none;
    EXPECT_THROW(marshaller->readStringInto(none, "<part/>"), qx::Exception);
}

TEST_F(Reloading, TellsObserversWhatDiffers) {
    const auto line = marshaller->readString("<line text='a'><next text='b'/><line/></line>");
    const auto part = marshaller->readString<Part>("<part number='1' checked='1'/>").value();
    std::string heard;
    std::vector<qx::ObservationToken> tokens;
    const auto listen = [&](qx::Object& object, const char* path) {
        tokens.push_back(object.observe(path, [&heard, path](const qx::ValueChange& change) {
            heard += path + ("=" + change.newValue.description().str()) + " ";
        }));
    };
    for (const char* path : {"text", "next", "next.text", "lines"})
        listen(*line, path);
    for (const char* path : {"number", "checked", "size"})
        listen(*part, path);
    ASSERT_TRUE(
        marshaller->readStringInto(line, "<line text='a'><next text='c'/><line text='d'/></line>"));
    EXPECT_EQ(heard, "next.text=c ");
    ASSERT_TRUE(marshaller->readStringInto(part, "<part number='1' checked='2' size='L'/>"));
    EXPECT_EQ(heard, "next.text=c size=L checked=2 ");
}

TEST_F(Reloading, IsOneUndoableChange) {
    const char* const before = "<line text='a'><next text='b'/><line text='c'/><x/></line>";
    const char* const after = "<line y='1'><next text='d'/><line/><line text='e'/></line>";
    const auto line = marshaller->readString(before).as<QXGenericRecord>();
    const auto manager = qx::make<qx::UndoManager>();
    line->setUndoManager(manager);
    const std::string first = written(line);
    ASSERT_TRUE(marshaller->readStringInto(line, after));
    const std::string second = written(line);
    EXPECT_EQ(second, written(marshaller->readString(after)));
    for (int i = 0; i < 2; ++i) {
        manager->undo();
        EXPECT_EQ(written(line), first);
        EXPECT_FALSE(manager->canUndo());
        manager->redo();
        EXPECT_EQ(written(line), second);
        EXPECT_FALSE(manager->canRedo());
    }
    manager->removeAllActions();
    EXPECT_FALSE(marshaller->readStringInto(line, "<line text='f'><next"));
    ASSERT_TRUE(marshaller->readStringInto(line, after));
    EXPECT_EQ(written(line), second);
    manager->removeAllActions();
}

TEST_F(Reloading, CoversPartsWithoutAnUndoManager) {
    // A struct is copied for the undo manager, which takes names for all values.
    qx::Class::forget("Box");
    qx::Class::define<Box>("Box").members<&Box::label, &Box::boxes>();
    const auto line = marshaller->readString("<line/>").as<QXGenericRecord>();
    const auto part = marshaller
                          ->readString<Part>("<part number='1' checked='1'><spare number='2'/>"
                                             "<box label='a'><box label='b'/></box></part>")
                          .value();
    const auto mapped = scenario::marshaller(
        "<Line xml='line'><part type='Part' node='element'/></Line>"
        "<Part><number node='attribute'/><checked node='attribute'/>"
        "<spare type='Part' node='element'/><box type='Box' node='element'/></Part>"
        "<Box><label node='attribute'/><boxes type='Box' collection='array' name='box'/></Box>");
    line->setValueForKey(part, "part");
    const auto manager = qx::make<qx::UndoManager>();
    line->setUndoManager(manager);
    const std::string before = scenario::write(*mapped, line);
    const char* const document = "<line><part number='3' checked='2'><spare number='4'/>"
                                 "<box label='c'><box label='d'/></box></part></line>";
    ASSERT_TRUE(mapped->readStringInto(line, document));
    const std::string after = scenario::write(*mapped, line);
    EXPECT_EQ(after, scenario::write(*mapped, mapped->readString(document)));
    EXPECT_EQ(line->valueForKey("part").as<Part>(), part);
    manager->undo();
    EXPECT_EQ(scenario::write(*mapped, line), before);
    manager->redo();
    EXPECT_EQ(scenario::write(*mapped, line), after);
    manager->undo();
    part->refused = 2;
    EXPECT_THROW(mapped->readStringInto(line, document), std::runtime_error);
    manager->undo();
    EXPECT_EQ(scenario::write(*mapped, line), before) << "as far as it came";
    manager->removeAllActions();
}
