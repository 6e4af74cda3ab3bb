#pragma once

// A document's text as UTF-8, bit by bit, from bytes in whatever encoding it is stored in.

#include "files/ByteSource.h"
#include "xml/Encoding.h"

#include <memory>

namespace qx {

class XMLTextSource {
public:
    // The bytes must outlive it.
    explicit XMLTextSource(ByteSource& bytes) : _bytes(bytes) {}

    // Appends more text, made from a block of bytes or what is there of it. False with an error of
    // the bytes. Throws ParseFailure, at the end of the text, for what cannot be decoded.
    bool read(std::string& text, Ref<Error>* error);
    bool isAtEnd() const noexcept { return _isAtEnd; }
    // Whether the last block was not full: more may be long in coming.
    bool isWaiting() const noexcept { return _isWaiting; }
    std::uint64_t bytesRead() const noexcept { return _bytesRead; }

private:
    bool readBytes(std::string& to, Ref<Error>* error);
    bool readStart(Ref<Error>* error);
    void decode(std::string& text);

    static constexpr std::size_t blockSize = 256 * 1024;

    ByteSource& _bytes;
    const std::unique_ptr<char[]> _block = std::make_unique_for_overwrite<char[]>(blockSize);
    std::string _raw; // what is not decoded yet
    std::optional<DocumentEncoding> _encoding;
    std::optional<TextDecoder> _decoder;
    std::uint64_t _bytesRead = 0;
    bool _isAtEnd = false;
    bool _isWaiting = false;
};

} // namespace qx
