#include "marshaller/ReadingProgress.h"

#include "model/Errors.h"

namespace qx::detail {

bool ReadingProgress::report(std::uint64_t bytesRead, Ref<Error>* error) {
    if (!_isCancelled) {
        _next = bytesRead + step;
        _isCancelled = !(*_handler)({bytesRead, _size});
    }
    if (!_isCancelled)
        return true;
    _next = 0;
    return fail(error, errors::readingCancelled);
}

} // namespace qx::detail

void QXXMLMarshaller::setProgressHandler(ProgressHandler handler) {
    _progressHandler = handler ? std::make_shared<ProgressHandler>(std::move(handler)) : nullptr;
}
