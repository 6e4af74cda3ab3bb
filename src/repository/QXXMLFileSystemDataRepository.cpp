#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/host/ProcessInfo.h>
#include <QXXMLMarshalling/host/UserDefaults.h>

#include "files/AtomicWrite.h"
#include "files/Files.h"
#include "files/Paths.h"
#include "files/SystemErrors.h"
#include "host/Directories.h"
#include "host/Log.h"
#include "model/ErrorDetails.h"
#include "model/Errors.h"
#include "repository/NameLookUp.h"

#include <atomic>
#include <cerrno>

using qx::Array;
using qx::Bundle;
using qx::Data;
using qx::Error;
using qx::Exception;
using qx::Ref;
using qx::String;
using qx::Value;
using qx::XMLDocument;
using qx::detail::NameLookUp;

namespace {

std::atomic<QXXMLFileSystemDataRepository::CreateFunction> createFunction{nullptr};

// The program's directory below one of the user's.
String directoryForProcess(const String& directory, const String& processName) {
    String base = appendingPathComponent(directory, ""); // without slashes at its end
    return base.view().ends_with(processName) ? base : appendingPathComponent(base, processName);
}

// The directory of a version below the program's: that one itself without a version, null for a
// version that leads out of it ("..") or is none (".").
String directoryForVersion(const String& base, const String& version) {
    if (version.isEmpty())
        return base;
    const String relative = relativePath(version);
    return relative.isNull() ? String() : appendingPathComponent(base, relative);
}

// What may stand in a directory's name: digits and dots from the start, "(" as one more dot.
std::string cleanedVersion(const Value& version) {
    const String text = version.isNumber() ? version.description() : version.string();
    std::string cleaned;
    for (const char c : text.view()) {
        if ((c >= '0' && c <= '9') || c == '.')
            cleaned += c;
        else if (c == '(')
            cleaned += '.';
        else
            break;
    }
    return cleaned;
}

} // namespace

void QXXMLFileSystemDataRepository::setRepositoryCreateFunction(CreateFunction function) noexcept {
    createFunction = function;
}

QXXMLFileSystemDataRepository::QXXMLFileSystemDataRepository()
    : _searchPaths(qx::make<Array>()), _searchBundles(qx::make<Array>()) {}

QXXMLFileSystemDataRepository::~QXXMLFileSystemDataRepository() = default;

void QXXMLFileSystemDataRepository::initialize(QXXMLFileSystemDataRepository& repository) {
    repository.initializeSearchPaths();
    if (const CreateFunction function = createFunction)
        function(repository);
}

void QXXMLFileSystemDataRepository::setSearchPaths(const Ref<Array>& paths) {
    _searchPaths = paths ? paths : qx::make<Array>();
}

void QXXMLFileSystemDataRepository::setSearchBundles(const Ref<Array>& bundles) {
    _searchBundles = bundles ? bundles : qx::make<Array>();
}

void QXXMLFileSystemDataRepository::initializeSearchPaths() {
    _searchPaths = qx::make<Array>();
    const String processName = qx::ProcessInfo::processName();
    for (const String& directory : qx::searchPathForApplicationSupport())
        addPathToSearchPaths(directory, processName);
    if (_searchPaths->isEmpty())
        throw Exception(Exception::internalInconsistency,
                        "No application support directories found");

    // The library's own class stands for its bundle even where it is linked into the program.
    const std::type_info& type = typeid(*this);
    const bool isLibrarys = type == typeid(QXXMLFileSystemDataRepository);
    _searchBundles = qx::make<Array>();
    for (const auto& bundle : {Bundle::mainBundle(), isLibrarys ? Bundle::frameworkBundle()
                                                                : Bundle::bundleForClass(type)})
        if (bundle)
            _searchBundles->add(bundle);
}

void QXXMLFileSystemDataRepository::addPathToSearchPaths(const String& directory,
                                                         const String& processName) {
    const String base = directoryForProcess(directory, processName);
    const String versioned = directoryForVersion(base, applicationVersion());
    if (!versioned.isNull())
        _searchPaths->add(versioned);
    _searchPaths->add(base);
}

Ref<Bundle> QXXMLFileSystemDataRepository::applicationBundle() {
    const Value identifier =
        qx::UserDefaults::standardUserDefaults()->objectForKey(clientBundleIdentifierKey);
    if (identifier.isNull())
        return Bundle::mainBundle();
    if (auto bundle = Bundle::bundleWithIdentifier(identifier.string()))
        return bundle;
    logWarningOrLine("Unable to locate bundle with identifier: %@", identifier);
    return Bundle::mainBundle();
}

String QXXMLFileSystemDataRepository::applicationVersion() {
    const Ref<Bundle> bundle = applicationBundle();
    if (!bundle)
        return "";
    const std::string build = cleanedVersion(bundle->objectForInfoDictionaryKey("CFBundleVersion"));
    const std::string version =
        cleanedVersion(bundle->objectForInfoDictionaryKey("CFBundleShortVersionString"));
    if (version.empty())
        return build;
    return build.empty() ? String(version) : String::concat({version, ".", build});
}

