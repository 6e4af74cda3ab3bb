#include <QXXMLMarshalling/model/Invocation.h>

#include <QXXMLMarshalling/base/Exception.h>

namespace qx {

MethodSignature::~MethodSignature() = default;

std::size_t MethodSignature::methodReturnLength() const noexcept {
    return _returnsValue ? sizeof(Value) : 0;
}

Invocation::Invocation(Ref<MethodSignature> signature, Object* target, Selector selector,
                       std::span<const Value> arguments)
    : _signature(std::move(signature)), _target(target), _selector(selector),
      _arguments(arguments.begin(), arguments.end()) {
    if (!_signature)
        throw Exception(
            Exception::invalidArgument,
            String::concat({"an invocation of ", selector.name(), " has no signature"}));
    if (_arguments.size() + 2 != _signature->numberOfArguments())
        throw Exception(Exception::invalidArgument,
                        String::concat({"the operation ", selector.name(), " takes ",
                                        std::to_string(_signature->numberOfArguments() - 2),
                                        " arguments, not ", std::to_string(_arguments.size())}));
}

Invocation::~Invocation() = default;

Value& Invocation::ownArgument(std::size_t index) {
    if (index < 2 || index - 2 >= _arguments.size())
        throw Exception(Exception::range,
                        String::concat({"an invocation of ", _selector.name(),
                                        " has no argument at index ", std::to_string(index)}));
    return _arguments[index - 2];
}

Value Invocation::argument(std::size_t index) const {
    if (index == 0)
        return _target;
    if (index == 1)
        return _selector.string();
    return const_cast<Invocation*>(this)->ownArgument(index);
}

void Invocation::setArgument(const Value& value, std::size_t index) { ownArgument(index) = value; }

void Invocation::invoke() {
    const Ref<Object> target = _target;
    _returnValue = target ? target->performWithArguments(_selector, _arguments) : Value();
}

void Invocation::invokeWithTarget(Object* target) {
    setTarget(target);
    invoke();
}

} // namespace qx
