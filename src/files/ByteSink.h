#pragma once

// Where bytes go, one after another. Errors are those that files/Files.h lists. Used by one thread
// at a time.

#include <QXXMLMarshalling/model/Error.h>

#include "files/Files.h"

#include <string_view>

namespace qx {

class ByteSink {
public:
    virtual ~ByteSink() = default;

    // All are false with an error. Nothing is called after that.
    virtual bool open(Ref<Error>* error) = 0;
    virtual bool write(std::string_view bytes, Ref<Error>* error) = 0;
    // All bytes have come.
    virtual bool commit(Ref<Error>* error) = 0;
};

class StreamSink final : public ByteSink {
public:
    // The stream must outlive the sink.
    explicit StreamSink(std::ostream& stream) noexcept : _stream(stream) {}

    bool open(Ref<Error>*) override { return true; }
    bool write(std::string_view bytes, Ref<Error>* error) override {
        return writeToStream(_stream, bytes, error);
    }
    bool commit(Ref<Error>*) override { return true; }

private:
    std::ostream& _stream;
};

} // namespace qx
