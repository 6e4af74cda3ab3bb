#pragma once

// What an operation takes and gives back, as far as forwarding needs to know it.

#include <QXXMLMarshalling/model/Object.h>

namespace qx {

class QX_API MethodSignature final : public Object {
public:
    // `argumentCount` does not count receiver and selector.
    MethodSignature(std::size_t argumentCount, bool returnsValue) noexcept
        : _argumentCount(argumentCount), _returnsValue(returnsValue) {}
    ~MethodSignature() override;

    // The receiver and the selector are the first two.
    std::size_t numberOfArguments() const noexcept { return _argumentCount + 2; }
    // In bytes; 0 for an operation that gives nothing back.
    std::size_t methodReturnLength() const noexcept;

private:
    std::size_t _argumentCount;
    bool _returnsValue;
};

} // namespace qx
