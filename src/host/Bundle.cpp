#include <QXXMLMarshalling/host/Bundle.h>

#include <QXXMLMarshalling/host/ProcessInfo.h>

#include "base/Immortal.h"
#include "files/Files.h"
#include "files/Paths.h"
#include "host/LoadedFile.h"
#include "host/Localization.h"
#include "host/PropertyList.h"
#include "model/LibraryClass.h"

#include <mutex>
#include <vector>

namespace qx {

namespace {

struct OpenBundles {
    std::mutex mutex;
    std::vector<Ref<Bundle>> bundles; // in the order in which they were opened
    Ref<Bundle> main;                 // set by the host
};

// The resources of a program or library that lies in `folder`: <folder>/../share/<name>; for
// lib/x86_64-linux-gnu and the like, the share beside lib. Null when there is no such folder.
String sharedFolder(const String& folder, std::string_view name) {
    if (folder.isNull())
        return nullptr;
    const auto below = [name](const String& prefix) {
        const String path = appendingPathComponent(appendingPathComponent(prefix, "share"), name);
        return isDirectory(path) ? path : String();
    };
    const String parent = directoryOf(folder);
    String found = below(parent);
    if (found.isNull() && parent.view().ends_with("/lib"))
        found = below(directoryOf(parent));
    return found;
}

// Null where the program's file cannot be told.
String folderOfProgram() {
    const String program = ProcessInfo::executablePath();
    return program.isNull() ? String() : String(directoryOf(program));
}

// "name" of …/libname.so.1.2
std::string_view libraryName(std::string_view file) {
    file.remove_prefix(file.rfind('/') + 1);
    if (file.starts_with("lib"))
        file.remove_prefix(3);
    return file.substr(0, file.find(".so"));
}

constexpr std::string_view frameworkName = "QXXMLMarshalling";

String findFrameworkFolder() {
    static const char anchor = 0; // lies where this library lies
    const String file = sharedObjectHolding(&anchor);
    String folder = file.isNull() ? folderOfProgram() : String(directoryOf(file));
    String installed = sharedFolder(folder, frameworkName);
    return installed.isNull() ? folder : installed;
}

// Looked for once: the library does not move.
struct FrameworkFolder {
    const String path = findFrameworkFolder();
};

} // namespace

const String& frameworkFolder() { return immortal<FrameworkFolder>().path; }

Bundle::Bundle(String path, Ref<Dictionary> info) noexcept
    : _path(std::move(path)), _info(std::move(info)) {}

Bundle::~Bundle() = default;

Ref<Bundle> Bundle::bundleWithPath(const String& path) {
    if (!isDirectory(path))
        return nullptr;
    String real = realPath(path);
    if (real.isNull())
        return nullptr;
    auto& open = immortal<OpenBundles>();
    const auto find = [&]() -> Ref<Bundle> {
        for (const auto& bundle : open.bundles)
            if (bundle->bundlePath() == real)
                return bundle;
        return nullptr;
    };
    {
        const std::lock_guard lock(open.mutex);
        if (auto known = find())
            return known;
    }
    // Read outside the lock: what is wrong with it is told to the host.
    const PropertyList info = readPropertyList(appendingPathComponent(real, "Info.plist"));
    auto made = make<Bundle>(real, info.values);
    {
        const std::lock_guard lock(open.mutex);
        if (auto known = find())
            return known;
        open.bundles.push_back(made);
    }
    info.warn();
    return made;
}

Ref<Bundle> Bundle::mainBundle() {
    Ref<Bundle> bundle;
    auto& open = immortal<OpenBundles>();
    {
        const std::lock_guard lock(open.mutex);
        bundle = open.main;
    }
    if (!bundle) {
        const String folder = folderOfProgram();
        const String shared = sharedFolder(folder, ProcessInfo::processName());
        bundle = bundleWithPath(shared.isNull() ? folder : shared);
    }
    if (bundle)
        return bundle;
    // The program's folder was removed while it runs, or cannot be told. Nothing lies below this.
    struct Nowhere {
        String path = "/dev/null";
        const Ref<Dictionary> info = make<Dictionary>();
        Ref<Bundle> bundle = make<Bundle>(path, info);
    };
    return immortal<Nowhere>().bundle;
}

void Bundle::setMainBundle(const Ref<Bundle>& bundle) {
    auto& open = immortal<OpenBundles>();
    Ref<Bundle> former = bundle; // ends after the lock, as do objects that the host gave it
    const std::lock_guard lock(open.mutex);
    std::swap(open.main, former);
}

Ref<Bundle> Bundle::frameworkBundle() { return bundleWithPath(frameworkFolder()); }

Ref<Bundle> Bundle::bundleForClass(const std::type_info& type) {
    // Where the type itself lies says nothing: the linker copies it into a program that casts to
    // it. Its name is not copied.
    const String file = sharedObjectHolding(type.name());
    if (file.isNull())
        return mainBundle();
    const std::string_view name = libraryName(file);
    if (name == frameworkName)
        return frameworkBundle();
    const String folder = directoryOf(file);
    const String shared = sharedFolder(folder, name);
    Ref<Bundle> bundle = bundleWithPath(shared.isNull() ? folder : shared);
    return bundle ? bundle : mainBundle();
}

void Bundle::forget(const Ref<Bundle>& bundle) {
    auto& open = immortal<OpenBundles>();
    const std::lock_guard lock(open.mutex);
    std::erase(open.bundles, bundle);
}

Ref<Bundle> Bundle::bundleWithIdentifier(const String& identifier) {
    if (identifier.isNull())
        return nullptr;
    for (const auto& bundle : {mainBundle(), frameworkBundle()})
        if (bundle && bundle->bundleIdentifier() == identifier)
            return bundle;
    auto& open = immortal<OpenBundles>();
    const std::lock_guard lock(open.mutex);
    for (const auto& bundle : open.bundles)
        if (bundle->bundleIdentifier() == identifier)
            return bundle;
    return nullptr;
}

Value Bundle::objectForInfoDictionaryKey(const String& key) const {
    String set;
    if (key == "CFBundleShortVersionString")
        set = ProcessInfo::processVersion();
    else if (key == "CFBundleVersion")
        set = ProcessInfo::processBuild();
    return !set.isNull() && mainBundle().get() == this ? Value(set) : _info->get(key);
}

String Bundle::bundleIdentifier() const { return _info->get("CFBundleIdentifier").string(); }

String Bundle::pathForResource(const String& name, const String& type) const {
    const String file = type.isEmpty() ? name : String::concat({name, ".", type});
    const String relative = relativePath(file);
    if (relative.isNull())
        return nullptr;
    String path = appendingPathComponent(_path, relative);
    return fileExists(path) ? path : String();
}

String Bundle::localizedString(const String& englishText) const {
    return englishText.isNull() ? englishText : qx::localizedString(_path, englishText);
}

String Bundle::description() const { return String::concat({Object::description(), " ", _path}); }

const Class& Bundle::describedClass() const { return libraryClass<Bundle>("qx::Bundle"); }

} // namespace qx
