#pragma once

// Character encodings other than UTF-8: bytes of a document to UTF-8 before it is parsed, and back
// when it is written. Names are those that the C library's converter knows.

#include <QXXMLMarshalling/base/String.h>

#include <memory>
#include <string>
#include <string_view>
#include <unordered_map>

namespace qx {

struct ConverterCloser {
    void operator()(void* converter) const noexcept;
};
using ConverterHandle = std::unique_ptr<void, ConverterCloser>;

// "UTF-8" in any case, also without the hyphen.
bool isUTF8Name(std::string_view encoding) noexcept;

// Reads one document, which may come in pieces, as UTF-8; belongs to one thread.
class TextDecoder {
public:
    explicit TextDecoder(const String& encoding);
    // False for an encoding that is not known: nothing can be decoded then.
    bool isKnown() const noexcept { return _converter != nullptr; }

    // Appends the bytes as UTF-8; false when they are malformed, behind what came before. A
    // character that is cut off at the end waits for the next bytes.
    bool decode(std::string_view bytes, std::string& text);
    // The document ends here. False in the middle of a character.
    bool finish(std::string& text);

private:
    ConverterHandle _converter;
    std::string _cutOff;
};

// The value of encoding="…" in the XML declaration that the text begins with; null where there is
// none. What is wrong with a declaration is for the parser to say.
String encodingInDeclaration(std::string_view text);

// How a document is stored, as its first bytes show: the signature, or the declaration.
struct DocumentEncoding {
    String name; // null for UTF-8
    // How many bytes the byte-order mark takes.
    std::size_t markSize = 0;
    bool isDeclared = false;
    // As the declaration names it; null where it names none or the bytes have to be made UTF-8
    // first.
    String declared;

    // An encoding that stores ASCII in another way cannot be what the declaration was read in.
    bool isContradictedBy(std::string_view text) const noexcept;
};
DocumentEncoding encodingOf(std::string_view bytes);

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

    ConverterHandle _converter;
    String _name;
    bool _lacksASCII = false;
    std::unordered_map<char32_t, bool> _known;
};

} // namespace qx
