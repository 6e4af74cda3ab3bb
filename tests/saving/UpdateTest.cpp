// Saving into documents in other encodings, of large size, plain structs, files.

#include "Edits.h"

#include "support/Scenario.h"
#include "support/TemporaryFolder.h"

#include <QXXMLMarshalling/QXXMLUpdate.h>

namespace {

struct Row {
    int id = 0;
    std::string text;
};
struct Sheet {
    std::string title;
    std::vector<Row> rows;
};

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