String QXXMLFileSystemDataRepository::pathForResourceNamed(const String& name) {
    const String relative = relativePath(name);
    if (relative.isNull())
        return nullptr;
    // Kept while it is walked: whoever is called meanwhile may set another list.
    const Ref<Array> paths = _searchPaths;
    for (const Value& directory : *paths) {
        if (!directory.isString())
            continue;
        String candidate = appendingPathComponent(directory.string(), relative);
        if (fileExists(candidate))
            return candidate;
    }
    return pathForResourceInBundlesNamed(name);
}

String QXXMLFileSystemDataRepository::pathForResourceInBundlesNamed(const String& name) {
    const Ref<Array> bundles = _searchBundles;
    for (const Value& item : *bundles) {
        const auto bundle = item.as<Bundle>();
        String path = bundle ? bundle->pathForResource(name) : String();
        if (!path.isNull())
            return path;
    }
    return nullptr;
}

bool QXXMLFileSystemDataRepository::containsDocument(const String& name) {
    const String path = pathForResourceNamed(name);
    NameLookUp::leave(*this, name, path);
    return !path.isNull();
}

bool QXXMLFileSystemDataRepository::containsData(const String& name) {
    const String path = pathForResourceNamed(name);
    NameLookUp::leave(*this, name, path);
    return !path.isNull();
}

Ref<Data> QXXMLFileSystemDataRepository::dataForName(const String& name, Ref<Error>* error) {
    String path = NameLookUp::take(*this, name);
    if (path.isNull())
        path = pathForResourceNamed(name);
    return path.isNull() ? Ref<Data>() : readFile(path, error, qx::ReadableFiles::regular);
}

Ref<XMLDocument> QXXMLFileSystemDataRepository::documentNamed(const String& name,
                                                              std::uint64_t* size,
                                                              Ref<Error>* error) {
    String path = NameLookUp::take(*this, name);
    if (path.isNull())
        path = pathForResourceNamed(name);
    const NameLookUp lookUp; // the path goes on to dataForName, which a subclass may have replaced
    NameLookUp::leave(*this, name, path);
    const Ref<Data> data = dataForName(name, error);
    if (size != nullptr)
        *size = data ? data->size() : 0;
    auto document = data ? XMLDocument::initWithData(*data, {}, error) : nullptr;
    qx::detail::ErrorDetails::nameDocument(error, path);
    if (document)
        document->setDocumentName(path);
    return document;
}

String QXXMLFileSystemDataRepository::userOverrideArea() {
    const auto directories = qx::searchPathForApplicationSupport();
    if (directories.empty())
        return nullptr;
    return directoryForProcess(directories.back(), qx::ProcessInfo::processName());
}

Ref<Error> QXXMLFileSystemDataRepository::createUserOverrideArea(const String& directory) {
    Ref<Error> error;
    if (!fileExists(directory))
        createDirectoryWithParents(directory, &error);
    else if (!isDirectory(directory))
        fail(&error, qx::errors::areaIsNoDirectory, directory);
    return error;
}

String QXXMLFileSystemDataRepository::writeFile(const Ref<Data>& data, const String& directory,
                                                const String& name, Ref<Error>* error) {
    const String relative = relativePath(name);
    if (relative.isNull())
        return fail(error, qx::errors::invalidFileName);
    if (directory.isEmpty())
        return failWithSystemError(error, qx::errors::writeFailed, relative, ENOENT);
    const String target = appendingPathComponent(directory, relative);
    if (!data)
        return failWithSystemError(error, qx::errors::writeFailed, target, EINVAL);
    if (!checkLengthOfPath(target, error))
        return nullptr;
    if (Ref<Error> problem = createUserOverrideArea(directory)) {
        if (error != nullptr)
            *error = std::move(problem);
        return nullptr;
    }
    // "maps/a.xml" stands in a folder of its own.
    if (!createDirectoryWithParents(directoryOf(target), error))
        return nullptr;
    return writeFileAtomically(target, data->view(), error) ? target : String();
}

String QXXMLFileSystemDataRepository::writeFileToUserOverrideArea(const Ref<Data>& data,
                                                                  const String& name,
                                                                  Ref<Error>* error) {
    return writeFile(data, userOverrideArea(), name, error);
}

String QXXMLFileSystemDataRepository::writeFileToVersionedUserOverrideArea(const Ref<Data>& data,
                                                                           const String& name,
                                                                           Ref<Error>* error) {
    const String area = userOverrideArea();
    if (area.isNull())
        return writeFile(data, area, name, error);
    const String versioned = directoryForVersion(area, applicationVersion());
    if (versioned.isNull())
        return fail(error, qx::errors::invalidFileName);
    return writeFile(data, versioned, name, error);
}

String QXXMLFileSystemDataRepository::writeDocumentToUserOverrideArea(
    const Ref<XMLDocument>& document, const String& name, Ref<Error>* error) {
    constexpr qx::XMLOptions options = qx::XMLPrettyPrint | qx::XMLCompactEmptyElements;
    Ref<Data> data;
    try {
        if (document)
            data = qx::make<Data>(document->XMLData(options));
    } catch (const Exception& exception) {
        return fail(error, qx::errors::textCannotBeWritten, exception.reason());
    }
    return writeFileToUserOverrideArea(data, name, error);
}

String QXXMLFileSystemDataRepository::description() const {
    if (_searchPaths->isEmpty())
        return Object::description();
    return String::concat({Object::description(), " searchPaths: ", _searchPaths->description()});
}
