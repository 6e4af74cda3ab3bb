#pragma once

// Character encodings other than UTF-8: bytes of a document to UTF-8 before it is parsed, and back
// when it is written. Names are those that the C library's converter knows.

#include <QXXMLMarshalling/base/String.h>

#include <string>
#include <string_view>
#include <unordered_map>

namespace qx {

// "UTF-8" in any case, also without the hyphen.
bool isUTF8Name(std::string_view encoding) noexcept;

// The encoding that the first bytes show: by a byte-order mark, or by how "<?" is stored. Null for
// none, which leaves encodings that store ASCII as it is.
struct EncodingSignature {
    const char* encoding;
    // How many bytes the byte-order mark takes.
    std::size_t markSize;
};
EncodingSignature encodingSignature(std::string_view bytes) noexcept;

enum class DecodeResult { decoded, unknownEncoding, malformed };

// Appends the bytes as UTF-8; what stands in `text` when they are malformed came before that place.
DecodeResult decode(std::string_view bytes, const String& encoding, std::string& text);

// Writes one document in an encoding; belongs to one thread.
class TextEncoder {
public:
    // Raises NSInvalidArgumentException for an encoding that is unknown or could not be read back.
    explicit TextEncoder(const String& encoding);
    ~TextEncoder();
    TextEncoder(const TextEncoder&) = delete;
    TextEncoder& operator=(const TextEncoder&) = delete;

    // False for a character that the encoding lacks; it is given by its UTF-8 text too.
    bool canEncode(char32_t c, std::string_view character);
    // Text whose every character can be encoded.
    std::string encoded(std::string_view text);

private:
    bool convert(std::string_view text, std::string& bytes);

    void* _converter;
    String _name;
    std::unordered_map<char32_t, bool> _known;
};

} // namespace qx
