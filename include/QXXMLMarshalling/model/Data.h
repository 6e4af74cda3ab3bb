#pragma once

// Immutable bytes, in memory of the object's own.

#include <QXXMLMarshalling/model/Object.h>

#include <string>

namespace qx {

class QX_API Data final : public Object {
public:
    Data() = default;
    explicit Data(std::string bytes) noexcept;
    explicit Data(std::string_view bytes) : Data(std::string(bytes)) {}
    ~Data() override;

    // A zero byte follows them.
    const char* bytes() const noexcept { return _bytes.c_str(); }
    std::size_t size() const noexcept { return _bytes.size(); }
    std::string_view view() const noexcept { return _bytes; }

    // "<Data: N bytes>".
    String description() const override;
    // Same bytes.
    bool isEqual(const Object& other) const override;

protected:
    const Class& describedClass() const override;

private:
    std::string _bytes;
};

} // namespace qx
