#pragma once

// Tells the marshaller's handler how far a reading has come, about once a megabyte. It keeps the
// handler, which may set another meanwhile. Once cancelled, a reading stays so.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include <algorithm>
#include <utility>

namespace qx::detail {

class ReadingProgress {
public:
    ReadingProgress(const QXXMLMarshaller& marshaller, std::uint64_t size) noexcept
        : _handler(marshaller._progressHandler), _size(size), _next(_handler ? step : UINT64_MAX) {}

    // False with -226 once the handler wants no more. Of a document that is read in pieces the
    // place is one of the piece.
    bool mayPass(std::uint64_t place, Ref<Error>* error) {
        place = std::min(_before + place, _most);
        return place < _next || report(place, error);
    }
    // Of a piece for which the document was read so far.
    bool startPiece(std::uint64_t bytesRead, Ref<Error>* error) {
        _before = std::exchange(_read, bytesRead);
        _most = bytesRead;
        return mayPass(0, error);
    }
    bool isCancelled() const noexcept { return _isCancelled; }

private:
    static constexpr std::uint64_t step = 1'000'000;

    bool report(std::uint64_t bytesRead, Ref<Error>* error);

    const std::shared_ptr<QXXMLMarshaller::ProgressHandler> _handler;
    const std::uint64_t _size;
    std::uint64_t _next;
    std::uint64_t _before = 0; // the piece
    std::uint64_t _read = 0;
    std::uint64_t _most = UINT64_MAX;
    bool _isCancelled = false;
};

} // namespace qx::detail
