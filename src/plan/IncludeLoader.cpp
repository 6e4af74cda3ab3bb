#include "plan/IncludeLoader.h"

#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/base/Exception.h>

#include "mapping/MappingSource.h"

#include <algorithm>

namespace qx::detail {

namespace {

// Documents that include one another in a line longer than this are refused like a cycle.
constexpr std::size_t deepestInclude = 256;

// So many documents are loaded for one mapping. A few that include the next twice each would ask
// for more than any machine can load.
constexpr std::size_t mostIncludes = 10'000;

} // namespace

// A document's classes are checked once its includes are there, those of its includes before it. A
// document reached on two branches is merged twice, and its classes are then reported as redefined.
bool IncludeLoader::load(QXXMLDocumentMapping& document, Ref<Error>* error) {
    const std::size_t begin = _classes.count();
    _classes.add(document);
    return loadIncludes(document, error) && _classes.areDistinctFrom(begin, error);
}

bool IncludeLoader::loadIncludes(const QXXMLDocumentMapping& document, Ref<Error>* error) {
    // Made even without an include: hosts rely on the shared manager being there afterwards.
    const auto manager = QXXMLDataRepositoryManager::defaultManager();
    for (std::size_t i = 0; i < document.includes().size(); ++i) {
        const String& href = document.includes()[i];
        const bool isCycle = std::any_of(_open.begin(), _open.end(),
                                         [&](const String* open) { return *open == href; });
        if (isCycle || _open.size() == deepestInclude || _count == mostIncludes)
            return fail(error, errors::unableToLoadInclude, href);
        ++_count;
        _open.push_back(&href);
        if (!loadInclude(*manager, document, i, error))
            return false;
        _open.pop_back();
    }
    return true;
}

bool IncludeLoader::loadInclude(const QXXMLDataRepositoryManager& manager,
                                const QXXMLDocumentMapping& includer, std::size_t number,
                                Ref<Error>* error) {
    const String& href = includer.includes()[number];
    std::uint64_t size = 0;
    Ref<Error> problem;
    const auto document = manager.documentNamed(href, &size, &problem);
    bool loaded = false;
    if (!problem) {
        try {
            loaded = resolve(document.get(), includer, number, &problem);
        } catch (const Exception&) {
            return fail(error, errors::unableToLoadInclude, href);
        }
    }
    if (!loaded && error != nullptr)
        *error = std::move(problem);
    return loaded;
}

bool IncludeLoader::resolve(XMLDocument* document, const QXXMLDocumentMapping& includer,
                            std::size_t number, Ref<Error>* error) {
    XMLElement* const root = document != nullptr ? document->rootElement() : nullptr;
    const auto mapping = QXXMLDocumentMapping::initWithXML(root, error);
    if (!mapping || *error)
        return false;
    auto& source = MappingSource::of(*mapping);
    if (source.name().isNull())
        source.setName(includer.includes()[number]);
    source.setIncluder(Ref(&MappingSource::of(includer)), includer.includePlace(number));
    _included.push_back(mapping);
    return load(*mapping, error);
}

} // namespace qx::detail
