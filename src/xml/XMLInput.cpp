#include "xml/XMLInput.h"

#include "base/BulkArray.h"
#include "xml/AttributeCounts.h"
#include "xml/Encoding.h"
#include "xml/ParseFailure.h"
#include "xml/XMLCharacters.h"
#include "xml/XMLLimits.h"

namespace qx {

void XMLInput::read(std::string_view bytes, bool copies) {
    const bool isConverted = decodeBytes(bytes);
    checkStart();
    if (!isConverted && copies) {
        _own.reserve(_text.size());
        askForLargePages(_own.data(), _text.size());
        _text = _own = _text;
    }
    checkTags();
}

void XMLInput::take(std::string text) {
    _text = _own = std::move(text);
    checkStart();
    checkTags();
}

void XMLInput::checkTags() const {
    const std::size_t tag = findTagBeyond(_text, xmlLimits::attributes);
    if (tag != std::string_view::npos)
        throw ParseFailure(parseErrors::tooManyAttributes, {xmlLimits::attributes}, tag);
}

bool XMLInput::decodeBytes(std::string_view bytes) {
    const DocumentEncoding encoding = encodingOf(bytes);
    bytes.remove_prefix(encoding.markSize);
    if (encoding.name.isNull())
        _text = bytes;
    else
        convert(bytes, encoding.name);
    if (encoding.isContradictedBy(_text))
        throw ParseFailure(parseErrors::otherEncoding, {encoding.name}, 0);
    _declaredEncoding = encoding.name.isNull() ? encoding.declared : encodingInDeclaration(_text);
    return !encoding.name.isNull();
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
