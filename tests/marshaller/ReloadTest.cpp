// Reading into objects that are there: what stays, who hears of it, how it is undone. That it gives
// what a reading gives is tested by the pages of cases.

#include "support/Scenario.h"
#include "support/TemporaryFolder.h"

#include <QXXMLMarshalling/QXXMLMarshalling.h>

#include <functional>
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
    bool isSelected = false; // no field
    std::vector<qx::Ref<Part>> parts;
    qx::Ref<Part> spare;
    std::optional<Box> box;
    int refused = -1;
    int checked() const { return _checked; }
    void setChecked(int value) {
        if (value == refused)
            throw std::runtime_error("checked");
        _checked = value;
        if (meanwhile)
            meanwhile();
    }
    static inline std::function<void()> meanwhile;

private:
    int _checked = 0;
};

struct Crate {
    std::string label;
    std::vector<std::shared_ptr<Crate>> crates;
    std::vector<std::unique_ptr<Crate>> owned;
    std::vector<qx::Ref<Part>> parts;
};

class Reloading : public testing::Test {
protected:
    void SetUp() override {
        qx::Class::define<Box>("Box")
            .members<&Box::label, &Box::size, &Box::boxes, &Box::owned, &Box::weight>()
            .names({{Size::small, "S"}, {Size::large, "L"}});
        qx::Class::define<Part, QXMappedObject>("Part")
            .members<&Part::number, &Part::parts, &Part::spare, &Part::box>()
            .property<&Part::checked, &Part::setChecked>("checked");
    }
    void TearDown() override {
        qx::Class::forget("Box");
        qx::Class::forget("Part");
        Part::meanwhile = nullptr;
    }

    const qx::Ref<QXXMLMarshaller> marshaller = scenario::marshaller(
        "<Box xml='box'><label node='attribute'/><size node='attribute'/>"
        "<weight node='attribute'/><boxes type='Box' collection='array' name='box'/>"
        "<owned type='Box' collection='array' name='own'/></Box>"
        "<Part xml='part'><number node='attribute'/><checked node='attribute'/>"
        "<parts type='Part' collection='array' name='part'/>"
        "<spare type='Part' name='spare' node='element'/>"
        "<box type='Box' name='box' node='element'/></Part>"
        "<Line xml='line'><text node='attribute'/><next type='Line' node='element'/>"
        "<part node='element'/><lines type='Line' collection='array' name='line'/></Line>");

    qx::Ref<QXGenericRecord> readLine(const char* document) const {
        return marshaller->readString(document).as<QXGenericRecord>();
    }
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
        marshaller->readString<Part>("<part number='1' a='1'><part/><part/><box/></part>").value();
    const auto first = part->parts.at(0);
    first->isSelected = true;
    part->box->opened = 3;
    ASSERT_TRUE(marshaller->readStringInto(
        *part, "<part b='2'><part number='3'/><spare number='4'/><box label='b'/></part>"));
    EXPECT_EQ(written(part), R"(<part b="2"><part number="3"></part><spare number="4"></spare>)"
                             R"(<box label="b" size="0"></box></part>)");
    EXPECT_EQ(part->parts.at(0), first);
    EXPECT_TRUE(first->isSelected && part->box->opened == 3);
    EXPECT_EQ(part->spare->parent(), part);
    part->parts.push_back(part);
    ASSERT_TRUE(marshaller->readStringInto(part, "<part><part/><part number='5'/></part>"));
    EXPECT_NE(part->parts.at(1), part);
    EXPECT_EQ(part->parts.at(1)->parent(), part);
    EXPECT_EQ(part->number, 0);
    const auto line = readLine("<line><next text='b'/><line/></line>");
    const auto next = line->valueForKey("next"), lines = line->valueForKey("lines");
    line->setValueForKey(true, "open");
    ASSERT_TRUE(marshaller->readStringInto(line, "<line><next x='1'/><line text='c'/></line>"));
    EXPECT_TRUE(line->valueForKey("next").isSameAs(next));
    EXPECT_TRUE(line->valueForKey("lines").isSameAs(lines));
    EXPECT_TRUE(line->valueForKey("open").boolValue());
    EXPECT_EQ(written(line), R"(<line><next x="1"></next><line text="c"></line></line>)");
}

TEST_F(Reloading, ReadsWhateverAReadingReads) {
    const TemporaryFolder folder;
    Box box;
    EXPECT_TRUE(marshaller->readInto(box, folder.write("box.xml", "<box label='file'/>")));
    EXPECT_EQ(box.label, "file");
    std::istringstream stream("<box label='stream'/>");
    EXPECT_TRUE(marshaller->readStreamInto(box, stream));
    EXPECT_EQ(box.label, "stream");
    const auto boxed = qx::make<qx::Boxed<Box>>();
    EXPECT_TRUE(
        marshaller->unmarshallInto(boxed, qx::XMLDocument::initWithData("<box label='tree'/>")));
    EXPECT_EQ((*boxed)->label, "tree");
    const auto blank = qx::make<QXGenericRecord>();
    ASSERT_TRUE(marshaller->readStringInto(blank, "<line text='d'/>"));
    EXPECT_EQ(written(blank), R"(<line text="d"></line>)");
}

