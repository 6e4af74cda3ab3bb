#pragma once

// A text that is put together piece by piece, and becomes a String without being copied.

#include <QXXMLMarshalling/base/String.h>

#include "base/ShortCopy.h"

namespace qx {

class TextBuffer {
public:
    TextBuffer() noexcept = default;
    TextBuffer(const TextBuffer&) = delete;
    TextBuffer& operator=(const TextBuffer&) = delete;
    ~TextBuffer();

    std::size_t size() const noexcept { return _size; }
    std::string_view view() const noexcept {
        return _rep != nullptr ? std::string_view(String::text(_rep), _size) : "";
    }

    TextBuffer& operator+=(std::string_view text) {
        copyShort(text.data(), text.size(), extend(text.size()));
        return *this;
    }
    TextBuffer& operator+=(char c) {
        *extend(1) = c;
        return *this;
    }
    void append(std::size_t count, char c) {
        if (count != 0)
            std::memset(extend(count), c, count);
    }

    // Makes the text longer by so many bytes, which the caller fills in.
    char* extend(std::size_t count) {
        if (_capacity - _size < count)
            grow(count);
        char* const place = reinterpret_cast<char*>(_rep + 1) + _size;
        _size += count;
        return place;
    }

    // Makes room for so many bytes in all.
    void reserve(std::size_t capacity) {
        if (capacity > _capacity)
            grow(capacity - _size);
    }

    // Writes at the end of the buffer, which is made room in once: for that many bytes, and for
    // what is written in whole blocks and overwritten by what follows. The text has it once it is
    // kept.
    class Piece {
    public:
        static constexpr std::size_t blockSize = 16;

        Piece(TextBuffer& buffer, std::size_t most) : _buffer(buffer) {
            if (buffer._capacity - buffer._size < most + blockSize)
                buffer.grow(most + blockSize);
            _at = reinterpret_cast<char*>(buffer._rep + 1) + buffer._size;
        }
        Piece(const Piece&) = delete;
        Piece& operator=(const Piece&) = delete;

        Piece& operator+=(char c) noexcept {
            *_at++ = c;
            return *this;
        }
        Piece& operator+=(std::string_view text) noexcept {
            copyShort(text.data(), text.size(), _at);
            _at += text.size();
            return *this;
        }
        void addBlanks(std::size_t count) noexcept {
            for (std::size_t i = 0; i < count; i += blockSize)
                std::memset(_at + i, ' ', blockSize);
            _at += count;
        }
        // Where the next bytes stand, and that so many were put there.
        char* end() const noexcept { return _at; }
        void advance(std::size_t count) noexcept { _at += count; }

        void keep() noexcept {
            _buffer._size =
                static_cast<std::size_t>(_at - reinterpret_cast<char*>(_buffer._rep + 1));
        }

    private:
        TextBuffer& _buffer;
        char* _at;
    };

    // The text; the buffer is empty afterwards.
    String take();

private:
    void grow(std::size_t count);
    String::Rep* _rep = nullptr;
    std::size_t _size = 0;
    std::size_t _capacity = 0; // of text, without the zero byte at its end
};

} // namespace qx
