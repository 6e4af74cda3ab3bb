// Saving into documents in other encodings, of large size, plain structs, files.

#include "Edits.h"

#include "support/Scenario.h"
#include "support/TemporaryFolder.h"

#include <QXXMLMarshalling/QXMappedObject.h>
#include <QXXMLMarshalling/QXXMLDocumentFile.h>

#include <functional>

namespace {

struct Row {
    int id = 0;
    std::string text;
};
struct Sheet {
    std::string title;
    std::vector<Row> rows;
};

// Lets go of all that saves it when it is asked for its title.
struct Closer : QXMappedObject {
    static std::function<void()> close;
    std::string title() const {
        if (close)
            std::exchange(close, nullptr)();
        return _title;
    }
    void setTitle(const std::string& title) { _title = title; }

private:
    std::string _title;
};
std::function<void()> Closer::close;

constexpr const char* mapping = "<Sheet xml='sheet'><title node='element'/>"
                                "<rows type='Row' collection='array' name='row'/></Sheet>"
                                "<Row><id type='int' node='attribute'/><text node='text'/></Row>";

class Update : public testing::Test {
protected:
    void SetUp() override {
        qx::Class::define<Sheet>("Sheet").members<&Sheet::title, &Sheet::rows>();
        qx::Class::define<Row>("Row").members<&Row::id, &Row::text>();
    }
    void TearDown() override {
        qx::Class::forget("Sheet");
        qx::Class::forget("Row");
    }
    std::string saved(const std::string& document, void (*edit)(Sheet&)) {
        auto sheet = marshaller->readString<Sheet>(document);
        EXPECT_TRUE(sheet) << support::told(sheet.error());
        edit(*sheet);
        const auto update = QXXMLUpdate::updatedText(*marshaller, document, *sheet);
        return update ? std::string(update->bytes()->view()) : support::told(update.error());
    }

    qx::Ref<QXXMLMarshaller> marshaller = scenario::marshaller(mapping);
};

std::string inUTF16(std::string_view text, bool isBigEndian) {
    std::string bytes;
    for (const char c : text) {
        bytes += isBigEndian ? '\0' : c;
        bytes += isBigEndian ? c : '\0';
    }
    return bytes;
}

} // namespace

TEST_F(Update, KeepsTheEncodingAndRefersToWhatItLacks) {
    const auto edit = [](Sheet& sheet) {
        sheet.title = "\xC3\xA9\xE2\x82\xAC";
        sheet.rows[0].text += "!";
    };
    EXPECT_EQ(
        saved("<?xml version='1.0' encoding='ISO-8859-1'?><!-- \xE4 --><sheet>\r\n<title>\xE4"
              "</title>\r\n<row id='1'>\xFC</row></sheet>\r\n",
              edit),
        "<?xml version='1.0' encoding='ISO-8859-1'?><!-- \xE4 --><sheet>\r\n<title>\xE9&#8364;"
        "</title>\r\n<row id='1'>\xFC!</row></sheet>\r\n");
    EXPECT_EQ(saved("\xEF\xBB\xBF<sheet><title/><row id='01'/></sheet>", edit),
              "\xEF\xBB\xBF<sheet><title>\xC3\xA9\xE2\x82\xAC</title><row id='01'>!</row></sheet>");
    for (const bool isBig : {false, true}) {
        const std::string mark = isBig ? "\xFE\xFF" : "\xFF\xFE";
        const auto rename = [](Sheet& sheet) { sheet.title = "new"; };
        EXPECT_EQ(saved(mark + inUTF16("<sheet>\r\n\t<title>old</title></sheet>", isBig), rename),
                  mark + inUTF16("<sheet>\r\n\t<title>new</title></sheet>", isBig));
    }
}

TEST_F(Update, WhatNoDocumentIsWrittenInIsRefused) {
    const auto rename = [](Sheet& sheet) { sheet.title = "b"; };
    EXPECT_EQ(saved("<?xml version='1.0' encoding='UTF-7'?><sheet><title>a</title></sheet>", rename)
                  .find("-231"),
              0);
}

