#include "marshaller/ReadingBudget.h"

#include "model/Errors.h"

#include <limits>

namespace qx::detail {

namespace {

constexpr std::size_t visitsPerObject = 16;
// How often a reading may go over the whole document.
constexpr std::size_t visitsPerNode = 64;
// Bytes of text that count as one node that is gone over.
constexpr std::size_t bytesPerVisit = 16;
// The nodes that are measured first, and how many times as many next.
constexpr std::size_t measuredFirst = 4'096;
constexpr std::size_t measuredNext = 4;

// base + each * count, the largest number where that is more.
std::size_t total(std::size_t base, std::size_t each, std::size_t count) noexcept {
    constexpr std::size_t most = std::numeric_limits<std::size_t>::max();
    return count != 0 && each > (most - base) / count ? most : base + each * count;
}

std::size_t visitsFor(const IndexedXML::Extent& extent) noexcept {
    return extent.nodes + extent.textSize / bytesPerVisit;
}

} // namespace

ReadingBudget::ReadingBudget(const QXXMLMarshaller& marshaller, IndexedXML& document) noexcept
    : _marshaller(marshaller), _document(document) {
    setLimits();
}

void ReadingBudget::setLimits() noexcept {
    const auto among = [this](QXXMLMarshaller::Limit limit) {
        return total(limit.base, limit.perElement, _measured.elements);
    };
    _objects.limit = among(_marshaller.maximumObjects());
    _kept.limit = among(_marshaller.maximumKeptNodes());
    _visits.limit =
        total(total(0, visitsPerObject, _objects.limit), visitsPerNode, visitsFor(_measured));
}

// Measures the document until it gives what was taken, or there is no more of it.
bool ReadingBudget::isWithin(const Count& count) {
    while (!_isSpent && count.taken > count.limit) {
        _isSpent = _document.root() == IndexedXML::none || _measured.nodes < _enough;
        if (_isSpent)
            break;
        _enough = total(measuredFirst, measuredNext, _enough);
        _measured = _document.extent(_document.root(), _enough);
        setLimits();
    }
    return !_isSpent;
}

bool ReadingBudget::mayMake(const String& className, ErrorSlot error) {
    return isWithin(_objects) || fail(error, errors::tooManyObjects, _objects.limit, className);
}

bool ReadingBudget::mayKeep(Number element, ErrorSlot error) {
    return isWithin(_kept) ||
           fail(error, errors::tooManyKeptNodes, _kept.limit, _document.name(element));
}

bool ReadingBudget::mayVisit(Number element, ErrorSlot error) {
    return isWithin(_visits) ||
           fail(error, errors::tooManyVisits, _visits.limit, _document.name(element));
}

bool ReadingBudget::mayJoin(Number element, ErrorSlot error) {
    return takeVisits(visitsFor(_document.extent(element)), element, error);
}

} // namespace qx::detail
