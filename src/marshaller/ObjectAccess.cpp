#include "marshaller/ObjectAccess.h"

#include <QXXMLMarshalling/base/Exception.h>

#include "base/Immortal.h"
#include "host/Log.h"
#include "model/Errors.h"

#include <algorithm>
#include <mutex>
#include <set>
#include <span>
#include <utility>

namespace qx::detail {

ObjectHooks::ObjectHooks(const Class& describedType)
    : type(&describedType),
      setClassNameForMarshalling(describedType.operation("setClassNameForMarshalling:")),
      setNotifyBindingsObservers(describedType.operation("setNotifyBindingsObservers:")),
      setUndoManager(describedType.operation("setUndoManager:")),
      rootObject(describedType.operation("rootObject")),
      setParent(describedType.operation("setParent:")),
      isRemovable(describedType.operation("isRemovable")) {}

Value ObjectAccess::send(Object& object, const Operation& operation) {
    return operation.invoke(operation.selector, object.isa(), &object, {});
}

Value ObjectAccess::send(Object& object, const Operation& operation, const Value& argument) {
    return operation.invoke(operation.selector, object.isa(), &object, {&argument, 1});
}

const Class* const ObjectAccess::records = &QXGenericRecord::classObject();

ObjectAccess::Held ObjectAccess::get(const Object& object, Key key) {
    const Class& type = object.isa();
    if (&type == records)
        return getContent(static_cast<const QXGenericRecord&>(object), key);
    const Property* property = type.property(key);
    if (property == nullptr)
        return {object.valueForKey(key), false};
    if (property->lend != nullptr)
        return {property->lend(*property, object), property->keepsZero};
    // A class of a host's may answer for a property in its own way.
    return {type.isStruct() ? property->get(*property, object) : object.valueForKey(key),
            property->keepsZero};
}

// Of a wrong class is an object, or the first such item of a list: that one is told, and the
// classes that the property takes.
bool ObjectAccess::refuse(const Object& object, Key key, const Value& value, Ref<Error>* error) {
    const Class& type = object.isa();
    const Property* const property = type.property(key);
    const TakenObjects* const taken = property != nullptr ? property->objects : nullptr;
    const Value wrong = taken != nullptr ? taken->firstRefused(value) : Value();
    return wrong.isNull() ? fail(error, errors::unableToSetValue, value, key.string(), type.name())
                          : fail(error, errors::objectOfWrongClass, wrong, key.string(),
                                 type.name(), taken->names);
}

ObjectAccess::Held ObjectAccess::getContent(const QXGenericRecord& record, Key key) {
    if (key.namesProperty())
        return {record.valueForKey(key), false};
    const Dictionary* const contents = record.contents().get();
    const Value* const value = contents != nullptr ? contents->find(key.string()) : nullptr;
    if (value == nullptr)
        return {Value(), false};
    return value->isObject() ? Held(*value, false) : Held(*value);
}

bool ObjectAccess::setOrRefuse(Object& object, Key key, const Value& value, Ref<Error>* error) {
    return setProperty(object, key, value) == SetOutcome::set || refuse(object, key, value, error);
}

// Nobody observes a struct.
SetOutcome ObjectAccess::setProperty(Object& object, Key key, const Value& value) {
    const Class& type = object.isa();
    if (!type.isStruct())
        return object.trySetValueForKey(value, key);
    const Property* property = type.property(key);
    if (property == nullptr)
        return SetOutcome::unknownKey;
    return property->set != nullptr && property->set(*property, object, value)
               ? SetOutcome::set
               : SetOutcome::refused;
}

namespace {

std::span<const String, 3> keptKeys() {
    static const String keys[] = {Key("unboundChildren"), Key("unboundAttributes"),
                                  Key("__namespaces")};
    return keys;
}

} // namespace

Key ObjectAccess::keyOf(KeptXML what) {
    static const Key keys[] = {keptKeys()[0], keptKeys()[1], keptKeys()[2]};
    return keys[static_cast<std::size_t>(what)];
}

namespace {

// Whether it is the first time in the process that this is said of the class.
bool isFirst(const Class& type, const char* message) {
    struct Said {
        std::mutex mutex;
        std::set<std::pair<const Class*, const char*>> all;
    };
    auto& said = immortal<Said>();
    const std::lock_guard lock(said.mutex);
    return said.all.emplace(&type, message).second;
}

void warnOnce(const Class& type, const char* message) {
    if (isFirst(type, message))
        logWarningOrLine(message, type.name());
}

constexpr const char* unknownXMLIsDropped =
    "Objects of class %@ keep no unknown XML: what their elements held of it is dropped";
constexpr const char* itemsAreLeftOut =
    "Items of class %@ are not written: the class does not answer isRemovable";

} // namespace

bool ObjectAccess::mayKeepXML(const Object& object) {
    if (&object.isa() != records) {
        const bool(&lacks)[3] = hooksOf(object).lacks;
        return !lacks[0] || !lacks[1] || !lacks[2];
    }
    const Dictionary* const contents = static_cast<const QXGenericRecord&>(object).contents().get();
    const auto keys = keptKeys();
    const auto isKept = [&](const String& key) {
        const bool isOne = key.isSameAs(keys[0]) || key.isSameAs(keys[1]) || key.isSameAs(keys[2]);
        return isOne || (!key.isInterned() && std::ranges::find(keys, key) != keys.end());
    };
    return contents != nullptr && DictionaryFilling::hasKey(*contents, isKept);
}

// A class that lacks a key raises when it is read by a key that it does not take; so it is asked
// once. A struct has the keys that it was described with, and no others. Of a record these are no
// properties: it is not asked whether they are.
Value ObjectAccess::getKept(const Object& object, KeptXML what) {
    if (&object.isa() == records)
        return object.valueForUndefinedKey(keyOf(what));
    bool& isLacking = hooksOf(object).lacks[static_cast<std::size_t>(what)];
    if (isLacking)
        return {};
    try {
        return object.valueForKey(keyOf(what));
    } catch (const UndefinedKeyException& exception) {
        if (!exception.concerns(&object, keyOf(what)))
            throw;
        isLacking = true;
        return {};
    }
}

bool ObjectAccess::setKept(Object& object, KeptXML what, Value value, Ref<Error>* error) {
    const Key key = keyOf(what);
    if (plainRecord(object) != nullptr)
        return set(object, key, std::move(value), error);
    bool& isLacking = hooksOf(object).lacks[static_cast<std::size_t>(what)];
    const SetOutcome outcome = isLacking ? SetOutcome::unknownKey : setProperty(object, key, value);
    if (outcome == SetOutcome::refused)
        return fail(error, errors::unableToSetValue, value, key.string(), object.isa().name());
    if (outcome == SetOutcome::unknownKey && !std::exchange(isLacking, true))
        warnOnce(object.isa(), unknownXMLIsDropped);
    return true;
}

bool ObjectAccess::adopt(Object& item, Object& parent, Ref<Error>* error) {
    // A struct moves to where it is held: there is no parent to tell it, and none that it could be.
    if (plainRecord(item) != nullptr || item.isa().isStruct() || parent.isa().isStruct())
        return true;
    const Operation* setParent = hooksOf(item).setParent;
    if (setParent == nullptr)
        return true;
    const Value argument(&parent);
    if (!setParent->takes({&argument, 1}))
        return fail(error, errors::unableToSetValue, argument, "parent", item.isa().name());
    send(item, *setParent, argument);
    return true;
}

bool ObjectAccess::isToBeWritten(Object& item) {
    if (plainRecord(item) != nullptr)
        return true;
    const ObjectHooks& hooks = hooksOf(item);
    if (hooks.isRemovable != nullptr)
        return !send(item, *hooks.isRemovable).boolValue();
    if (hooks.type->isStruct())
        return true;
    if (!std::exchange(hooks.hasLeftOutItems, true))
        warnOnce(*hooks.type, itemsAreLeftOut);
    return false;
}

} // namespace qx::detail
