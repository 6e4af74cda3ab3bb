#include "marshaller/ObjectDoor.h"

#include "platform/system/Errors.h"

#include <algorithm>

ObjectHooks::ObjectHooks(const qx::Class& describedType)
    : type(&describedType),
      setClassNameForMarshalling(describedType.operation("setClassNameForMarshalling:")),
      setNotifyBindingsObservers(describedType.operation("setNotifyBindingsObservers:")),
      setUndoManager(describedType.operation("setUndoManager:")),
      rootObject(describedType.operation("rootObject")),
      setParent(describedType.operation("setParent:")),
      isRemovable(describedType.operation("isRemovable")) {}

const ObjectHooks& ObjectDoor::hooksOf(const qx::Object& object) {
    const qx::Class& type = object.isa();
    const auto known = std::find_if(_known.begin(), _known.end(),
                                    [&](const ObjectHooks& hooks) { return hooks.type == &type; });
    return known != _known.end() ? *known : _known.emplace_back(type);
}

qx::Value ObjectDoor::send(qx::Object& object, const qx::Operation& operation) {
    return operation.invoke(operation.selector, object.isa(), &object, {});
}

qx::Value ObjectDoor::send(qx::Object& object, const qx::Operation& operation,
                           const qx::Value& argument) {
    return operation.invoke(operation.selector, object.isa(), &object, {&argument, 1});
}

bool ObjectDoor::set(qx::Object& object, qx::Key key, const qx::Value& value,
                     qx::Ref<qx::Error>* error) {
    return set(object, key, value) == qx::SetOutcome::set ||
           qx::fail(error, qx::errors::unableToSetValue, value, key.string(), object.isa().name());
}
