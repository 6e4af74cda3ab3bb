#pragma once

// How a document's text is stored: its byte-order mark and its encoding, which stay.

#include <QXXMLMarshalling/model/Data.h>
#include <QXXMLMarshalling/model/Error.h>

#include "xml/Encoding.h"

namespace qx::detail {

class SourceEncoding {
public:
    explicit SourceEncoding(std::string_view bytes);

    // Null for UTF-8, and where there is none.
    TextEncoder* encoder() const noexcept { return _encoder.get(); }
    // The bytes of a text that came from the document's text, of which each part that is the same
    // has the same bytes. Null with
    //   -231  "The document cannot be changed in its encoding: %@"
    Ref<Data> encoded(std::string text, std::string_view sourceText, Ref<Error>* error) const;

private:
    const std::string_view _bytes;
    const DocumentEncoding _encoding;
    std::unique_ptr<TextEncoder> _encoder;
    String _failure; // why there is none
};

} // namespace qx::detail
