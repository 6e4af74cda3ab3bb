#include "marshaller/ObjectDoor.h"

#include "model/Errors.h"

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
    if (_latest == nullptr || _latest->type != &type)
        _latest = &_known.try_emplace(&type, type).first->second;
    return *_latest;
}

qx::Value ObjectDoor::send(qx::Object& object, const qx::Operation& operation) {
    return operation.invoke(operation.selector, object.isa(), &object, {});
}

qx::Value ObjectDoor::send(qx::Object& object, const qx::Operation& operation,
                           const qx::Value& argument) {
    return operation.invoke(operation.selector, object.isa(), &object, {&argument, 1});
}

const qx::Class* const ObjectDoor::records = &QXGenericRecord::classObject();

bool ObjectDoor::set(qx::Object& object, qx::Key key, qx::Value value, qx::Ref<qx::Error>* error) {
    QXGenericRecord* record = plainRecord(object);
    const bool isContent =
        record != nullptr && (!key.namesProperty() || record->isa().property(key) == nullptr);
    if (isContent && record->addQuietly(key, std::move(value)))
        return true;
    // NOLINTNEXTLINE(bugprone-use-after-move): it was left alone
    return object.trySetValueForKey(value, key) == qx::SetOutcome::set ||
           qx::fail(error, qx::errors::unableToSetValue, value, key.string(), object.isa().name());
}
