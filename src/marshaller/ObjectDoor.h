#pragma once

// The one door through which the marshaller reaches objects: their class, their values by key, the
// operations that it may ask of them. What an object's class answers is looked up once per class
// and call of the marshaller.

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Error.h>

#include <unordered_map>

// The optional operations of one class, null where its objects do not answer.
struct ObjectHooks {
    const qx::Class* type = nullptr;
    const qx::Operation* setClassNameForMarshalling = nullptr;
    const qx::Operation* setNotifyBindingsObservers = nullptr;
    const qx::Operation* setUndoManager = nullptr;
    const qx::Operation* rootObject = nullptr;
    const qx::Operation* setParent = nullptr;
    const qx::Operation* isRemovable = nullptr;

    explicit ObjectHooks(const qx::Class& describedType);
};

class ObjectDoor {
public:
    // The hooks of the object's class; they stand as long as the door.
    const ObjectHooks& hooksOf(const qx::Object& object);

    // The object as a record, null for one of any other class, a subclass of the record's too. What
    // the hooks of most objects would do is done directly then.
    static QXGenericRecord* plainRecord(qx::Object& object) {
        return &object.isa() == records ? static_cast<QXGenericRecord*>(&object) : nullptr;
    }

    // Calls one of the object's hooks.
    static qx::Value send(qx::Object& object, const qx::Operation& operation);
    static qx::Value send(qx::Object& object, const qx::Operation& operation,
                          const qx::Value& argument);

    static qx::Value get(const qx::Object& object, qx::Key key) { return object.valueForKey(key); }
    // Sets and reports what the object does not take:
    //   -222  "Unable to set value: %@ for key: %@ in class: %@"
    static bool set(qx::Object& object, qx::Key key, qx::Value value, qx::Ref<qx::Error>* error);

private:
    static const qx::Class* const records;

    std::unordered_map<const qx::Class*, ObjectHooks> _known;
    const ObjectHooks* _latest = nullptr;
};
