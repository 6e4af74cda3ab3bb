#include "xml/WritingLimits.h"

namespace qx {

void WritingLimits::enterLimited(const XMLPlace& element, std::size_t attributes,
                                 std::size_t declarations) {
    if (_depth > _reading->maximumDepth)
        refuseBeyond("elements nest deeper than", _reading->maximumDepth, element);
    if (attributes > xmlLimits::attributes)
        refuseBeyond("an element has more attributes than", xmlLimits::attributes, element);
    if (declarations == 0)
        return;
    _declarations.push_back({_depth, declarations});
    _namespaces += declarations;
    if (_namespaces > xmlLimits::namespaces)
        refuseBeyond("more namespace declarations are in force than", xmlLimits::namespaces,
                     element);
}

void WritingLimits::requireDocument(std::size_t size, const XMLPlace& document) const {
    if (_reading != nullptr && size > xmlLimits::documentSize)
        refuseBeyond("the document is larger than", xmlLimits::documentSize, document);
}

void WritingLimits::countName(const String& name, const XMLPlace& place) {
    if (_reading == nullptr)
        return;
    requireSize(name.size(), "a name is larger than", place);
    if (_names.insert(name).second)
        requireFewNames(place);
}

void WritingLimits::countURI(const String& URI, const XMLPlace& place) {
    if (_reading != nullptr && _URIs.insert(URI).second)
        requireFewNames(place);
}

void WritingLimits::requireFewNames(const XMLPlace& place) const {
    if (_names.size() + _URIs.size() > xmlLimits::names)
        refuseBeyond("the document has more different names than", xmlLimits::names, place);
}

} // namespace qx
