#include "xml/XMLTextSource.h"

#include "xml/ParseFailure.h"

namespace qx {

bool XMLTextSource::readBytes(std::string& to, Ref<Error>* error) {
    const auto count = _bytes.read(_block.get(), blockSize, error);
    if (!count)
        return false;
    to.append(_block.get(), *count);
    _isAtEnd = *count == 0;
    _isWaiting = *count < blockSize;
    _bytesRead += *count;
    return true;
}

// The bytes in which the encoding shows.
bool XMLTextSource::readStart(Ref<Error>* error) {
    constexpr std::size_t longestDeclaration = 4096;
    while (!_isAtEnd && _raw.size() < longestDeclaration &&
           (_raw.size() < 5 || (_raw.starts_with("<?xml") && _raw.find("?>") == std::string::npos)))
        if (!readBytes(_raw, error))
            return false;
    _encoding = encodingOf(_raw);
    _raw.erase(0, _encoding->markSize);
    if (_encoding->name.isNull())
        return true;
    _decoder.emplace(_encoding->name);
    if (!_decoder->isKnown())
        throw ParseFailure(parseErrors::unknownEncoding, {_encoding->name}, 0);
    return true;
}

bool XMLTextSource::read(std::string& text, Ref<Error>* error) {
    const bool isStart = !_encoding;
    if (!(isStart ? readStart(error) : readBytes(_decoder ? _raw : text, error)))
        return false;
    if (_decoder)
        decode(text);
    else
        text += _raw;
    _raw.clear();
    if (isStart && _encoding->isContradictedBy(text))
        throw ParseFailure(parseErrors::otherEncoding, {_encoding->name}, 0);
    return true;
}

void XMLTextSource::decode(std::string& text) {
    if (!_decoder->decode(_raw, text) || (_isAtEnd && !_decoder->finish(text)))
        throw ParseFailure(parseErrors::malformedCharacter, {_encoding->name}, text.size());
}

} // namespace qx
