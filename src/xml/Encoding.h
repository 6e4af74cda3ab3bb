#pragma once

// Character encodings other than UTF-8: bytes of a document to UTF-8 before it is parsed, and back
// when it is written. Names are those that the C library's converter knows.

#include <QXXMLMarshalling/base/String.h>

#include <memory>
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

    // False for a character that the encoding lacks, or that would be read back as another; it is
    // given by its UTF-8 text too.
    bool canEncode(char32_t c, std::string_view character);
    // Whether that may be one of ASCII: some encodings have other signs in a few of its places.
    bool lacksASCII() const noexcept { return _lacksASCII; }
    // Text whose every character can be encoded. Raises NSInvalidArgumentException where it would
    // not be read back as it is: some encodings join characters.
    std::string encoded(std::string_view text);

private:
    bool convert(std::string_view text, std::string& bytes);
    bool comesBack(std::string_view text);

    struct Closer {
        void operator()(void* converter) const noexcept;
    };
    std::unique_ptr<void, Closer> _converter;
    String _name;
    bool _lacksASCII = false;
    std::unordered_map<char32_t, bool> _known;
};

} // namespace qx
