#include <QXXMLMarshalling/model/Object.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Format.h>
#include <QXXMLMarshalling/model/Invocation.h>

namespace qx {

namespace {

String addressOf(const Object& object) {
    const Value address(reinterpret_cast<std::uintptr_t>(&object));
    return format("0x%012lx", {&address, 1});
}

bool isEqualTo(const Object& object, const Value& other) {
    return other.object() != nullptr && object.isEqual(*other.object());
}

void setValueForKeyOf(Object& object, const Value& value, const String& key) {
    object.setValueForKey(value, key);
}

Value valueForKeyPathOf(const Object& object, const String& path) {
    return object.valueForKeyPath(path);
}

} // namespace

// What every object answers, so that one which forwards operations does not take these for others.
const Class& Object::describedClass() const {
    using detail::instanceOperation;
    static const Class* const described = &detail::publish(
        {.name = "qx::Object",
         .type = &typeid(Object),
         .superclass = nullptr,
         .operations =
             {instanceOperation<Object, &Object::description>("description"),
              instanceOperation<Object, &isEqualTo>("isEqual:"),
              instanceOperation<Object, &Object::classNameForMarshalling>(
                  "classNameForMarshalling"),
              instanceOperation<Object, &Object::valueForKey>("valueForKey:"),
              instanceOperation<Object, &setValueForKeyOf>("setValue:forKey:"),
              instanceOperation<Object, &Object::valueForUndefinedKey>("valueForUndefinedKey:"),
              instanceOperation<Object, &valueForKeyPathOf>("valueForKeyPath:"),
              instanceOperation<Object, &Object::willChangeValueForKey>("willChangeValueForKey:"),
              instanceOperation<Object, &Object::didChangeValueForKey>("didChangeValueForKey:")}},
        false);
    return *described;
}

const Class& Object::findClass() const {
    const Class& found = Class::ofObject(*this);
    _isa.store(&found, std::memory_order_release);
    return found;
}

String Object::description() const {
    return String::concat({"<", isa().name(), ": ", addressOf(*this), ">"});
}

String Object::descriptionWithLocale(const Object*, std::size_t) const { return description(); }

bool Object::isEqual(const Object& other) const { return this == &other; }

String Object::classNameForMarshalling() const { return isa().name(); }

bool Object::respondsTo(Selector selector) const { return isa().operation(selector) != nullptr; }

namespace {

[[noreturn]] void raiseUnanswered(const Class& type, Selector selector) {
    throw Exception(Exception::invalidArgument,
                    String::concat({"class ", type.name(), " does not answer the operation ",
                                    selector.name()}));
}

} // namespace

Value Object::performWithArguments(Selector selector, std::span<const Value> arguments) {
    const Class& type = isa();
    if (const Operation* operation = type.operation(selector))
        return operation->invoke(selector, type, this, arguments);
    Ref<MethodSignature> signature = methodSignatureForSelector(selector);
    if (!signature)
        raiseUnanswered(type, selector);
    // Counted, since whoever takes the call may keep it for later.
    const auto invocation = make<Invocation>(std::move(signature), this, selector, arguments);
    forwardInvocation(*invocation);
    const bool returnsValue = invocation->methodSignature().methodReturnLength() != 0;
    return returnsValue ? invocation->returnValue() : Value();
}

Ref<MethodSignature> Object::methodSignatureForSelector(Selector selector) const {
    const Operation* operation = isa().operation(selector);
    if (operation == nullptr)
        return nullptr;
    return make<MethodSignature>(selector.argumentCount(), operation->returnsValue);
}

void Object::forwardInvocation(Invocation& invocation) {
    raiseUnanswered(isa(), invocation.selector());
}

} // namespace qx
