#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>
#include <QXXMLMarshalling/platform/Exception.h>

#include "platform/system/Errors.h"
#include "resolved/MappingIndex.h"

using qx::Error;
using qx::Ref;
using qx::String;

namespace {

// Documents that include one another in a line longer than this are refused like a cycle.
constexpr std::size_t deepestInclude = 256;

// So many documents are loaded for one mapping. A few that include the next twice each would ask
// for more than any machine can load.
constexpr std::size_t mostIncludes = 10'000;

} // namespace

bool QXXMLMarshallingMapping::loadIncludedDocuments(Ref<Error>* error) {
    return _plan != nullptr || loadIncludedDocuments(nullptr, error);
}

// Depth first: each document's own classes, then those of its includes in order. A document reached
// on two branches is merged twice, and its classes are then reported as redefined.
bool QXXMLMarshallingMapping::loadIncludedDocuments(const Loading* loading, Ref<Error>* error) {
    // Made even without an include: hosts rely on the shared manager being there afterwards.
    const auto manager = QXXMLDataRepositoryManager::defaultManager();
    std::size_t first = 0;
    std::size_t& count = loading != nullptr ? loading->count : first;
    const std::size_t depth = loading != nullptr ? loading->depth + 1 : 1;
    for (const String& href : _mapping->includes()) {
        bool isCycle = false;
        for (const Loading* above = loading; above != nullptr; above = above->parent)
            isCycle = isCycle || above->href == href;
        if (isCycle || depth > deepestInclude || count == mostIncludes)
            return qx::fail(error, qx::errors::unableToLoadInclude, href);
        ++count;
        if (!loadIncludedDocument(*manager, {href, loading, depth, count}, error))
            return false;
    }
    return true;
}

bool QXXMLMarshallingMapping::loadIncludedDocument(const QXXMLDataRepositoryManager& manager,
                                                   const Loading& here, Ref<Error>* error) {
    std::uint64_t size = 0;
    Ref<Error> problem;
    const auto document = manager.documentNamed(here.href, &size, &problem);
    bool merged = false;
    if (!problem) {
        try {
            auto included = qx::make<QXXMLMarshallingMapping>();
            merged = included->init(document.get(), &here, &problem);
            if (merged)
                _mapping->mergeDocumentMapping(included->mapping());
        } catch (const qx::Exception&) {
            return qx::fail(error, qx::errors::unableToLoadInclude, here.href);
        }
    }
    if (!merged && error != nullptr)
        *error = std::move(problem);
    return merged;
}
