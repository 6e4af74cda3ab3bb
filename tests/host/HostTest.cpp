// What stands around a program, by steps (host.md), and files of translations (strings.md).

#include "host/Directories.h"
#include "host/StringsFile.h"
#include "model/Errors.h"

#include "support/FileSandbox.h"
#include "support/FileSteps.h"
#include "support/Texts.h"

namespace {

using namespace qx;

class HostSteps : public support::FileSteps<FileSandbox> {
public:
    HostSteps() {
        know("variable", [this](auto& words) { folder.setVariable(words.at(0), words.at(1)); });
        know("no-variable", [this](auto& words) { folder.setVariable(words.at(0), std::nullopt); });
        know("process", [](auto& words) { ProcessInfo::setProcessName(words.at(0)); });
        know("directories", [this](auto&) {
            sayPath(searchPathForApplicationSupport().at(0).str());
            sayPath(configurationDirectory().str());
        });
        know("arguments", [this](auto& words) {
            std::vector<const char*> arguments;
            for (const std::string& word : words)
                arguments.push_back(word.c_str());
            defaults->setArguments(arguments);
        });
        know("register", [this](auto& words) { defaults->registerDefault(words.at(1), words[0]); });
        know("set", [this](auto& words) { defaults->setObject(words.at(1), words[0]); });
        know("unset", [this](auto& words) { defaults->removeObjectForKey(words.at(0)); });
        know("list-with", [this](auto& words) {
            folder.write("config/Client.plist",
                         "<plist><dict><key>Key</key>" + words.at(0) + "</dict></plist>");
            defaults->synchronize();
        });
        know("default",
             [this](auto& words) { say(support::oneLine(defaults->objectForKey(words.at(0)))); });
        know("as-boolean-and-number", [this](auto& words) {
            say(defaults->boolForKey(words.at(0)) ? "true" : "false");
            say(std::to_string(defaults->integerForKey(words[0])));
        });
        know("resource", [this](auto& words) {
            const String type = words.size() > 1 ? String(words[1]) : String();
            sayPath(support::oneLine(app->pathForResource(words.at(0), type)));
        });
        know("translate", [this](auto& words) {
            ::testing::internal::CaptureStderr();
            say(app->localizedString(words.at(0)).str());
            const std::string warning = ::testing::internal::GetCapturedStderr();
            if (!warning.empty())
                sayPath(warning.substr(warning.find("] ") + 2,
                                       warning.size() - warning.find("] ") - 3));
        });
        know("error", [this](auto&) {
            Ref<Error> error;
            fail(&error, errors::classRedefined, "Order");
            say(support::told(error));
        });
    }
    ~HostSteps() {
        defaults->setArguments({});
        defaults->removeObjectForKey("Key");
    }

private:
    Ref<UserDefaults> defaults = UserDefaults::standardUserDefaults();
    Ref<Bundle> app = folder.bundle("app");
};
const bool added = support::addSteps<HostSteps>("tests/host/host.md");

const bool addedStrings =
    support::addCases("tests/host/strings.md", {"strings"}, {"entries"}, [](const auto& expected) {
        const StringsFile read = parseStrings(support::unescaped(expected.given.at("strings")));
        std::string text;
        for (const auto& [key, translation] : read.texts)
            text += key + " = " + translation.str() + "\n";
        for (const std::size_t line : read.faultyLines)
            text += "line " + std::to_string(line) + " is faulty\n";
        EXPECT_EQ(text, support::unescaped(expected.text));
    });

TEST(DirectoriesTest, AServiceWithoutAHomeHasThatOfItsAccount) {
    FileSandbox sandbox;
    sandbox.setVariable("XDG_DATA_HOME", std::nullopt);
    sandbox.setVariable("HOME", std::nullopt);
    const String path = searchPathForApplicationSupport().at(0);
    EXPECT_TRUE(path.view().starts_with('/') && path.view().ends_with("/.local/share"))
        << path.view();
}

} // namespace
