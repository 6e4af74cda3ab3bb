#include "model/Errors.h"

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "files/Files.h"
#include "host/StringsFile.h"

#include "support/ErrorRows.h"
#include "support/FileSandbox.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <ctime>

using namespace qx;

TEST(ErrorsTest, ArgumentsAreNotLookedAtWithoutASlot) {
    bool asked = false;
    const auto costly = [&] {
        asked = true;
        return "Order";
    };
    EXPECT_FALSE(fail(nullptr, errors::classRedefined, costly));
    EXPECT_FALSE(asked);
    Ref<Error> error;
    const Ref<Object> nothing = fail(&error, errors::classRedefined, costly);
    EXPECT_FALSE(nothing);
    EXPECT_TRUE(asked);
    EXPECT_EQ(error->description(),
              "NSCocoaErrorDomain -205: Class redefined: Order (Invalid XML)");
}

TEST(ErrorsTest, EveryTextIsTranslatedWithTheSameDirectives) {
    for (const std::string language : {"en", "de"}) {
        const auto file =
            readFile(QX_SOURCE_DIR "/share/" + language + ".lproj/Localizable.strings");
        ASSERT_TRUE(file);
        const auto [texts, faultyLines] = parseStrings(file->view());
        EXPECT_TRUE(faultyLines.empty()) << language;
        const auto check = [&, &texts = texts](const std::string& text) {
            const auto found = texts.find(std::string_view(text));
            ASSERT_NE(found, texts.end()) << language << ": " << text;
            EXPECT_EQ(std::ranges::count(found->second.view(), '%'), std::ranges::count(text, '%'))
                << language << ": " << text;
            EXPECT_EQ(found->second == std::string_view(text), language == "en")
                << language << ": " << text;
        };
        for (const char* header :
             {support::libraryErrors, support::parserErrors, support::findingTexts}) {
            const auto written = support::errorTexts(header);
            EXPECT_GT(written.size(), 20U);
            for (const std::string& text : written)
                check(text);
        }
        const auto lines = std::count(file->view().begin(), file->view().end(), ';');
        EXPECT_EQ(texts.size(), lines) << "a key stands twice, or an entry is broken";
    }
}

TEST(ErrorsTest, TextsAreLookedUpWhenTheyAreAskedFor) {
    FileSandbox world;
    world.setVariable("LANG", "de_DE");
    Ref<Error> error;
    XMLDocument::initWithData("", {}, &error);
    EXPECT_EQ(error->description(), "NSXMLParserErrorDomain 4: Das Dokument ist leer (Das Dokument "
                                    "ist kein wohlgeformtes XML)");
    world.setVariable("LC_ALL", "en_US");
    EXPECT_EQ(error->localizedDescription(), "The document is empty");
}

TEST(StringsFileTest, UTF16ShowsByItsFirstBytes) {
    const std::u16string text = u"\"a\" = \"\u00E4\U0001F600\";";
    for (const std::u16string& file : {u"\uFEFF" + text, text})
        for (const bool isBig : {false, true}) {
            std::string bytes;
            for (const char16_t unit : file) {
                bytes += static_cast<char>(isBig ? unit >> 8 : unit & 0xFF);
                bytes += static_cast<char>(isBig ? unit & 0xFF : unit >> 8);
            }
            const StringsFile::Texts expected{{"a", "\xC3\xA4\xF0\x9F\x98\x80"}};
            EXPECT_EQ(parseStrings(bytes).texts, expected) << isBig << file.size();
        }
}

TEST(StringsFileTest, ManyFaultyEntriesCostNoMoreThanTheirBytes) {
    for (const std::string line :
         {"\"a\" /*\n", "\"a\n", "/* x */ \"a\n", "\"\\\"\n", "\"a\" \n \n", "\"a\" \"b\"; ",
          "\"a\" = \"\\U", "\"a\" // b\n"}) {
        std::string file;
        while (file.size() < 1'000'000)
            file += line;
        const std::clock_t start = std::clock();
        parseStrings(file);
        parseStrings(file + "*/");
        EXPECT_LT(std::clock() - start, 2 * CLOCKS_PER_SEC) << line;
    }
}
