#include "saving/SourceEncoding.h"

#include <QXXMLMarshalling/base/Exception.h>

#include "model/Errors.h"

namespace qx::detail {

SourceEncoding::SourceEncoding(std::string_view bytes)
    : _bytes(bytes), _encoding(encodingOf(bytes)),
      _encoder(_encoding.name.isNull() ? nullptr : std::make_unique<TextEncoder>(_encoding.name)) {}

// Where the document's bytes are what its text gives in its encoding, so are those of each part.
Ref<Data> SourceEncoding::encoded(std::string text, std::string_view sourceText,
                                  Ref<Error>* error) const {
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
