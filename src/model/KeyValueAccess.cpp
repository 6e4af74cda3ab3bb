// Values of an object by key, and along paths of keys.

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/ChangeScope.h>
#include <QXXMLMarshalling/model/Class.h>

#include "model/ObjectExtras.h"

namespace qx {

Value Object::valueForKey(Key key) const {
    const Property* property = isa().property(key);
    return property != nullptr ? property->get(*property, *this) : valueForUndefinedKey(key);
}

void Object::setValueForKey(const Value& value, Key key) {
    switch (trySetValueForKey(value, key)) {
    case SetOutcome::set:
        return;
    case SetOutcome::refused:
        throw Exception(Exception::invalidArgument,
                        String::concat({"class ", isa().name(), " does not take the value ",
                                        value.description(), " for its key ", key.view()}));
    case SetOutcome::unknownKey:
        Object::setValueForUndefinedKey(value, key);
    }
}

namespace {

// As in a ChangeScope, which costs more where nothing is thrown: it asks for exceptions on the way.
bool setAndTell(Object& object, const Property& property, const Value& value) {
    object.willChangeValueForKey(property.key);
    bool isSet = false;
    try {
        isSet = property.set(property, object, value);
    } catch (...) {
        ObjectInternals::tellEndOfFailedChange(property.key,
                                               [&] { object.didChangeValueForKey(property.key); });
        throw;
    }
    object.didChangeValueForKey(property.key);
    return isSet;
}

} // namespace

SetOutcome Object::trySetValueForKey(const Value& value, Key key) {
    // Whoever is told before the change may let the last reference go.
    const Ref<Object> kept(hasObserversOrWeakRefs() ? this : nullptr);
    const Class& type = isa();
    const Property* property = type.property(key);
    if (property == nullptr) {
        try {
            setValueForUndefinedKey(value, key);
        } catch (const UndefinedKeyException& exception) {
            if (!exception.concerns(this, key))
                throw;
            return SetOutcome::unknownKey;
        }
        return SetOutcome::set;
    }
    if (property->set == nullptr)
        return SetOutcome::refused;
    if (!type.automaticallyNotifiesObserversForKey(key))
        return property->set(*property, *this, value) ? SetOutcome::set : SetOutcome::refused;
    return setAndTell(*this, *property, value) ? SetOutcome::set : SetOutcome::refused;
}

Value Object::valueForUndefinedKey(Key key) const {
    throw UndefinedKeyException(
        this, key,
        String::concat({"class ", isa().name(), " has no key ", key.view(), " to read"}));
}

void Object::setValueForUndefinedKey(const Value& value, Key key) {
    throw UndefinedKeyException(this, key,
                                String::concat({"class ", isa().name(), " has no key ", key.view(),
                                                " to set to ", value.description()}));
}

namespace {

// A text or a number is no object whose keys a path could follow.
[[noreturn]] void raiseNoObject(const Value& value, Key rest, const char* purpose) {
    throw UndefinedKeyException(nullptr, rest,
                                String::concat({"class ", value.classNameForMarshalling(),
                                                " has no key ", rest.view(), purpose}));
}

} // namespace

Value Object::valueForKeyPath(std::string_view path) const {
    std::size_t dot = path.find('.');
    Value value = valueForKey(path.substr(0, dot));
    while (dot != std::string_view::npos) {
        if (value.isNullOrMarker())
            return {};
        path.remove_prefix(dot + 1);
        if (value.object() == nullptr)
            raiseNoObject(value, path, " to read");
        dot = path.find('.');
        value = value.object()->valueForKey(path.substr(0, dot));
    }
    return value;
}

void Object::setValueForKeyPath(const Value& value, std::string_view path) {
    const std::size_t dot = path.rfind('.');
    if (dot == std::string_view::npos)
        return setValueForKey(value, path);
    const Value holder = valueForKeyPath(path.substr(0, dot));
    if (holder.isNullOrMarker())
        return;
    if (holder.object() == nullptr)
        raiseNoObject(holder, path.substr(dot + 1), " to set");
    holder.object()->setValueForKey(value, path.substr(dot + 1));
}

} // namespace qx
