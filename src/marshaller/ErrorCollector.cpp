#include "marshaller/ErrorCollector.h"

#include "marshaller/ReadingContext.h"

#include <algorithm>

namespace qx::detail {

ErrorCollector::ErrorCollector(const QXXMLMarshaller& marshaller, const Ref<Error>* slot) noexcept
    : _most(slot != nullptr && !*slot ? marshaller.maximumErrors() : 1),
      _keepsPartial(marshaller.keepsPartial()) {}

bool ErrorCollector::take(Ref<Error>& slot) {
    const bool isFull = _errors.size() + 1 >= _most;
    if (isFull && (_most <= 1 || !_keepsPartial))
        return false;
    if (!isFull || _errors.size() < _most)
        _errors.push_back(std::move(slot));
    slot = nullptr;
    return true;
}

// Errors without a place in a document that is still there keep their order, before the others.
void ErrorCollector::sort(std::size_t begin) {
    std::vector<std::pair<IndexedXML::Number, Ref<Error>>> ordered;
    const auto first = _errors.begin() + static_cast<std::ptrdiff_t>(begin);
    std::transform(first, _errors.end(), std::back_inserter(ordered), [](Ref<Error>& error) {
        const auto* const context =
            dynamic_cast<const ReadingContext*>(&ErrorDetails::contextOf(*error));
        return std::pair(context != nullptr ? context->order() : 0, std::move(error));
    });
    std::ranges::stable_sort(ordered, {}, [](const auto& entry) { return entry.first; });
    std::ranges::transform(ordered, first, [](auto& entry) { return std::move(entry.second); });
}

void ErrorCollector::settle(std::size_t begin) {
    sort(begin);
    for (std::size_t i = begin; i < _errors.size(); ++i) {
        const ErrorContext& context = ErrorDetails::contextOf(*_errors[i]);
        ErrorDetails::setContext(*_errors[i], std::make_unique<KnownContext>(context));
    }
}

bool ErrorCollector::giveTo(Ref<Error>* slot) {
    if (slot == nullptr || _errors.empty())
        return slot != nullptr && *slot;
    if (*slot)
        _errors.push_back(std::move(*slot));
    sort(0);
    *slot = _errors.front();
    ErrorDetails::setOthers(**slot, {_errors.begin() + 1, _errors.end()});
    return true;
}

} // namespace qx::detail
