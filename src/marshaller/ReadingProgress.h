#pragma once

// Tells the marshaller's handler how far a reading has come, about once a megabyte. It keeps the
// handler, which may set another meanwhile. Once cancelled, a reading stays so.

#include <QXXMLMarshalling/QXXMLMarshaller.h>

namespace qx::detail {

class ReadingProgress {
public:
    ReadingProgress(const QXXMLMarshaller& marshaller, std::uint64_t size) noexcept
        : _handler(marshaller._progressHandler), _size(size), _next(_handler ? step : UINT64_MAX) {}

    // False with -226 once the handler wants no more.
    bool mayPass(std::uint64_t bytesRead, Ref<Error>* error) {
        return bytesRead < _next || report(bytesRead, error);
    }
    bool isCancelled() const noexcept { return _isCancelled; }

private:
    static constexpr std::uint64_t step = 1'000'000;

    bool report(std::uint64_t bytesRead, Ref<Error>* error);

    const std::shared_ptr<QXXMLMarshaller::ProgressHandler> _handler;
    const std::uint64_t _size;
    std::uint64_t _next;
    bool _isCancelled = false;
};

} // namespace qx::detail