TEST_F(Update, LineEndsAndBlanksAreThoseOfTheDocument) {
    EXPECT_EQ(saved("<sheet>\r\n\t<title>a</title>\r\n\t<row id='1'>x</row>\r\n</sheet>",
                    [](Sheet& sheet) {
                        sheet.title = "a\nb";
                        sheet.rows.push_back({2, "\n"});
                    }),
              "<sheet>\r\n\t<title>a\r\nb</title>\r\n\t<row id='1'>x</row>\r\n\t<row id='2'>&#10;"
              "</row>\r\n</sheet>");
    EXPECT_EQ(saved("<sheet xml:space='preserve'>\n<row id='1'/>\n</sheet>",
                    [](Sheet& sheet) {
                        sheet.rows.push_back({2, "x"});
                    }),
              "<sheet xml:space='preserve'>\n<row id='1'/><row id='2'>x</row>\n</sheet>");
}

TEST_F(Update, OneValueInALargeDocumentIsOneLine) {
    std::string document = "<sheet>\n";
    for (int i = 0; i < 20'000; ++i)
        document += "  <row id=\"" + std::to_string(i) + "\">some text in row</row><!-- row -->\n";
    document += "</sheet>\n";
    auto sheet = marshaller->readString<Sheet>(document);
    sheet->rows[12'345].text = "another";
    std::rotate(sheet->rows.begin(), sheet->rows.begin() + 1, sheet->rows.begin() + 3);
    const auto update = QXXMLUpdate::updatedText(*marshaller, document, *sheet);
    ASSERT_TRUE(update) << support::told(update.error());
    ASSERT_EQ(update->edits().size(), 3U);
    EXPECT_EQ(update->edits()[2].line, 12'347U);
    EXPECT_EQ(update->edits()[2].keyPath, "rows[12345].text");
    EXPECT_EQ(update->edits()[2].newText, "another");
}

TEST_F(Update, OfItemsThatChangePlacesTheSmallOnesMove) {
    const std::string text = "<sheet>\n<row id='1'>" + std::string(500, 'x') +
                             "</row>\n<row id='2'>b</row>\n<row id='3'>c</row>\n</sheet>";
    auto sheet = marshaller->readString<Sheet>(text);
    ASSERT_TRUE(sheet);
    std::rotate(sheet->rows.begin(), sheet->rows.begin() + 1, sheet->rows.end());
    const auto update = QXXMLUpdate::updatedText(*marshaller, text, *sheet);
    ASSERT_TRUE(update) << support::told(update.error());
    EXPECT_FALSE(update->edits().empty());
    for (const QXXMLUpdate::Edit& edit : update->edits())
        EXPECT_LT(edit.oldText.size() + edit.newText.size(), 100U);
}

TEST_F(Update, AFileIsReplacedOnlyWhereSomethingWasEdited) {
    const TemporaryFolder folder;
    const std::string path =
        folder.write("sheet.xml", "<sheet><!-- mine --><title>a</title></sheet>");
    Sheet sheet{"b", {}};
    EXPECT_TRUE(QXXMLUpdate::updateFile(*marshaller, sheet, path));
    EXPECT_EQ(folder.read("sheet.xml"), "<sheet><!-- mine --><title>b</title></sheet>");
    EXPECT_EQ(QXXMLUpdate::updateFile(*marshaller, sheet, folder.path("none")).error()->code(),
              260);
    EXPECT_EQ(QXXMLUpdate::updateFile(*marshaller, qx::Value(), path).error()->code(), -211);
    EXPECT_EQ(QXXMLUpdate::updateFile(*marshaller, Row{}, path).error()->code(), -211);
    EXPECT_EQ(folder.read("sheet.xml"), "<sheet><!-- mine --><title>b</title></sheet>");
}

TEST_F(Update, GettersMayLetGoOfWhatIsBeingSaved) {
    qx::Class::define<Closer, QXMappedObject>("Closer").property<&Closer::title, &Closer::setTitle>(
        "title");
    const TemporaryFolder folder;
    const std::string path = folder.write("closer.xml", "<closer title='old'/>");
    auto closers = scenario::marshaller("<Closer xml='closer'><title node='attribute'/></Closer>");
    auto file = QXXMLDocumentFile::open(path, closers);
    ASSERT_TRUE(file);
    const auto root = file->root();
    root->setValueForKey("new", "title");
    Closer::close = [&] { file = nullptr; };
    EXPECT_TRUE(file->save());
    EXPECT_FALSE(file);
    EXPECT_EQ(folder.read("closer.xml"), "<closer title='new'/>");
    auto bytes = std::make_unique<std::string>("<closer title='a long title of long ago'/>");
    Closer::close = [&] { bytes = nullptr, closers = nullptr; };
    const auto update = QXXMLUpdate::updatedText(*closers, *bytes, root);
    ASSERT_TRUE(update);
    EXPECT_EQ(update->bytes()->view(), "<closer title='new'/>");
    EXPECT_FALSE(bytes);
    qx::Class::forget("Closer");
}

TEST_F(Update, ADocumentFileSavesRevertsAndTellsWhetherItIsEdited) {
    const TemporaryFolder folder;
    const std::string path =
        folder.write("sheet.xml", "<sheet>\n<!-- mine -->\n<title>a</title>\n</sheet>\n");
    qx::Ref<qx::Error> error;
    const auto file = QXXMLDocumentFile::open(path, marshaller, &error);
    ASSERT_TRUE(file) << support::told(error);
    EXPECT_EQ(file->root<Row>(), nullptr);
    Sheet& sheet = *file->root<Sheet>();
    EXPECT_FALSE(file->isEdited());
    sheet.title = "b";
    EXPECT_TRUE(file->isEdited());
    EXPECT_TRUE(file->save());
    EXPECT_FALSE(file->isEdited());
    sheet.title = "c";
    EXPECT_TRUE(file->revert());
    EXPECT_EQ(sheet.title, "b");
    sheet.title = "d";
    EXPECT_TRUE(file->saveAs(folder.path("other.xml")));
    EXPECT_EQ(folder.read("other.xml"), "<sheet>\n<!-- mine -->\n<title>d</title>\n</sheet>\n");
    EXPECT_EQ(folder.read("sheet.xml"), "<sheet>\n<!-- mine -->\n<title>b</title>\n</sheet>\n");
    sheet.title = "\x01";
    EXPECT_TRUE(file->isEdited());
    EXPECT_FALSE(file->save(&error));
    EXPECT_EQ(error->code(), 517);
    EXPECT_EQ(folder.read("other.xml"), "<sheet>\n<!-- mine -->\n<title>d</title>\n</sheet>\n");
}

TEST_F(Update, AFileThatChangedMeanwhileIsSeenAndMerged) {
    using Changed = QXXMLDocumentFile::Changed;
    const TemporaryFolder folder;
    const std::string base = "<sheet>\n<title>a</title>\n<row id='1'>x</row>\n</sheet>\n";
    const auto file = QXXMLDocumentFile::open(folder.write("s.xml", base), marshaller);
    Sheet& sheet = *file->root<Sheet>();
    sheet.rows[0].text = "y";
    folder.write("s.xml", "<sheet>\n<!-- theirs -->\n<title>b</title>\n<row id='1'>x</row>\n"
                          "</sheet>\n");
    qx::Ref<qx::Error> error;
    EXPECT_FALSE(file->save(&error));
    EXPECT_EQ(error->code(), -232);
    EXPECT_TRUE(file->save(&error, Changed::carryOver)) << support::told(error);
    EXPECT_EQ(folder.read("s.xml"),
              "<sheet>\n<!-- theirs -->\n<title>b</title>\n<row id='1'>y</row>\n</sheet>\n");
    EXPECT_EQ(sheet.title, "b");
    EXPECT_FALSE(file->isEdited());
    sheet.title = "mine";
    const std::string theirs = "<sheet>\n<title>theirs</title>\n</sheet>\n";
    folder.write("s.xml", theirs);
    EXPECT_FALSE(file->save(&error, Changed::carryOver));
    EXPECT_EQ(support::told(error),
              "-233: The file and the object have both changed: title (Invalid Value)");
    EXPECT_EQ(folder.read("s.xml"), theirs);
    EXPECT_TRUE(file->save(&error, Changed::overwrite));
    EXPECT_EQ(folder.read("s.xml"),
              "<sheet>\n<!-- theirs -->\n<title>mine</title>\n<row id='1'>y</row>\n</sheet>\n");
}

TEST_F(Update, AnUndoManagersMarkTellsWhetherADocumentFileIsEdited) {
    const TemporaryFolder folder;
    const auto records = scenario::marshaller("<Note xml='note'><text node='element'/></Note>");
    const auto file = QXXMLDocumentFile::open(folder.write("n.xml", "<note/>"), records);
    const auto note = file->root<QXGenericRecord>();
    const auto manager = qx::make<qx::UndoManager>();
    note->setUndoManager(manager);
    file->setUndoManager(manager);
    note->setValueForKey("a", "text");
    EXPECT_TRUE(file->isEdited());
    EXPECT_TRUE(file->save());
    EXPECT_FALSE(file->isEdited());
    EXPECT_EQ(folder.read("n.xml"), "<note><text>a</text></note>");
    manager->undo();
    EXPECT_TRUE(file->isEdited());
    manager->redo();
    EXPECT_FALSE(file->isEdited());
}

TEST_F(Update, UnknownXMLOfAProgramHasReferencesForWhatTheEncodingLacks) {
    const auto records = scenario::marshaller("<Note xml='note'/>");
    const std::string head = "<?xml version='1.0' encoding='US-ASCII'?>";
    const auto note = records->readString(head + "<note><b/></note>");
    const auto kept = note->valueForKey("unboundChildren").as<qx::Dictionary>();
    kept->find("b")->as<qx::Array>()->replace(
        0, qx::XMLElement::initWithName("b", "\xE2\x82\xAC\xC3\xA9"));
    const auto update = QXXMLUpdate::updatedText(*records, head + "<note><b/></note>", note);
    ASSERT_TRUE(update) << support::told(update.error());
    EXPECT_EQ(update->bytes()->view(), head + "<note><b>&#8364;&#233;</b></note>");
}

TEST_F(Update, ADocumentFileIsSavedAgainAndAgainWhateverFieldsShare) {
    const TemporaryFolder folder;
    const auto records = scenario::marshaller(
        "<Order xml='order'><day name='on' node='attribute' location='received'/>"
        "<title node='element'/><to type='To' container='false' node='element'/>"
        "<lines collection='array' name='line'/></Order>"
        "<To><street node='element'/></To><Line xml='line'><text node='text'/></Line>");
    std::string text = "<order><received on='1' by='x'/><title>2</title><street>3</street>"
                       "<line>4</line><line>5</line></order>";
    const auto file = QXXMLDocumentFile::open(folder.write("o.xml", text), records);
    const auto edit = [&](const char* path, const char* before, const char* now) {
        edits::apply(file->root(), std::string(path) + " = \"" + now + "\"");
        qx::Ref<qx::Error> error;
        EXPECT_TRUE(file->save(&error)) << path << support::told(error);
        EXPECT_FALSE(file->isEdited()) << path;
        text.replace(text.find(before), 1, now);
        EXPECT_EQ(folder.read("o.xml"), text);
    };
    for (int round = 0; round < 2; ++round) {
        edit("day", round == 0 ? "1" : "A", round == 0 ? "A" : "E");
        edit("title", round == 0 ? "2" : "B", round == 0 ? "B" : "F");
        edit("to.street", round == 0 ? "3" : "C", round == 0 ? "C" : "G");
        edit("lines[1].text", round == 0 ? "5" : "D", round == 0 ? "D" : "H");
    }
    file->root()->valueForKey("lines").as<qx::Array>()->remove(0);
    text.replace(text.find("<line>4</line>"), 14, "");
    edit("title", "F", "K");
}

// Not kept exactly, an object holds what its fields took, too, as it was when it was read.
TEST(UpdateAgain, SavesAnObjectThatKeepsWhatIsGone) {
    const struct {
        const char *mapping, *document;
        std::vector<const char*> edits;
        const char* saved;
    } cases[] = {
        {"<Order xml='order'><day name='on' node='attribute' location='received'/></Order>",
         "<order>\n    <received on='1'/>\n</order>",
         {"day = null", "", "day = \"2\"", ""},
         "<order>\n    <received on=\"2\"/>\n</order>"},
        {"<Order xml='order'><day node='attribute'/><more type='More' container='false' "
         "node='element'/></Order><More><note node='element'/></More>",
         "<order day='1'><note>a</note></order>",
         {"day = null", "", "more.note = \"b\"", "day = \"2\""},
         "<order day=\"2\"><note>b</note></order>"},
        {"<Order xml='order'><more type='More' container='false' node='element'/>"
         "<rows type='Row' collection='array' name='row'/></Order>"
         "<More><note node='element'/></More><Row><id node='attribute'/></Row>",
         "<order><note>a</note><row id='1'/></order>",
         {"insert rows[0] Row{id: \"0\"}", "rows[1].id = \"2\"", "remove rows[0]", ""},
         "<order><note>a</note><row id='2'/></order>"},
        {"<Order xml='order'><rows collection='array' name='row'/><note node='element'/></Order>",
         "<order/>",
         {"note = \"a\"", "", "note = \"b\""},
         "<order><note>b</note></order>"},
        {"<Order xml='order'><rows type='Row' collection='array' name='row'/></Order>"
         "<Row><on node='attribute' location='at'/></Row>",
         "<order><row><at on='3'/></row><row><at on='4'/></row></order>",
         {"rows[0].on = null", "move rows[0] 1"},
         "<order><row><at on='4'/></row><row></row></order>"},
    };
    for (const auto& each : cases) {
        const auto marshaller = scenario::marshaller(each.mapping);
        std::string text = each.document;
        const auto order = marshaller->readString(text);
        ASSERT_TRUE(order);
        for (const char* edit : each.edits) {
            edits::apply(order, edit);
            const auto update = QXXMLUpdate::updatedText(*marshaller, text, order);
            ASSERT_TRUE(update) << support::told(update.error()) << edit << text;
            text = update->bytes()->view();
        }
        EXPECT_EQ(text, each.saved);
    }
}

TEST(UpdateNamespaces, CarriesDeclarationsThatAProgramChanges) {
    const auto marshaller = scenario::marshaller(
        "<Feed xml='feed'><title node='element'/><all type='Item' collection='array' name='item'/>"
        "</Feed><Item><id node='attribute'/></Item>");
    const std::string document = "<feed xmlns:g='urn:g'\n      xmlns:h='urn:h'>\n"
                                 "    <item xmlns=\"urn:i\" id=\"1\"/><!-- one -->\n"
                                 "    <item id=\"&#50;\"/>\n</feed>";
    const auto declare = [](const qx::Value& object,
                            std::vector<std::pair<const char*, const char*>> declarations) {
        const auto all = qx::make<qx::Array>();
        for (const auto& [prefix, URI] : declarations)
            all->add(qx::XMLNode::namespaceWithName(prefix, URI));
        object.object()->setValueForKey(all, "__namespaces");
    };
    const auto feed = marshaller->readString(document);
    const auto items = feed->valueForKey("all").as<qx::Array>();
    const auto saved = [&] {
        const auto update = QXXMLUpdate::updatedText(*marshaller, document, feed);
        return update ? std::string(update->bytes()->view()) : support::told(update.error());
    };
    // What keeps none says nothing of them.
    declare(feed, {});
    items->at(0).object()->setValueForKey(qx::Value(), "__namespaces");
    EXPECT_EQ(saved(), document);
    declare(feed, {{"h", "urn:H"}, {"k", "a&b"}});
    declare(items->at(0), {{"", "urn:j"}});
    edits::apply(feed, "move all[0] 1");
    EXPECT_EQ(saved(), "<feed xmlns:k=\"a&amp;b\"\n      xmlns:h='urn:H'>\n"
                       "    <item id=\"&#50;\"/>\n"
                       "    <item xmlns=\"urn:j\" id=\"1\"/><!-- one -->\n</feed>");
    marshaller->setUsingNamespaceURIs(false);
    edits::apply(feed, "move all[0] 1");
    EXPECT_EQ(saved(), document);
}
