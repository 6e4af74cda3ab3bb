#pragma once

// How the marshaller reaches objects: their class, their values by key, the operations that it may
// ask of them. What the objects of a class answer is looked up once per class and call of the
// marshaller.

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Error.h>

#include "record/RecordFilling.h"

#include <unordered_map>
#include <utility>

namespace qx::detail {

// The optional operations of one class, null where its objects do not answer.
struct ObjectHooks {
    const Class* type = nullptr;
    const Operation* setClassNameForMarshalling = nullptr;
    const Operation* setNotifyBindingsObservers = nullptr;
    const Operation* setUndoManager = nullptr;
    const Operation* rootObject = nullptr;
    const Operation* setParent = nullptr;
    const Operation* isRemovable = nullptr;
    // What was found out meanwhile of its objects: by KeptXML, a key that they do not have.
    mutable bool lacks[3] = {};
    mutable bool hasLeftOutItems = false;

    explicit ObjectHooks(const Class& describedType);
};

// What an object keeps of its element beside its fields.
enum class KeptXML : std::uint8_t { children, attributes, namespaces };

class ObjectAccess {
public:
    // The hooks of the object's class; they live as long as the ObjectAccess.
    const ObjectHooks& hooksOf(const Object& object) {
        const Class& type = object.isa();
        if (_latest == nullptr || _latest->type != &type)
            _latest = &_known.try_emplace(&type, type).first->second;
        return *_latest;
    }

    // The object as a record, null for one of any other class, a subclass of the record's too. What
    // the hooks of most objects would do is done directly then.
    static QXGenericRecord* plainRecord(Object& object) {
        return &object.isa() == records ? static_cast<QXGenericRecord*>(&object) : nullptr;
    }
    static const QXGenericRecord* plainRecord(const Object& object) {
        return &object.isa() == records ? static_cast<const QXGenericRecord*>(&object) : nullptr;
    }

    // Calls one of the object's hooks.
    static Value send(Object& object, const Operation& operation);
    static Value send(Object& object, const Operation& operation, const Value& argument);

    // A value that is to be written. Structs in it stay where they are, in their owner. A record's
    // text or number stays there, too: it is good until the next call of anything of a host's.
    class Held {
    public:
        Held(Value value, bool keepsZero) noexcept
            : _own(std::move(value)), _keepsZero(keepsZero) {}
        explicit Held(const Value& lent) noexcept : _lent(&lent) {}

        const Value& value() const noexcept { return _lent != nullptr ? *_lent : _own; }
        bool keepsZero() const noexcept { return _keepsZero; } // see Property

    private:
        Value _own;
        const Value* _lent = nullptr;
        bool _keepsZero = false;
    };
    static Held get(const Object& object, Key key) {
        return get(object, key, object.isa().property(key));
    }
    // The same by what property(key) of its class is.
    static Held get(const Object& object, Key key, const Property* property);
    // The same of what a record has under a key that is no property of records; `next` is the
    // place in its contents where that may stand, and moves on.
    static Held getContent(const QXGenericRecord& record, Key key, std::size_t& next) {
        const Dictionary* const contents = record.contents().get();
        const Value* const value =
            contents != nullptr ? DictionaryFilling::find(*contents, key.string(), next) : nullptr;
        if (value == nullptr)
            return {Value(), false};
        return value->isObject() ? Held(*value, false) : Held(*value);
    }
    // False where getKept would give null for each.
    bool mayKeepXML(const Object& object);
    // Null where the object has no such key.
    Value getKept(const Object& object, KeptXML what);
    // Sets and reports what the object does not take:
    //   -222  "Unable to set value: %@ for key: %@ in class: %@"
    static bool set(Object& object, Key key, Value&& value, Ref<Error>* error) {
        QXGenericRecord* const record = plainRecord(object);
        return (record != nullptr && RecordFilling::add(*record, key, std::move(value))) ||
               // NOLINTNEXTLINE(bugprone-use-after-move): it was left alone
               setOrRefuse(object, key, value, error);
    }
    // False, with -222 for a value that the object did not take.
    static bool refuse(const Object& object, Key key, const Value& value, Ref<Error>* error);
    // As set, but that an object without such a key drops the value: the log says so, once for
    // each class.
    bool setKept(Object& object, KeptXML what, Value value, Ref<Error>* error);

    // Tells the item of the object that is to hold it, which comes before that one gets it. False
    // with -222 when the item does not take such a parent.
    bool adopt(Object& item, Object& parent, Ref<Error>* error);
    // The key under which objects have it.
    static Key keyOf(KeptXML what);

    // Whether an item of a collection is written: when it says that it cannot be removed, as
    // records and structs do. One that says nothing is not.
    bool isToBeWritten(Object& item);

private:
    static bool setOrRefuse(Object& object, Key key, const Value& value, Ref<Error>* error);
    static SetOutcome setProperty(Object& object, Key key, const Value& value);

    static const Class* const records;

    std::unordered_map<const Class*, ObjectHooks> _known;
    const ObjectHooks* _latest =
        nullptr; // mostly the next one's, too: 3 % of the time of host classes
};

} // namespace qx::detail