TEST_F(Reloading, LeavesAnObjectAloneWhereReadingFails) {
    Box box;
    box.label = "mine";
    const auto part = qx::make<Part>();
    const auto line = readLine("<line text='a'/>");
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
    const char* const bad = "<box label='a'><box size='M'/></box>";
    EXPECT_EQ(errorOf(box, bad),
              "-222: Unable to set value: M for key: size in class: Box (Invalid Value)");
    EXPECT_FALSE(marshaller->readStringInto(box, bad)) << "without a slot";
    EXPECT_EQ(box.label, "mine");
    EXPECT_FALSE(marshaller->unmarshallInto(box, nullptr, &error));
    EXPECT_THROW(marshaller->readStringInto(qx::Ref<Part>(), "<part/>"), qx::Exception);
}

TEST_F(Reloading, TellsObserversWhatDiffers) {
    const auto line = readLine("<line text='a'><next text='b'/><line/></line>");
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
    for (const char* path : {"number", "checked", "spare"})
        listen(*part, path);
    ASSERT_TRUE(
        marshaller->readStringInto(line, "<line text='a'><next text='c'/><line text='d'/></line>"));
    EXPECT_EQ(heard, "next.text=c ");
    ASSERT_TRUE(marshaller->readStringInto(part, "<part number='3' checked='1'/>"));
    EXPECT_EQ(heard, "next.text=c number=3 ");
}

TEST_F(Reloading, IsOneUndoableChange) {
    // The undo manager gets copies of structs, which all have to have names.
    qx::Class::define<Box>("Box").names({{Size::unknown, "U"}, {Size::small, "S"}});
    const char* const before =
        "<line text='a'><next text='b'/><part number='1' checked='1'><spare number='2'/>"
        "<box label='a'><box label='b'/></box></part><line text='c'/><x/></line>";
    const char* const after =
        "<line y='1'><next text='d'/><part number='3' checked='2'><spare number='4'/>"
        "<box label='c'><box label='d'/></box></part><line/><line text='e'/></line>";
    const auto line = readLine(before);
    const auto part = line->valueForKey("part").as<Part>();
    const auto manager = qx::make<qx::UndoManager>();
    line->setUndoManager(manager);
    const std::string first = written(line), second = written(readLine(after));
    ASSERT_TRUE(marshaller->readStringInto(line, after));
    for (int i = 0; i < 2; ++i) {
        EXPECT_EQ(written(line), second);
        EXPECT_EQ(line->valueForKey("part").as<Part>(), part);
        manager->undo();
        EXPECT_EQ(written(line), first);
        EXPECT_FALSE(manager->canUndo());
        manager->redo();
        EXPECT_FALSE(manager->canRedo());
    }
    manager->undo();
    part->refused = 2;
    EXPECT_THROW(marshaller->readStringInto(line, after), std::runtime_error);
    manager->undo();
    EXPECT_EQ(written(line), first) << "as far as it came";
    manager->removeAllActions();
}

TEST_F(Reloading, SettersMayLetGoOfWhatIsReadInto) {
    qx::Class::define<Crate>("Crate")
        .members<&Crate::label, &Crate::crates, &Crate::owned, &Crate::parts>();
    const auto crates = scenario::marshaller(
        "<Crate xml='crate'><crates type='Crate' collection='array' name='crate'/>"
        "<owned type='Crate' collection='array' name='own'/>"
        "<parts type='Part' collection='array' name='part'/><label node='attribute'/></Crate>"
        "<Part xml='part'><checked node='attribute'/></Part>");
    for (const char* name : {"crate", "own"}) {
        const auto text = [&](const std::string& value) {
            return "<crate><" + std::string(name) + " label='" + value + "'><part checked='" +
                   value + "'/></" + name + "></crate>";
        };
        for (const bool readsAgain : {false, true}) {
            Part::meanwhile = nullptr;
            Crate root;
            ASSERT_TRUE(crates->readStringInto(root, text("1")));
            int calls = 0;
            Part::meanwhile = [&] { // the second call is that of the part that stays
                if (++calls != 2)
                    return;
                if (readsAgain)
                    crates->readStringInto(root, "<crate label='none'/>");
                root.crates.clear();
                root.owned.clear();
            };
            EXPECT_TRUE(crates->readStringInto(root, text("2")));
            EXPECT_EQ(calls, 2);
            const Crate& inner = root.crates.empty() ? *root.owned.at(0) : *root.crates.at(0);
            EXPECT_EQ(inner.label, "2");
            EXPECT_EQ(inner.parts.at(0)->checked(), 2);
        }
    }
    const auto root = std::make_shared<Crate>();
    root->crates = {root};
    EXPECT_TRUE(crates->readStringInto(*root, "<crate label='n'><crate label='in'/></crate>"));
    EXPECT_EQ(root->label, "n");
    root->crates.clear();
    qx::Class::forget("Crate");
}
