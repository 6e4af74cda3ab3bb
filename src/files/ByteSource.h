#pragma once

// Bytes that come one after another, from a file or a stream. Errors are those that files/Files.h
// lists. Used by one thread at a time.

#include <QXXMLMarshalling/model/Error.h>

#include "files/Descriptor.h"

#include <cerrno>
#include <iosfwd>
#include <optional>

namespace qx {

class ByteSource {
public:
    ByteSource() = default;
    ByteSource(const ByteSource&) = delete;
    ByteSource& operator=(const ByteSource&) = delete;
    virtual ~ByteSource() = default;

    // Puts up to `room` bytes there and waits for one at least: a pipe gives what it has. 0 at the
    // end; nothing with an error.
    virtual std::optional<std::size_t> read(char* to, std::size_t room, Ref<Error>* error) = 0;
    // How many bytes there are in all; 0 where that is not known.
    virtual std::uint64_t size() const noexcept { return 0; }
    // The path of a file; null of anything else.
    virtual String name() const { return {}; }
};

class FileSource final : public ByteSource {
public:
    explicit FileSource(String path) : _path(std::move(path)), _file(opened(_path)) {}

    std::optional<std::size_t> read(char* to, std::size_t room, Ref<Error>* error) override;
    std::uint64_t size() const noexcept override;
    String name() const override { return _path; }

private:
    // Negative, with errno set, where it cannot be opened.
    static int opened(const String& path);

    const String _path;
    const Descriptor _file;
    const int _openingFailed = _file.isOpen() ? 0 : errno;
};

class StreamSource final : public ByteSource {
public:
    // The stream must outlive the source.
    explicit StreamSource(std::istream& stream) noexcept : _stream(stream) {}

    std::optional<std::size_t> read(char* to, std::size_t room, Ref<Error>* error) override;

private:
    std::istream& _stream;
};

} // namespace qx
