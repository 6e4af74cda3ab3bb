#include <QXXMLMarshalling/platform/UserDefaults.h>

#include <QXXMLMarshalling/platform/ProcessInfo.h>

#include "platform/object/LibraryClass.h"
#include "platform/system/Directories.h"
#include "platform/system/Files.h"
#include "platform/system/PropertyList.h"

namespace qx {

UserDefaults::UserDefaults()
    : _arguments(make<Dictionary>()), _set(make<Dictionary>()), _registered(make<Dictionary>()) {}

UserDefaults::~UserDefaults() = default;

// Lives for ever: code that runs while the program ends may still ask.
Ref<UserDefaults> UserDefaults::standardUserDefaults() {
    static UserDefaults* const shared = make<UserDefaults>().detach();
    return Ref<UserDefaults>(shared);
}

Ref<Dictionary> UserDefaults::userFile() {
    const String process = ProcessInfo::processName();
    {
        const std::lock_guard lock(_mutex);
        if (_file && _fileProcess == process)
            return _file;
    }
    const String directory = configurationDirectory();
    const PropertyList file = directory.isNull()
                                  ? PropertyList{make<Dictionary>(), {}}
                                  : readPropertyList(appendingPathComponent(
                                        directory, String::concat({process, ".plist"})));
    {
        const std::lock_guard lock(_mutex);
        _file = file.values;
        _fileProcess = process;
    }
    file.warn();
    return file.values;
}

Value UserDefaults::objectForKey(const String& key) {
    {
        const std::lock_guard lock(_mutex);
        for (const auto& source : {_arguments, _set})
            if (const Value* value = source->find(key))
                return *value;
    }
    // Nobody changes the dictionary of the file once it is read.
    if (const Value* value = userFile()->find(key))
        return *value;
    const std::lock_guard lock(_mutex);
    return _registered->get(key);
}

String UserDefaults::stringForKey(const String& key) { return objectForKey(key).string(); }

bool UserDefaults::boolForKey(const String& key) { return objectForKey(key).boolValue(); }

std::int64_t UserDefaults::integerForKey(const String& key) { return objectForKey(key).intValue(); }

void UserDefaults::setArguments(std::span<const char* const> arguments) {
    const auto isKey = [](std::string_view text) {
        return text.size() > 1 && text[0] == '-' && !(text[1] >= '0' && text[1] <= '9');
    };
    auto found = make<Dictionary>();
    for (std::size_t i = 0; i + 1 < arguments.size(); ++i) {
        const std::string_view argument = arguments[i];
        if (argument == "--")
            break;
        if (!isKey(argument) || argument[1] == '-' || isKey(arguments[i + 1]))
            continue;
        found->set(argument.substr(1), arguments[++i]);
    }
    const std::lock_guard lock(_mutex);
    _arguments = std::move(found);
}

void UserDefaults::setObject(const Value& value, const String& key) {
    if (value.isNull()) {
        removeObjectForKey(key);
        return;
    }
    const std::lock_guard lock(_mutex);
    _set->set(key, value);
}

void UserDefaults::removeObjectForKey(const String& key) {
    const std::lock_guard lock(_mutex);
    _set->remove(key);
}

void UserDefaults::registerDefault(const Value& value, const String& key) {
    const std::lock_guard lock(_mutex);
    _registered->set(key, value);
}

void UserDefaults::synchronize() {
    const std::lock_guard lock(_mutex);
    _file.reset();
}

const Class& UserDefaults::describedClass() const {
    return libraryClass<UserDefaults>("qx::UserDefaults");
}

} // namespace qx
