#pragma once

// A dynamic record: values by key, with a class name of its own. The unmarshaller makes one where a
// mapping names a class that the host does not have.
//
//     auto order = qx::make<QXGenericRecord>();
//     order->setClassNameForMarshalling("Order");
//     order->setValueForKey("A-17", "number");
//     order->setUndoManager(manager);                   // from here on changes can be undone
//     auto quantity = order->get<int>("quantity");      // std::optional<int>
//     for (const qx::String& key : order->keys()) …     // in the order in which keys were set
//
// Every key is content but the names of the five properties below, which key-value access sets as
// such: notifyBindingsObservers, undoManager, changeCache, className and contents. Setting null
// removes a key; reading an unknown one gives null; neither raises.
//
// Once the user default "AllowMethodForwardingInGenericRecords" is true, a record answers accessor
// messages for keys that it has no operation for: perform("title") reads, perform("setTitle:", …)
// writes "title". Only the one character behind "set" becomes lower case.

#include <QXXMLMarshalling/model/CountedSet.h>
#include <QXXMLMarshalling/model/Dictionary.h>
#include <QXXMLMarshalling/model/ValueTraits.h>
#include <QXXMLMarshalling/undo/UndoManager.h>
#include <QXXMLMarshalling/undo/UndoableObject.h>

namespace qx::detail {
class RecordFilling;
}

// The user default that lets records answer accessor messages; its registered value is "NO".
extern QX_API const char* const AllowMethodForwardingInGenericRecords;

class QX_API QXGenericRecord : public qx::UndoableObject {
public:
    QXGenericRecord();
    static qx::Ref<QXGenericRecord> init();
    static void* operator new(std::size_t size);
    static void* operator new(std::size_t size, std::align_val_t alignment);
    static void operator delete(void* memory) noexcept;
    static void operator delete(void* memory, std::align_val_t alignment) noexcept;
    // Removes the undo actions that target the record.
    ~QXGenericRecord() override;
    // The class as data, named "QXGenericRecord". Describing it registers the user default above.
    static const qx::Class& classObject();

    // A new record of the same class with the same class name and flag, and a copy of the contents:
    // a deep one where the host has installed one (qx::Dictionary::setDeepCopyFunction), else one
    // that shares the values. It has no undo manager. Raises NSInternalInconsistencyException where
    // the class cannot be created: nobody described it, or it takes arguments.
    virtual qx::Ref<QXGenericRecord> copyWithZone() const;

    // The value under the key as a T; none when there is no value or T does not take it.
    template <class T>
    std::optional<T> get(qx::Key key) const {
        const qx::Value value = valueForKey(key);
        T result{};
        if (value.isNull() || !qx::ValueTraits<T>::fromValue(value, result))
            return std::nullopt;
        return result;
    }
    // The keys of the contents in the order in which they were set.
    std::vector<qx::String> keys() const;

    qx::Value valueForUndefinedKey(qx::Key key) const override;
    // Stores the value, or removes the key for null; tells observers and registers undo.
    void setValueForUndefinedKey(const qx::Value& value, qx::Key key) override;
    // Remembers the value of the key in the change cache, as each announced change does.
    void _cacheValueForKey(qx::Key key);
    // Sets the value again: what undoing and redoing call.
    void _setValue(const qx::Value& value, qx::Key key);

    // The class name given by a mapping, else that of the record's own class.
    qx::String classNameForMarshalling() const override;
    void setClassNameForMarshalling(const qx::String& name) { _className = name; }
    // Always false: items of this class are written as part of a collection.
    bool isRemovable() const { return false; }

    // Plain accessors of the properties: they keep what they are given and tell nobody.
    // So are undoManager() and setUndoManager(), which every UndoableObject has.
    bool notifyBindingsObservers() const noexcept { return _notifyBindingsObservers; }
    void setNotifyBindingsObservers(bool notify) noexcept { _notifyBindingsObservers = notify; }
    // The values as they stood before the last changes, by key; empty after construction.
    qx::Ref<qx::Dictionary> changeCache() const override;
    void setChangeCache(qx::Ref<qx::Dictionary> cache) override;
    const qx::String& className() const noexcept { return _className; }
    void setClassName(const qx::String& name) { _className = name; }
    // Null until the first value is set.
    const qx::Ref<qx::Dictionary>& contents() const noexcept { return _contents; }
    void setContents(qx::Ref<qx::Dictionary> contents);

    // Have the operation, which takes the change dictionary (Observation.h), called on this record
    // at each change of the value at the key path. The collection is an array or a dictionary,
    // whose values count.
    void observeObject(qx::Object& object, const qx::String& keyPath, qx::Selector selector);
    void observeObjects(const qx::Object& collection, const qx::String& keyPath,
                        qx::Selector selector);
    void removeObservation(qx::Object& object, const qx::String& keyPath);
    void removeObservations(const qx::Object& collection, const qx::String& keyPath);
    void observeValueForKeyPath(const qx::String& keyPath, qx::Object* object,
                                const qx::Dictionary& change, qx::Selector context) override;

    qx::Ref<qx::MethodSignature> methodSignatureForSelector(qx::Selector selector) const override;
    void forwardInvocation(qx::Invocation& invocation) override;

    // The class name and address, then " className: …" when it is another, then the contents.
    qx::String description() const override;
    qx::String descriptionWithLocale(const qx::Object* locale, std::size_t indent) const override;

    // Class operations. Keys that a subclass handles with properties of its own; none here.
    static qx::Ref<qx::CountedSet> allKnownKeyPaths();
    // False for the keys that the class names as its own.
    static bool automaticallyNotifiesObserversForKey(const qx::Class& receiver,
                                                     const qx::String& key);

protected:
    const qx::Class& describedClass() const override;

private:
    friend class qx::detail::RecordFilling;

    qx::String _className;
    qx::Ref<qx::Dictionary> _contents;
    bool _notifyBindingsObservers = true;
    // Whether the change cache may lack keys of the contents, which were null before.
    mutable bool _isCacheBehind = false;
};
