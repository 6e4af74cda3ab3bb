#include "saving/SourceEncoding.h"

#include <QXXMLMarshalling/base/Exception.h>

#include "model/Errors.h"

namespace qx::detail {

// Some encodings can be read, but no document is written in them.
SourceEncoding::SourceEncoding(std::string_view bytes)
    : _bytes(bytes), _encoding(encodingOf(bytes)) {
    try {
        if (!_encoding.name.isNull())
            _encoder = std::make_unique<TextEncoder>(_encoding.name);
    } catch (const Exception& exception) {
        _failure = exception.reason();
    }
}

// Where the document's bytes are what its text gives in its encoding, so are those of each part.
Ref<Data> SourceEncoding::encoded(std::string text, std::string_view sourceText,
                                  Ref<Error>* error) const {
    if (!_failure.isNull())
        return fail(error, errors::encodingCannotBeKept, _failure);
    const std::string bytes(_bytes.substr(0, _encoding.markSize));
    if (_encoder == nullptr)
        return make<Data>(std::move(text.insert(0, bytes)));
    try {
        if (bytes + _encoder->encoded(sourceText) == _bytes)
            return make<Data>(bytes + _encoder->encoded(text));
    } catch (const Exception& exception) {
        return fail(error, errors::encodingCannotBeKept, exception.reason());
    }
    return fail(error, errors::encodingCannotBeKept, _encoding.name);
}

} // namespace qx::detail
