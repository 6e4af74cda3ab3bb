#pragma once

// A call as an object: what an object is handed for an operation that its class does not describe
// (Object::forwardInvocation). Whoever takes the call reads the arguments, sets the return value or
// invokes the operation on another target.

#include <QXXMLMarshalling/model/MethodSignature.h>
#include <QXXMLMarshalling/model/Value.h>

#include <span>
#include <vector>

namespace qx {

class QX_API Invocation final : public Object {
public:
    // Raises NSInvalidArgumentException without a signature, or when it takes another number of
    // arguments than given. The target may be null.
    Invocation(Ref<MethodSignature> signature, Object* target, Selector selector,
               std::span<const Value> arguments);
    ~Invocation() override;

    const MethodSignature& methodSignature() const noexcept { return *_signature; }
    Object* target() const noexcept { return _target.get(); }
    void setTarget(Object* target) { _target = Ref<Object>(target); }
    Selector selector() const noexcept { return _selector; }

    // Index 0 is the target, 1 the name of the operation, the operation's own arguments begin at 2.
    // Any other index raises NSRangeException; only the operation's own can be set.
    Value argument(std::size_t index) const;
    void setArgument(const Value& value, std::size_t index);

    // Null until it is set.
    const Value& returnValue() const noexcept { return _returnValue; }
    void setReturnValue(const Value& value) { _returnValue = value; }

    // Performs the operation on the target and keeps what it returns; without a target nothing
    // happens and the return value is null.
    void invoke();
    void invokeWithTarget(Object* target);

private:
    Value& ownArgument(std::size_t index);

    Ref<MethodSignature> _signature;
    Ref<Object> _target;
    Selector _selector;
    std::vector<Value> _arguments;
    Value _returnValue;
};

} // namespace qx
