#include "marshaller/ReadingBudget.h"

#include "platform/system/Errors.h"

#include <limits>

namespace {

// Bytes of text that count as one node that is gone over.
constexpr std::size_t bytesPerVisit = 16;
// How often a reading may go over the whole document.
constexpr std::size_t visitsPerNode = 64;

// base + each * count, the largest number where that is more.
std::size_t total(std::size_t base, std::size_t each, std::size_t count) {
    constexpr std::size_t most = std::numeric_limits<std::size_t>::max();
    return count != 0 && each > (most - base) / count ? most : base + each * count;
}

std::size_t visitsFor(const qx::XMLExtent& extent) {
    return extent.nodes + extent.textSize / bytesPerVisit;
}

} // namespace

const qx::XMLExtent& ReadingBudget::whole() {
    if (!_whole)
        _whole = _root != nullptr ? _root->extent() : qx::XMLExtent();
    return *_whole;
}

std::size_t ReadingBudget::among(QXXMLMarshaller::Limit limit) {
    return total(limit.base, limit.perElement, whole().elements);
}

bool ReadingBudget::mayMake(const qx::String& className, ErrorSlot error) {
    const std::size_t limit = among(_marshaller.maximumObjects());
    _isSpent = _isSpent || _objects > limit;
    return !_isSpent || qx::fail(error, qx::errors::tooManyObjects, limit, className);
}

bool ReadingBudget::mayKeep(const qx::XMLElement& element, ErrorSlot error) {
    const std::size_t limit = among(_marshaller.maximumKeptNodes());
    _isSpent = _isSpent || _kept > limit;
    return !_isSpent || qx::fail(error, qx::errors::tooManyKeptNodes, limit, element.name());
}

bool ReadingBudget::mayVisit(const qx::XMLElement& element, ErrorSlot error) {
    const std::size_t forObjects = total(0, visitsPerObject, among(_marshaller.maximumObjects()));
    const std::size_t limit = total(forObjects, visitsPerNode, visitsFor(whole()));
    _isSpent = _isSpent || _visits > limit;
    return !_isSpent || qx::fail(error, qx::errors::tooManyVisits, limit, element.name());
}

bool ReadingBudget::mayJoin(const qx::XMLElement& element, ErrorSlot error) {
    return takeVisits(visitsFor(element.extent()), element, error);
}
