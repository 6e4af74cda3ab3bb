#include "platform/system/Localization.h"

#include <QXXMLMarshalling/platform/Bundle.h>

#include "platform/system/Files.h"
#include "platform/system/StringsFile.h"

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

// The texts for a language and region, else for the language.
Strings readStrings(const Bundle& bundle, std::string_view language) {
    for (const auto name : {language, language.substr(0, language.find('_'))}) {
        const String folder = String::concat({name, ".lproj"});
        const String path =
            bundle.pathForResource(appendingPathComponent(folder, "Localizable.strings"));
        if (path.isNull())
            continue;
        if (const Ref<Data> data = readFile(path))
            return parseStrings(data->view());
    }
    return {};
}

// The texts of each bundle and language that were asked for; they stay for ever.
class Languages {
public:
    static Languages& shared() {
        static auto* const languages = new Languages;
        return *languages;
    }

    const Strings& textsFor(const Bundle& bundle, std::string_view language) {
        {
            const std::lock_guard lock(_mutex);
            if (const Strings* known = find(bundle, language))
                return *known;
        }
        auto read = std::make_unique<Language>(
            Language{bundle.bundlePath(), std::string(language), readStrings(bundle, language)});
        const std::lock_guard lock(_mutex);
        if (const Strings* known = find(bundle, language))
            return *known;
        _languages.push_back(std::move(read));
        return _languages.back()->texts;
    }

private:
    struct Language {
        String bundlePath;
        std::string name;
        Strings texts;
    };

    const Strings* find(const Bundle& bundle, std::string_view language) const {
        for (const auto& known : _languages)
            if (known->name == language && known->bundlePath == bundle.bundlePath())
                return &known->texts;
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
    const Strings& texts = Languages::shared().textsFor(*this, language);
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
