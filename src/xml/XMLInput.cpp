#include "xml/XMLInput.h"

#include "xml/AttributeCounts.h"
#include "xml/Encoding.h"
#include "xml/ParseFailure.h"
#include "xml/XMLCharacters.h"
#include "xml/XMLLimits.h"

namespace qx {

namespace {

constexpr std::string_view declarationStart = "<?xml";

// The value of encoding="…" in the XML declaration; null where there is none. What is wrong with a
// declaration is for the parser to say.
String encodingInDeclaration(std::string_view text) {
    if (!text.starts_with(declarationStart))
        return nullptr;
    text = text.substr(0, text.find("?>"));
    constexpr std::string_view name = "encoding";
    const std::size_t at = text.find(name);
    if (at == std::string_view::npos || !isWhite(text[at - 1]))
        return nullptr;
    text = withoutLeadingWhite(text.substr(at + name.size()));
    if (!text.starts_with('='))
        return nullptr;
    text = withoutLeadingWhite(text.substr(1));
    if (!text.starts_with('"') && !text.starts_with('\''))
        return nullptr;
    const std::size_t end = text.find(text.front(), 1);
    if (end == std::string_view::npos)
        return nullptr;
    return text.substr(1, end - 1);
}

} // namespace

void XMLInput::read(std::string_view bytes, bool copies) {
    const bool isConverted = decodeBytes(bytes);
    checkStart();
    if (!isConverted && copies)
        _text = _own = _text;
    const std::size_t tag = findTagBeyond(_text, xmlLimits::attributes);
    if (tag != std::string_view::npos)
        throw ParseFailure(parseErrors::tooManyAttributes, {xmlLimits::attributes}, tag);
}

bool XMLInput::decodeBytes(std::string_view bytes) {
    const EncodingSignature signature = encodingSignature(bytes);
    if (signature.encoding != nullptr) {
        bytes.remove_prefix(signature.markSize);
        if (isUTF8Name(signature.encoding))
            _text = bytes;
        else
            convert(bytes, signature.encoding);
        _declaredEncoding = encodingInDeclaration(_text);
        return !isUTF8Name(signature.encoding);
    }
    _declaredEncoding = encodingInDeclaration(bytes);
    if (_declaredEncoding.isEmpty() || isUTF8Name(_declaredEncoding)) {
        _text = bytes;
        return false;
    }
    convert(bytes, _declaredEncoding);
    // An encoding that stores ASCII in another way cannot be what the declaration was read in.
    if (!_text.starts_with(declarationStart))
        throw ParseFailure(parseErrors::otherEncoding, {_declaredEncoding}, 0);
    return true;
}

void XMLInput::convert(std::string_view bytes, const String& encoding) {
    const DecodeResult result = decode(bytes, encoding, _own);
    _text = _own;
    if (result == DecodeResult::unknownEncoding)
        throw ParseFailure(parseErrors::unknownEncoding, {encoding}, 0);
    if (result == DecodeResult::malformed)
        throw ParseFailure(parseErrors::malformedCharacter, {encoding}, _text.size());
}

void XMLInput::checkStart() const {
    if (_text.empty())
        throw ParseFailure(parseErrors::empty, {}, 0);
    if (_text.size() > xmlLimits::documentSize)
        throw ParseFailure(parseErrors::documentTooLarge, {}, 0);
    if (_text.front() != '<' && !isWhite(_text.front()))
        throw ParseFailure(parseErrors::noStartTag, {}, 0);
    // The parser takes a zero byte for the end of the document.
    const std::size_t zero = _text.find('\0');
    if (zero != std::string_view::npos)
        throw ParseFailure(parseErrors::zeroByte, {}, zero);
}

} // namespace qx
