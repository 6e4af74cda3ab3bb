#include <QXXMLMarshalling/host/UserDefaults.h>

#include <QXXMLMarshalling/host/ProcessInfo.h>

#include "base/Immortal.h"
#include "files/Paths.h"
#include "host/Directories.h"
#include "host/PropertyList.h"
#include "model/LibraryClass.h"

namespace qx {

UserDefaults::UserDefaults()
    : _arguments(make<Dictionary>()), _set(make<Dictionary>()), _registered(make<Dictionary>()) {}

UserDefaults::~UserDefaults() = default;

Ref<UserDefaults> UserDefaults::standardUserDefaults() {
    struct Standard {
        Ref<UserDefaults> defaults = make<UserDefaults>();
    };
    return immortal<Standard>().defaults;
}

Ref<Dictionary> UserDefaults::userFile() {
    const String process = ProcessInfo::processName();
    std::size_t synchronizations = 0;
    {
        const std::lock_guard lock(_mutex);
        if (_file && _fileProcess == process)
            return _file;
        synchronizations = _synchronizations;
    }
    const String directory = configurationDirectory();
    const PropertyList file = directory.isNull()
                                  ? PropertyList{make<Dictionary>(), {}}
                                  : readPropertyList(appendingPathComponent(
                                        directory, String::concat({process, ".plist"})));
    {
        Ref<Dictionary> former;
        const std::lock_guard lock(_mutex);
        if (_file && _fileProcess == process)
            return _file; // another thread was first
        // What was read before a synchronize() serves this call and no other.
        if (synchronizations == _synchronizations) {
            former = std::exchange(_file, file.values);
            _fileProcess = process;
        }
    }
    file.warn();
    return file.values;
}

Value UserDefaults::objectForKey(const String& key) {
    {
        const std::lock_guard lock(_mutex);
        for (const Ref<Dictionary>* source : {&_arguments, &_set})
            if (const Value* value = (*source)->find(key))
                return *value;
    }
    // Nobody changes the dictionary of the file once it is read; synchronize() drops it.
    const Ref<Dictionary> file = userFile();
    if (const Value* value = file->find(key))
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
        if (arguments[i] == nullptr || arguments[i + 1] == nullptr)
            break;
        const std::string_view argument = arguments[i];
        if (argument == "--")
            break;
        if (!isKey(argument) || argument[1] == '-' || isKey(arguments[i + 1]))
            continue;
        found->set(argument.substr(1), arguments[++i]);
    }
    const std::lock_guard lock(_mutex);
    std::swap(_arguments, found);
}

// In all that follows, what is replaced ends after the lock: a host's object may ask for a default
// at its end.

void UserDefaults::setObject(const Value& value, const String& key) {
    if (value.isNull()) {
        removeObjectForKey(key);
        return;
    }
    Value former;
    const std::lock_guard lock(_mutex);
    former = _set->get(key);
    _set->set(key, value);
}

void UserDefaults::removeObjectForKey(const String& key) {
    Value former;
    const std::lock_guard lock(_mutex);
    former = _set->get(key);
    _set->remove(key);
}

void UserDefaults::registerDefault(const Value& value, const String& key) {
    Value former;
    const std::lock_guard lock(_mutex);
    former = _registered->get(key);
    _registered->set(key, value);
}

void UserDefaults::synchronize() {
    Ref<Dictionary> former;
    const std::lock_guard lock(_mutex);
    former = std::exchange(_file, nullptr);
    ++_synchronizations;
}

const Class& UserDefaults::describedClass() const {
    return libraryClass<UserDefaults>("qx::UserDefaults");
}

} // namespace qx
