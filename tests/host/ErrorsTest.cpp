#include "model/Errors.h"

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include "files/Files.h"
#include "host/StringsFile.h"

#include "support/ErrorRows.h"
#include "support/FileSandbox.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <chrono>

using namespace qx;

namespace {

// What the message and its reason are in a world of that locale.
std::string messageUnder(const char* variable, const char* locale) {
    FileSandbox world;
    world.setVariable(variable, locale);
    Ref<Error> error;
    fail(&error, errors::classRedefined, "Order");
    return error->localizedDescription().str() + " / " + error->localizedFailureReason().str();
}

} // namespace

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
            EXPECT_EQ(found->second == text, language == "en") << language << ": " << text;
        };
        for (const char* header : {support::libraryErrors, support::parserErrors}) {
            const auto written = support::errorTexts(header);
            EXPECT_GT(written.size(), 20U);
            for (const std::string& text : written)
                check(text);
        }
        const auto lines = std::count(file->view().begin(), file->view().end(), ';');
        EXPECT_EQ(texts.size(), lines) << "a key stands twice, or an entry is broken";
    }
}

TEST(ErrorsTest, TheReadersLanguageIsThatOfTheFirstVariableSet) {
    const std::string german = "Klasse mehrfach definiert: Order / Ung\xC3\xBCltiges XML";
    const std::string english = "Class redefined: Order / Invalid XML";
    for (const char* locale : {"de", "de_DE.UTF-8", "de_AT@euro"}) {
        EXPECT_EQ(messageUnder("LANG", locale), german) << locale;
        EXPECT_EQ(messageUnder("LC_MESSAGES", locale), german) << locale;
    }
    for (const char* locale :
         {"", "C", "POSIX", "C.UTF-8", "en_GB.UTF-8", "fr_FR.UTF-8", "../de", "deutsch"})
        EXPECT_EQ(messageUnder("LC_ALL", locale), english) << locale;

    FileSandbox world;
    world.setVariable("LANG", "de_DE");
    world.setVariable("LC_ALL", "");
    Ref<Error> error;
    fail(&error, errors::classRedefined, "Order");
    EXPECT_EQ(error->localizedFailureReason(), "Ung\xC3\xBCltiges XML"); // an empty one is unset
    XMLDocument::initWithData("", {}, &error);
    EXPECT_EQ(error->description(), "NSXMLParserErrorDomain 4: Das Dokument ist leer (Das Dokument "
                                    "ist kein wohlgeformtes XML)");
    fail(&error, errors::classRedefined, "Order");
    world.setVariable("LC_ALL", "en_US");
    EXPECT_EQ(error->localizedFailureReason(), "Invalid XML"); // texts are looked up when asked for
}

TEST(StringsFileTest, EntriesAreReadButThoseThatAreFaulty) {
    using Texts = StringsFile::Texts;
    const std::string face = "\xF0\x9F\x98\x80";
    const struct {
        std::string file;
        Texts texts;
        std::vector<std::size_t> faultyLines;
    } rows[]{{"\xEF\xBB\xBF/* \"not\" = \"this\"; */ // nor this\n"
              "\"a\"=\"A\";\"tab\\t\" = \"\\\"\\\\ \\U00fc\\n\" ; \"none\" = \"\";",
              {{"a", "A"}, {"tab\t", "\"\\ \xC3\xBC\n"}},
              {}},
             {R"("two" = "\UD83D\ude00"; "half" = "\UD83Dx";)", // and one half alone
              {{"two", face}, {"half", "\xEF\xBF\xBDx"}},
              {}},
             {"\"a\" \"A\"; \"b\" = \"B\";\n\"c\" = \"C\"\n\"d\" = \"D\";",
              {{"b", "B"}, {"d", "D"}},
              {1, 2}},
             {"\"a\" = \"A;\n\"b\" = \"B\";\n\"c\" // = \"C\";\n\"d\" = \"D\"; \"",
              {{"b", "B"}, {"d", "D"}},
              {1, 3, 4}},
             {"\"a\" = \"\xFC\"; /* no end\n\"b\" = \"\\U12\"; \"c\" = \"C\"; \"d\" = \"\\U0000\";",
              {{"c", "C"}},
              {1, 2}}};
    for (const auto& row : rows) {
        const StringsFile read = parseStrings(row.file);
        EXPECT_EQ(read.texts, row.texts) << row.file;
        EXPECT_EQ(read.faultyLines, row.faultyLines) << row.file;
    }
    for (const char* cut : {"", "\"", "\"a\\", R"("a" = "\U12)", "/*", "//"})
        EXPECT_TRUE(parseStrings(cut).texts.empty()) << cut;
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
        const auto start = std::chrono::steady_clock::now();
        parseStrings(file);
        parseStrings(file + "*/");
        EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(2)) << line;
    }
}

TEST(LocalizationTest, WhatALanguageOfARegionLacksComesFromTheLanguage) {
    FileSandbox world;
    const auto bundle = world.bundle("app");
    world.write("app/xx.lproj/Localizable.strings", "\"a\" = \"general\";\n\"b\" = \"general\";");
    const std::string regional =
        world.write("app/xx_YY.lproj/Localizable.strings", "\n\"faulty\"\n\"a\" = \"regional\";");
    std::filesystem::create_directory(world.path("app/zz.lproj"));
    std::filesystem::create_symlink("/dev/zero", world.path("app/zz.lproj/Localizable.strings"));
    ::testing::internal::CaptureStderr();
    world.setVariable("LANG", "xx_YY.UTF-8");
    EXPECT_EQ(bundle->localizedString("a"), "regional");
    EXPECT_EQ(bundle->localizedString("b"), "general");
    world.setVariable("LANG", "zz");
    EXPECT_EQ(bundle->localizedString("a"), "a");
    const std::string warnings = ::testing::internal::GetCapturedStderr();
    EXPECT_NE(warnings.find("Unable to read the text in line 2 of " + regional + "\n"),
              std::string::npos)
        << warnings;
    EXPECT_EQ(std::count(warnings.begin(), warnings.end(), '\n'), 2) << warnings;
}
