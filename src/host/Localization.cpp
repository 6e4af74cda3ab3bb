#include "host/Localization.h"

#include "base/Immortal.h"
#include "files/Files.h"
#include "host/EmbeddedFiles.h"
#include "host/LoadedFile.h"
#include "host/Log.h"
#include "host/StringsFile.h"
#include "model/Localizer.h"

#include <cstdlib>
#include <memory>
#include <mutex>
#include <vector>

namespace qx {

namespace {

// What the user asks for, as the variable holds it: "de_DE.UTF-8", say.
std::string_view localeName() {
    for (const char* const variable : {"LC_ALL", "LC_MESSAGES", "LANG"}) {
        // The host's own affair: nothing here changes the environment.
        const char* const value = std::getenv(variable); // NOLINT(concurrency-mt-unsafe)
        if (value != nullptr && *value != '\0')
            return value;
    }
    return {};
}

// "de_AT" of "de_AT.UTF-8@euro". Empty for the locales without a language, and for a name that
// would be no folder's.
std::string_view languageOf(std::string_view locale) {
    locale = locale.substr(0, locale.find_first_of(".@"));
    if (locale == "C" || locale == "POSIX" || locale.find('/') != std::string_view::npos)
        return {};
    return locale;
}

// The texts of one language in a folder, and what is wrong with their files: errors and texts. An
// error's own text is only looked up once these texts are there.
struct Language {
    String folder;
    std::string name;
    StringsFile::Texts texts;
    std::vector<Value> problems;
};

// Adds texts in place of those that are there.
void replaceTexts(StringsFile::Texts texts, Language& language) {
    texts.merge(language.texts);
    std::swap(texts, language.texts);
}

// Adds the texts of a file. The library's own come before those of its files: a file that is
// missing or older leaves them.
void readStrings(std::string_view name, Language& language) {
    const String file = String::concat({name, ".lproj/Localizable.strings"});
    if (language.folder == frameworkFolder())
        replaceTexts(parseStrings(embeddedFile(file)).texts, language);
    const String path = String::concat({language.folder, "/", file});
    if (!fileExists(path))
        return;
    Ref<Error> error;
    const Ref<Data> data = readFile(path, &error, ReadableFiles::regular, largestResource);
    if (!data) {
        language.problems.emplace_back(error);
        return;
    }
    StringsFile texts = parseStrings(data->view());
    replaceTexts(std::move(texts.texts), language);
    for (const std::size_t line : texts.faultyLines)
        language.problems.emplace_back(String::concat(
            {"Unable to read the text in line ", std::to_string(line), " of ", path}));
}

// What the language and region lack comes from the language.
std::unique_ptr<Language> readLanguage(const String& folder, std::string_view name) {
    auto language = std::make_unique<Language>();
    language->folder = folder;
    language->name = name;
    const std::string_view general = name.substr(0, name.find('_'));
    readStrings(general, *language);
    if (general != name)
        readStrings(name, *language);
    return language;
}

// The texts of each folder and language that were asked for; they stay for ever.
class Languages {
public:
    const StringsFile::Texts& textsFor(const String& folder, std::string_view name) {
        {
            const std::lock_guard lock(_mutex);
            if (const Language* known = find(folder, name))
                return known->texts;
        }
        auto read = readLanguage(folder, name);
        const std::vector<Value> problems = std::exchange(read->problems, {});
        const Language* language = nullptr;
        {
            const std::lock_guard lock(_mutex);
            if (const Language* known = find(folder, name))
                return known->texts;
            language = _languages.emplace_back(std::move(read)).get();
        }
        // The host's log function may ask for these very texts.
        for (const Value& problem : problems)
            logWarningOrLine("%@", problem);
        return language->texts;
    }

private:
    const Language* find(const String& folder, std::string_view name) const {
        for (const auto& known : _languages)
            if (known->name == name && known->folder == folder)
                return known.get();
        return nullptr;
    }

    std::mutex _mutex;
    std::vector<std::unique_ptr<Language>> _languages;
};

} // namespace

String localizedString(const String& folder, std::string_view englishText) {
    const std::string_view language = languageOf(localeName());
    if (folder.isNull() || language.empty() || englishText.empty())
        return englishText;
    const StringsFile::Texts& texts = immortal<Languages>().textsFor(folder, language);
    const auto found = texts.find(englishText);
    return found != texts.end() ? found->second : String(englishText);
}

namespace {

// The texts of errors come out of the framework bundle's folder. The bundle itself is not opened
// for that: what is wrong with it is told by errors.
String frameworkText(std::string_view englishText) {
    return localizedString(frameworkFolder(), englishText);
}

[[maybe_unused]] const bool localizerInstalled = (installLocalizer(&frameworkText), true);

} // namespace

} // namespace qx

// What a program that is linked with the static library asks for, so that this file is linked, too.
extern "C" const char qxHostServices;
const char qxHostServices = 0;
