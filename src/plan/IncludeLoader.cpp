#include "plan/IncludeLoader.h"

#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/base/Exception.h>

#include "files/Files.h"
#include "files/Paths.h"
#include "mapping/MappingSource.h"
#include "model/ErrorDetails.h"

#include <algorithm>
#include <utility>

namespace qx::detail {

namespace {

// Documents that include one another in a line longer than this are refused like a cycle.
constexpr std::size_t deepestInclude = 256;

// So many documents are loaded for one mapping. A few that include the next twice each would ask
// for more than any machine can load.
constexpr std::size_t mostIncludes = 10'000;

} // namespace

bool IncludeLoader::load(QXXMLDocumentMapping& document, Ref<Error>* error) {
    const bool isLoaded = loadWithIncludes(document, error);
    _classes = {};
    return isLoaded;
}

// A document's classes are checked once its includes are there, those of its includes before it. A
// document reached on two branches is merged twice, and its classes are then reported as redefined.
bool IncludeLoader::loadWithIncludes(const QXXMLDocumentMapping& document, Ref<Error>* error) {
    const std::size_t begin = _classes.count();
    _classes.add(document);
    if (!loadIncludes(document, error))
        return false;
    if (!MappingSource::of(document).collectsFaults())
        return _classes.areDistinctFrom(begin, error);
    _classes.tellRepeatedFrom(begin, [](const QXXMLClassMapping& mapping, Ref<Error> fault) {
        MappingSource::of(mapping).addFault(std::move(fault));
    });
    return true;
}

bool IncludeLoader::loadIncludes(const QXXMLDocumentMapping& document, Ref<Error>* error) {
    // Made even without an include: hosts rely on the shared manager being there afterwards.
    const auto manager = QXXMLDataRepositoryManager::defaultManager();
    const MappingSource& source = MappingSource::of(document);
    for (std::size_t i = 0; i < document.includes().size(); ++i) {
        if (loadInclude(*manager, document, i, error))
            continue;
        if (error != nullptr)
            MappingSource::locate(*error, document, i);
        if (!source.collectsFaults())
            return false;
        source.addFault(std::exchange(*error, nullptr));
    }
    return true;
}

bool IncludeLoader::loadInclude(const QXXMLDataRepositoryManager& manager,
                                const QXXMLDocumentMapping& includer, std::size_t number,
                                Ref<Error>* error) {
    const String& href = includer.includes()[number];
    const bool isCycle =
        std::any_of(_open.begin(), _open.end(), [&](const String* open) { return *open == href; });
    if (isCycle || _open.size() == deepestInclude || _count == mostIncludes) {
        fail(error, errors::unableToLoadInclude, href);
        if (isCycle && error != nullptr) {
            MappingSource::locate(*error, includer, number);
            ErrorDetails::suggest(**error, "it is being included already: take out the include "
                                           "that leads back to it");
        }
        return false;
    }
    ++_count;
    _open.push_back(&href);
    Ref<Error> problem;
    const auto document = find(manager, href, &problem);
    bool loaded = false;
    if (!problem) {
        try {
            loaded = resolve(document.get(), includer, number, &problem);
        } catch (const Exception&) {
            fail(&problem, errors::unableToLoadInclude, href);
        }
    }
    _open.pop_back();
    if (!loaded && error != nullptr)
        *error = std::move(problem);
    return loaded;
}

// Null where nothing has the document. A repository that has it decides what it is, if only null.
Ref<XMLDocument> IncludeLoader::find(const QXXMLDataRepositoryManager& manager, const String& href,
                                     Ref<Error>* error) const {
    std::uint64_t size = 0;
    auto document = manager.documentNamed(href, &size, error);
    if (document || *error || _folder.isNull() || manager.repositoryForDocumentNamed(href))
        return document;
    return findInFolder(href, error);
}

Ref<XMLDocument> IncludeLoader::findInFolder(const String& href, Ref<Error>* error) const {
    const String name = relativePath(href);
    if (name.isNull())
        return nullptr;
    const String path = appendingPathComponent(_folder, name);
    if (!fileExists(path))
        return nullptr;
    const auto data = readFile(path, error, ReadableFiles::regular);
    auto document = data ? XMLDocument::initWithData(*data, {}, error) : nullptr;
    ErrorDetails::nameDocument(error, path);
    if (document)
        document->setDocumentName(path);
    return document;
}

bool IncludeLoader::resolve(XMLDocument* document, const QXXMLDocumentMapping& includer,
                            std::size_t number, Ref<Error>* error) {
    XMLElement* const root = document != nullptr ? document->rootElement() : nullptr;
    if (document == nullptr)
        _missing.push_back({Ref(&includer), number});
    const auto mapping = MappingSource::included(includer, number, document)->read(root, error);
    if (!mapping || *error)
        return false;
    _included.push_back(mapping);
    return loadWithIncludes(*mapping, error);
}

} // namespace qx::detail
