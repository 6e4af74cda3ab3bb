#include "model/ErrorDetails.h"

#include <algorithm>

namespace qx::detail {

namespace {

// Bytes of a line that are kept on either side of a place.
constexpr std::size_t mostKept = 512;

constexpr bool isContinuation(char byte) noexcept {
    return (static_cast<unsigned char>(byte) & 0xC0U) == 0x80U;
}

} // namespace

ErrorDetails& ErrorDetails::of(Error& error) {
    if (!error._details)
        error._details = std::make_unique<ErrorDetails>();
    return *error._details;
}

void ErrorDetails::setContext(Error& error, std::unique_ptr<const ErrorContext> context) {
    of(error)._context = std::move(context);
}

void ErrorDetails::suggest(Error& error, String suggestion) {
    const ErrorContext& before = contextOf(error);
    setContext(error, std::make_unique<KnownContext>(before.source(), before.mapping(),
                                                     std::move(suggestion)));
}

void ErrorDetails::setOthers(Error& error, std::vector<Ref<const Error>> others) {
    of(error)._others = std::move(others);
}

const ErrorContext& ErrorDetails::contextOf(const Error& error) {
    static const ErrorContext none;
    return hasContext(error) ? *error._details->_context : none;
}

const std::vector<Ref<const Error>>& ErrorDetails::othersOf(const Error& error) {
    static const std::vector<Ref<const Error>> none;
    return error._details != nullptr ? error._details->_others : none;
}

void ErrorDetails::nameDocument(Ref<Error>* error, const String& documentName) {
    if (error == nullptr || !*error || !hasContext(**error))
        return;
    const ErrorContext& before = contextOf(**error);
    SourcePlace source = before.source();
    source.place.documentName = documentName;
    setContext(**error, std::make_unique<KnownContext>(std::move(source), before.mapping(),
                                                       before.suggestion()));
}

void setExcerpt(SourcePlace& source, std::string_view text, std::size_t offset, std::size_t begin) {
    offset = std::min(offset, text.size());
    begin = std::min(begin, offset);
    std::size_t first = offset;
    while (first > begin && offset - first < mostKept && text[first - 1] != '\n')
        --first;
    while (first < offset && isContinuation(text[first]))
        ++first;
    std::size_t last = offset;
    while (last < text.size() && last - offset < mostKept && text[last] != '\n' &&
           text[last] != '\r')
        ++last;
    while (last > offset && last < text.size() && isContinuation(text[last]))
        --last;
    source.excerpt = String(text.substr(first, last - first));
    source.excerptColumn = 1 + static_cast<std::size_t>(
                                   std::count_if(text.begin() + static_cast<std::ptrdiff_t>(first),
                                                 text.begin() + static_cast<std::ptrdiff_t>(offset),
                                                 [](char byte) { return !isContinuation(byte); }));
}

} // namespace qx::detail
