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

} // namespace

bool QXXMLMarshallingMapping::loadIncludedDocuments(Ref<Error>* error) {
    return loadIncludedDocuments(nullptr, error);
}

// Depth first: each document's own classes, then those of its includes in order. A document reached
// on two branches is merged twice, and its classes are then reported as redefined.
bool QXXMLMarshallingMapping::loadIncludedDocuments(const Loading* loading, Ref<Error>* error) {
    // Made even without an include: hosts rely on the shared manager being there afterwards.
    const auto manager = QXXMLDataRepositoryManager::defaultManager();
    for (const String& href : _mapping->includes()) {
        for (const Loading* above = loading; above != nullptr; above = above->parent)
            if (above->href == href || above->depth >= deepestInclude)
                return qx::fail(error, qx::errors::unableToLoadInclude, href);
        if (!loadIncludedDocument(href, loading, error))
            return false;
    }
    return true;
}

bool QXXMLMarshallingMapping::loadIncludedDocument(const String& href, const Loading* loading,
                                                   Ref<Error>* error) {
    std::uint64_t size = 0;
    Ref<Error> problem;
    const auto document =
        QXXMLDataRepositoryManager::defaultManager()->documentNamed(href, &size, &problem);
    bool merged = false;
    if (!problem) {
        try {
            const Loading here{href, loading, loading != nullptr ? loading->depth + 1 : 1};
            auto included = qx::make<QXXMLMarshallingMapping>();
            merged = included->init(document.get(), &here, &problem);
            if (merged)
                _mapping->mergeDocumentMapping(included->mapping());
        } catch (const qx::Exception&) {
            return qx::fail(error, qx::errors::unableToLoadInclude, href);
        }
    }
    if (!merged && error != nullptr)
        *error = std::move(problem);
    return merged;
}
