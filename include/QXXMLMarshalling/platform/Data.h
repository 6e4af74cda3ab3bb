#pragma once

// Immutable bytes. They stand in memory of the object's own, or in a file mapped for reading, which
// is unmapped when the object goes away.

#include <QXXMLMarshalling/platform/Object.h>

#include <string>

namespace qx {

class QX_API Data final : public Object {
public:
    Data() = default;
    explicit Data(std::string bytes) noexcept;
    explicit Data(std::string_view bytes) : Data(std::string(bytes)) {}
    // Bytes that another owner holds; `giveBack` is called once with them at the end.
    Data(const char* bytes, std::size_t size, void (*giveBack)(const char*, std::size_t)) noexcept;
    ~Data() override;

    const char* bytes() const noexcept { return _bytes; }
    std::size_t size() const noexcept { return _size; }
    std::string_view view() const noexcept { return {_bytes, _size}; }
    // Whether a zero byte follows them, which is so for bytes of the object's own.
    bool isTerminated() const noexcept { return _bytes == _own.data(); }

    // "<Data: N bytes>".
    String description() const override;
    // Same bytes.
    bool isEqual(const Object& other) const override;

protected:
    const Class& describedClass() const override;

private:
    std::string _own;
    const char* _bytes = _own.data();
    std::size_t _size = 0;
    void (*_giveBack)(const char*, std::size_t) = nullptr;
};

} // namespace qx
