// What a record does beyond holding values: calling its own operations when other objects change,
// and answering accessor messages for its keys.

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/host/UserDefaults.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Invocation.h>
#include <QXXMLMarshalling/observe/Observation.h>

using qx::Dictionary;
using qx::Object;
using qx::Ref;
using qx::Selector;
using qx::String;
using qx::Value;

namespace {

// Calls visit(Object&) for each object of an array, or among a dictionary's values.
template <class Visit>
void forEachObject(const Object& collection, Visit visit) {
    const auto visitIfObject = [&](const Value& value) {
        if (Object* object = value.object())
            visit(*object);
    };
    if (const auto* array = dynamic_cast<const qx::Array*>(&collection))
        for (const Value& item : *array)
            visitIfObject(item);
    else if (const auto* dictionary = dynamic_cast<const Dictionary*>(&collection))
        for (const auto& entry : *dictionary)
            visitIfObject(entry.value);
}

// "setTitle:" writes the key "title", and so does "title:".
String keyWrittenBy(std::string_view message) {
    constexpr std::string_view prefix = "set";
    String key = message;
    if (message.starts_with(prefix)) {
        if (message.size() <= prefix.size())
            return {};
        message.remove_prefix(prefix.size());
        // The first character whole, however many bytes it has.
        std::size_t length = 1;
        while (length < message.size() &&
               (static_cast<unsigned char>(message[length]) & 0xC0) == 0x80)
            ++length;
        key = String::concat(
            {String(message.substr(0, length)).lowercased(), message.substr(length)});
    }
    const std::string_view text = key;
    return text.ends_with(':') ? String(text.substr(0, text.size() - 1)) : key;
}

} // namespace

void QXGenericRecord::observeObject(Object& object, const String& keyPath, Selector selector) {
    object.addObserver(this, keyPath, qx::Observing::newValue | qx::Observing::oldValue, selector);
}

void QXGenericRecord::observeObjects(const Object& collection, const String& keyPath,
                                     Selector selector) {
    forEachObject(collection, [&](Object& object) { observeObject(object, keyPath, selector); });
}

void QXGenericRecord::removeObservation(Object& object, const String& keyPath) {
    object.removeObserver(this, keyPath);
}

void QXGenericRecord::removeObservations(const Object& collection, const String& keyPath) {
    forEachObject(collection, [&](Object& object) { removeObservation(object, keyPath); });
}

// The operation to call travels as the observation's context.
void QXGenericRecord::observeValueForKeyPath(const String&, Object*, const Dictionary& change,
                                             Selector context) {
    perform(context, &change);
}

Ref<qx::MethodSignature> QXGenericRecord::methodSignatureForSelector(Selector selector) const {
    if (auto signature = Object::methodSignatureForSelector(selector))
        return signature;
    if (!qx::UserDefaults::standardUserDefaults()->boolForKey(
            AllowMethodForwardingInGenericRecords))
        return nullptr;
    switch (selector.argumentCount()) {
    case 0:
        return qx::make<qx::MethodSignature>(0U, true);
    case 1:
        return qx::make<qx::MethodSignature>(1U, false);
    default:
        return nullptr;
    }
}

void QXGenericRecord::forwardInvocation(qx::Invocation& invocation) {
    constexpr std::size_t getterArguments = 2; // the receiver and the message
    const qx::MethodSignature& signature = invocation.methodSignature();
    const std::string_view message = invocation.selector().name();
    const std::size_t count = signature.numberOfArguments();
    const bool returnsValue = signature.methodReturnLength() != 0;
    if (returnsValue && count == getterArguments) {
        invocation.setReturnValue(valueForKeyPath(message));
        return;
    }
    const bool isSetter = !returnsValue && count == getterArguments + 1;
    const String key = isSetter ? keyWrittenBy(message) : String();
    if (key.isNull())
        Object::forwardInvocation(invocation);
    else
        setValueForKey(invocation.argument(getterArguments), key);
}
