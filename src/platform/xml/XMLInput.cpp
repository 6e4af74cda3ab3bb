#include "platform/xml/XMLInput.h"

#include "platform/xml/Encoding.h"
#include "platform/xml/ParseFailure.h"
#include "platform/xml/XMLCharacters.h"

#include <algorithm>
#include <climits>

namespace qx {

namespace {

// The parser compares each attribute of a start tag with all others. Tags shorter than this cannot
// hold enough of them to matter, and are not looked at.
constexpr std::size_t longStartTag = 16 * 1024;
constexpr std::size_t maximumAttributes = 4096;

constexpr std::string_view declarationStart = "<?xml";

void skipWhite(std::string_view& text) {
    text.remove_prefix(std::min(text.find_first_not_of(" \t\r\n"), text.size()));
}

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
    text.remove_prefix(at + name.size());
    skipWhite(text);
    if (!text.starts_with('='))
        return nullptr;
    text.remove_prefix(1);
    skipWhite(text);
    if (!text.starts_with('"') && !text.starts_with('\''))
        return nullptr;
    const std::size_t end = text.find(text.front(), 1);
    if (end == std::string_view::npos)
        return nullptr;
    return text.substr(1, end - 1);
}

// Attributes in a tag, or in what a declaration might turn into one. Text has no quotes to heed.
std::size_t countAttributes(std::string_view tag) {
    if (tag.starts_with("<!--") || tag.starts_with("<![CDATA[") || tag.starts_with("<?") ||
        tag.starts_with("</"))
        return 0;
    const bool isDeclaration = tag.starts_with("<!");
    std::size_t count = 0;
    char quote = '\0';
    for (const char c : tag) {
        if (c == '=' && (quote == '\0' || isDeclaration))
            ++count;
        else if (quote != '\0')
            quote = c == quote ? '\0' : quote;
        else if (c == '"' || c == '\'')
            quote = c;
        else if (c == '>')
            break;
    }
    return count;
}

} // namespace

void XMLInput::read(XMLBytes bytes) {
    const bool isConverted = decodeBytes(bytes.view());
    checkStart();
    if (!isConverted && !bytes.isTerminated())
        _text = _converted = _text;
    checkStartTags();
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
    const DecodeResult result = decode(bytes, encoding, _converted);
    _text = _converted;
    if (result == DecodeResult::unknownEncoding)
        throw ParseFailure(parseErrors::unknownEncoding, {encoding}, 0);
    if (result == DecodeResult::malformed)
        throw ParseFailure(parseErrors::malformedCharacter, {encoding}, _text.size());
}

void XMLInput::checkStart() const {
    if (_text.empty())
        throw ParseFailure(parseErrors::empty, {}, 0);
    if (_text.size() > INT_MAX - 1)
        throw ParseFailure(parseErrors::documentTooLarge, {}, 0);
    if (_text.front() != '<' && !isWhite(_text.front()))
        throw ParseFailure(parseErrors::noStartTag, {}, 0);
    // The parser takes a zero byte for the end of the document.
    const std::size_t zero = _text.find('\0');
    if (zero != std::string_view::npos)
        throw ParseFailure(parseErrors::zeroByte, {}, zero);
}

// Only tags can have no "<" inside for long and matter here; so it is enough to look for the last
// "<" of each stretch of text, and to walk through stretches that have none.
void XMLInput::checkStartTags() const {
    std::size_t tag = 0;   // the last "<" found
    std::size_t known = 1; // there is none between it and here
    while (_text.size() - tag >= longStartTag) {
        const std::size_t last = _text.substr(known, tag + longStartTag - known).rfind('<');
        if (last != std::string_view::npos) {
            const std::size_t found = known + last;
            known = tag + longStartTag;
            tag = found;
            continue;
        }
        const std::size_t next = std::min(_text.find('<', tag + longStartTag), _text.size());
        if (countAttributes(_text.substr(tag, next - tag)) > maximumAttributes)
            throw ParseFailure(parseErrors::tooManyAttributes, {maximumAttributes}, tag);
        tag = next;
        known = next + 1;
    }
}

} // namespace qx
