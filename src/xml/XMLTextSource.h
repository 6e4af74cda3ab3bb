#pragma once

// A document's text as UTF-8, bit by bit, from bytes in whatever encoding it is stored in.

#include "files/ByteSource.h"
#include "xml/Encoding.h"

namespace qx {

class XMLTextSource {
public:
    // The bytes must outlive it.
    explicit XMLTextSource(ByteSource& bytes) noexcept : _bytes(bytes) {}

    // Appends more text, made from up to that many bytes; less at the end. False with an error of
    // the bytes. Throws ParseFailure, at the end of the text, for what cannot be decoded.
    bool read(std::size_t most, std::string& text, Ref<Error>* error);
    bool isAtEnd() const noexcept { return _isAtEnd; }
    // Whether the last bytes came before as many as were asked for: more may be long in coming.
    bool isWaiting() const noexcept { return _isWaiting; }
    std::uint64_t bytesRead() const noexcept { return _bytesRead; }

private:
    bool readBytes(std::size_t most, std::string& to, Ref<Error>* error);
    bool readStart(Ref<Error>* error);
    void decode(std::string& text);

    ByteSource& _bytes;
    std::string _raw; // what is not decoded yet
    std::optional<DocumentEncoding> _encoding;
    std::optional<TextDecoder> _decoder;
    std::uint64_t _bytesRead = 0;
    bool _isAtEnd = false;
    bool _isWaiting = false;
};

} // namespace qx
