#include "marshaller/ObjectAccess.h"

#include "model/Errors.h"
#include "record/RecordFilling.h"

namespace qx::detail {

ObjectHooks::ObjectHooks(const Class& describedType)
    : type(&describedType),
      setClassNameForMarshalling(describedType.operation("setClassNameForMarshalling:")),
      setNotifyBindingsObservers(describedType.operation("setNotifyBindingsObservers:")),
      setUndoManager(describedType.operation("setUndoManager:")),
      rootObject(describedType.operation("rootObject")),
      setParent(describedType.operation("setParent:")),
      isRemovable(describedType.operation("isRemovable")) {}

const ObjectHooks& ObjectAccess::hooksOf(const Object& object) {
    const Class& type = object.isa();
    if (_latest == nullptr || _latest->type != &type)
        _latest = &_known.try_emplace(&type, type).first->second;
    return *_latest;
}

Value ObjectAccess::send(Object& object, const Operation& operation) {
    return operation.invoke(operation.selector, object.isa(), &object, {});
}

Value ObjectAccess::send(Object& object, const Operation& operation, const Value& argument) {
    return operation.invoke(operation.selector, object.isa(), &object, {&argument, 1});
}

const Class* const ObjectAccess::records = &QXGenericRecord::classObject();

bool ObjectAccess::set(Object& object, Key key, Value value, Ref<Error>* error) {
    QXGenericRecord* record = plainRecord(object);
    if (record != nullptr && RecordFilling::add(*record, key, std::move(value)))
        return true;
    // NOLINTNEXTLINE(bugprone-use-after-move): it was left alone
    return object.trySetValueForKey(value, key) == SetOutcome::set ||
           fail(error, errors::unableToSetValue, value, key.string(), object.isa().name());
}

} // namespace qx::detail
