#include "host/Localization.h"

#include <QXXMLMarshalling/host/Bundle.h>

#include "files/Files.h"
#include "host/Log.h"
#include "host/StringsFile.h"

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

// The texts of one language, and what is wrong with their files.
struct Language {
    String bundlePath;
    std::string name;
    StringsFile::Texts texts;
    std::vector<String> problems;
};

// Adds the texts of a file, in place of those that are there.
void readStrings(const Bundle& bundle, std::string_view name, Language& language) {
    const String folder = String::concat({name, ".lproj"});
    const String path =
        bundle.pathForResource(appendingPathComponent(folder, "Localizable.strings"));
    if (path.isNull())
        return;
    Ref<Error> error;
    const Ref<Data> data = readFile(path, &error, ReadableFiles::regular, largestResource);
    if (!data) {
        language.problems.push_back(error->description());
        return;
    }
    StringsFile file = parseStrings(data->view());
    file.texts.merge(language.texts);
    std::swap(file.texts, language.texts);
    for (const std::size_t line : file.faultyLines)
        language.problems.push_back(String::concat(
            {"Unable to read the text in line ", std::to_string(line), " of ", path}));
}

// What the language and region lack comes from the language.
std::unique_ptr<Language> readLanguage(const Bundle& bundle, std::string_view name) {
    auto language = std::make_unique<Language>();
    language->bundlePath = bundle.bundlePath();
    language->name = name;
    const std::string_view general = name.substr(0, name.find('_'));
    readStrings(bundle, general, *language);
    if (general != name)
        readStrings(bundle, name, *language);
    return language;
}

// The texts of each bundle and language that were asked for; they stay for ever.
class Languages {
public:
    static Languages& shared() {
        static auto* const languages = new Languages;
        return *languages;
    }

    const StringsFile::Texts& textsFor(const Bundle& bundle, std::string_view name) {
        {
            const std::lock_guard lock(_mutex);
            if (const Language* known = find(bundle, name))
                return known->texts;
        }
        auto read = readLanguage(bundle, name);
        const std::vector<String> problems = std::exchange(read->problems, {});
        const Language* language = nullptr;
        {
            const std::lock_guard lock(_mutex);
            if (const Language* known = find(bundle, name))
                return known->texts;
            language = _languages.emplace_back(std::move(read)).get();
        }
        // The host's log function may ask for these very texts.
        for (const String& problem : problems)
            logWarningOrLine("%@", problem);
        return language->texts;
    }

private:
    const Language* find(const Bundle& bundle, std::string_view name) const {
        for (const auto& known : _languages)
            if (known->name == name && known->bundlePath == bundle.bundlePath())
                return known.get();
        return nullptr;
    }

    std::mutex _mutex;
    std::vector<std::unique_ptr<Language>> _languages;
};

// Marks, per thread, that the framework bundle is being opened for a text: an error that comes
// about meanwhile would look for its own text there, without end.
struct Opening {
    Opening() noexcept { isActive = true; }
    Opening(const Opening&) = delete;
    Opening& operator=(const Opening&) = delete;
    ~Opening() { isActive = false; }

    static thread_local bool isActive;
};
thread_local bool Opening::isActive = false;

} // namespace

String Bundle::localizedString(const String& englishText) const {
    const std::string_view language = languageOf(localeName());
    if (language.empty() || englishText.isEmpty())
        return englishText;
    const StringsFile::Texts& texts = Languages::shared().textsFor(*this, language);
    const auto found = texts.find(englishText.view());
    return found != texts.end() ? found->second : englishText;
}

String localizedText(std::string_view englishText) {
    if (languageOf(localeName()).empty() || Opening::isActive)
        return englishText;
    const Opening opening;
    const Ref<Bundle> framework = Bundle::frameworkBundle();
    return framework ? framework->localizedString(englishText) : String(englishText);
}

} // namespace qx
