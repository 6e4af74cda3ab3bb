#include "platform/system/Errors.h"

#include <QXXMLMarshalling/platform/XMLDocument.h>

#include "platform/system/Files.h"
#include "platform/system/StringsFile.h"
#include "platform/xml/ParseFailure.h"

#include "support/FileSandbox.h"

#include <gtest/gtest.h>

#include <algorithm>

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
        const Strings texts = parseStrings(file->view());
        const auto check = [&](const char* text) {
            const auto found = texts.find(std::string_view(text));
            ASSERT_NE(found, texts.end()) << language << ": " << text;
            EXPECT_EQ(std::ranges::count(found->second.view(), '%'),
                      std::ranges::count(std::string_view(text), '%'))
                << language << ": " << text;
            EXPECT_EQ(found->second == text, language == "en") << language << ": " << text;
        };
        std::vector<const ErrorText*> rows(errors::table.begin(), errors::table.end());
        rows.insert(rows.end(), parseErrors::table.begin(), parseErrors::table.end());
        for (const ErrorText* text : rows) {
            check(text->message);
            if (*text->reason != '\0')
                check(text->reason);
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

TEST(StringsFileTest, EntriesAreReadUpToTheFirstBrokenOne) {
    const Strings texts = parseStrings("\xEF\xBB\xBF/* \"not\" = \"this\"; */ // nor this\n"
                                       "\"a\"=\"A\";\"tab\\t\" = \"\\\"\\\\ \\U00fc\\n\" ;\n"
                                       "\"none\" = \"\"; \"last\" = \"L\";\n"
                                       "\"broken\" \"B\"; \"behind\" = \"it\";");
    const Strings expected{{"a", "A"}, {"tab\t", "\"\\ \xC3\xBC\n"}, {"last", "L"}};
    EXPECT_EQ(texts, expected);
    for (const char* cut : {"", "\"", "\"a\\", R"("a" = "\U12)", "/*", "//"})
        EXPECT_TRUE(parseStrings(cut).empty()) << cut;
}
