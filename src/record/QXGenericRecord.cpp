#include <QXXMLMarshalling/QXGenericRecord.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/detail/ObjectMemory.h>
#include <QXXMLMarshalling/host/UserDefaults.h>
#include <QXXMLMarshalling/model/ChangeScope.h>
#include <QXXMLMarshalling/model/Class.h>

#include "model/NameList.h"
#include "record/RecordFilling.h"

#include <typeinfo>

using qx::Dictionary;
using qx::Key;
using qx::Object;
using qx::Ref;
using qx::String;
using qx::Value;
using qx::detail::RecordFilling;

const char* const AllowMethodForwardingInGenericRecords = "AllowMethodForwardingInGenericRecords";

QXGenericRecord::QXGenericRecord() = default;

// Before the contents end.
QXGenericRecord::~QXGenericRecord() { endUndo(); }

void* QXGenericRecord::operator new(std::size_t size) {
    return qx::detail::ObjectMemory::allocate(size);
}

void* QXGenericRecord::operator new(std::size_t size, std::align_val_t alignment) {
    return ::operator new(size, alignment);
}

void QXGenericRecord::operator delete(void* memory) noexcept {
    qx::detail::ObjectMemory::release(memory);
}

void QXGenericRecord::operator delete(void* memory, std::align_val_t alignment) noexcept {
    ::operator delete(memory, alignment);
}

namespace {

// The zone is a relic that every caller passes and nobody looks at.
Ref<QXGenericRecord> copyInZone(const QXGenericRecord& record, const Value&) {
    return record.copyWithZone();
}

const qx::Class& describe() {
    using Record = QXGenericRecord;
    using namespace qx::detail;
    qx::UserDefaults::standardUserDefaults()->registerDefault(
        "NO", AllowMethodForwardingInGenericRecords);
    return qx::detail::publish(
        {.name = "QXGenericRecord",
         .type = &typeid(Record),
         .superclass = &typeid(qx::UndoableObject),
         .create = []() -> Ref<Object> { return qx::make<Record>(); },
         .properties =
             {accessorProperty<Record, &Record::notifyBindingsObservers,
                               &Record::setNotifyBindingsObservers>("notifyBindingsObservers"),
              accessorProperty<Record, &Record::undoManager, &Record::setUndoManager>(
                  "undoManager"),
              accessorProperty<Record, &Record::changeCache, &Record::setChangeCache>(
                  "changeCache"),
              accessorProperty<Record, &Record::className, &Record::setClassName>("className"),
              accessorProperty<Record, &Record::contents, &Record::setContents>("contents")},
         .operations = {instanceOperation<Record, &Record::setClassNameForMarshalling>(
                            "setClassNameForMarshalling:"),
                        instanceOperation<Record, &Record::setNotifyBindingsObservers>(
                            "setNotifyBindingsObservers:"),
                        instanceOperation<Record, &Record::isRemovable>("isRemovable"),
                        instanceOperation<Record, &Record::classNameForMarshalling>(
                            "classNameForMarshalling"),
                        instanceOperation<Record, &Record::notifyBindingsObservers>(
                            "notifyBindingsObservers"),
                        instanceOperation<Record, &Record::changeCache>("changeCache"),
                        instanceOperation<Record, &Record::setChangeCache>("setChangeCache:"),
                        instanceOperation<Record, &Record::className>("className"),
                        instanceOperation<Record, &Record::setClassName>("setClassName:"),
                        instanceOperation<Record, &Record::contents>("contents"),
                        instanceOperation<Record, &Record::setContents>("setContents:"),
                        instanceOperation<Record, &Record::description>("description"),
                        instanceOperation<Record, &Record::isUndoRegistrationEnabledForKey>(
                            "isUndoRegistrationEnabledForKey:"),
                        instanceOperation<Record, &copyInZone>("copyWithZone:"),
                        instanceOperation<Record, &Record::_cacheValueForKey>("_cacheValueForKey:"),
                        instanceOperation<Record, &Record::_setValue>("_setValue:forKey:")},
         .classOperations = {classOperation<&Record::allKnownKeyPaths>("allKnownKeyPaths"),
                             classOperation<&Record::automaticallyNotifiesObserversForKey>(
                                 "automaticallyNotifiesObserversForKey:")}});
}

// Described when the library is loaded, so that a mapping finds the class by its name.
[[maybe_unused]] const qx::Class& described = QXGenericRecord::classObject();

} // namespace

const qx::Class& QXGenericRecord::classObject() {
    static const qx::Class& type = describe();
    return type;
}

const qx::Class& QXGenericRecord::describedClass() const { return classObject(); }

Ref<QXGenericRecord> QXGenericRecord::copyWithZone() const {
    auto copy = isa().create().as<QXGenericRecord>();
    const auto typeOf = [](const Object& object) -> const std::type_info& {
        return typeid(object);
    };
    if (!copy || typeOf(*copy) != typeOf(*this))
        throw qx::Exception(
            qx::Exception::internalInconsistency,
            String::concat({"a record of class ", isa().name(),
                            " cannot be copied: its description makes no such record"}));
    copy->setClassName(_className);
    if (_contents) {
        auto deep = Dictionary::deepCopyFunction();
        copy->setContents(deep != nullptr ? deep(*_contents) : _contents->mutableCopy());
    }
    copy->setNotifyBindingsObservers(notifyBindingsObservers());
    return copy;
}

std::vector<String> QXGenericRecord::keys() const {
    std::vector<String> keys;
    if (_contents) {
        keys.reserve(_contents->count());
        for (const auto& entry : *_contents)
            keys.push_back(entry.key);
    }
    return keys;
}

Value QXGenericRecord::valueForUndefinedKey(Key key) const {
    return _contents ? _contents->get(key.string()) : Value();
}

void QXGenericRecord::setValueForUndefinedKey(const Value& value, Key key) {
    RecordFilling::contents(*this);
    if (RecordFilling::addContent(*this, key, Value(value)))
        return;
    const qx::ChangeScope scope(*this, key);
    // Whoever was told may have given the record other contents.
    if (const Ref<Dictionary> contents = RecordFilling::contents(*this); value.isNull())
        contents->remove(key.string());
    else
        contents->set(key.string(), value);
}

Ref<QXGenericRecord> QXGenericRecord::init() { return qx::make<QXGenericRecord>(); }

void QXGenericRecord::_cacheValueForKey(Key key) { tracking().cacheValueForKey(key); }

void QXGenericRecord::_setValue(const Value& value, Key key) {
    tracking().restoreValue(value, key);
}

String QXGenericRecord::classNameForMarshalling() const {
    return _className.isNull() ? Object::classNameForMarshalling() : _className;
}

Ref<Dictionary> QXGenericRecord::changeCache() const {
    Ref<Dictionary> cache = UndoableObject::changeCache();
    RecordFilling::completeCache(*this, *cache);
    return cache;
}

void QXGenericRecord::setChangeCache(Ref<Dictionary> cache) {
    UndoableObject::setChangeCache(std::move(cache));
    _isCacheBehind = false;
}

// What the old contents tell of earlier changes is noted before they go.
void QXGenericRecord::setContents(Ref<Dictionary> contents) {
    if (_isCacheBehind && !_contents->isEmpty())
        changeCache();
    _contents = std::move(contents);
    _isCacheBehind = false;
}

String QXGenericRecord::description() const { return descriptionWithLocale(nullptr, 0); }

String QXGenericRecord::descriptionWithLocale(const Object* locale, std::size_t indent) const {
    std::string text = Object::description().str();
    if (!_className.isEmpty() && _className != isa().name()) {
        text += " className: ";
        text += _className.view();
    }
    if (_contents && !_contents->isEmpty()) {
        text += " contents:\n";
        text += _contents->descriptionWithLocale(locale, indent).view();
    }
    return text;
}

Ref<qx::CountedSet> QXGenericRecord::allKnownKeyPaths() { return qx::make<qx::CountedSet>(); }

bool QXGenericRecord::automaticallyNotifiesObserversForKey(const qx::Class& receiver,
                                                           const String& key) {
    static const qx::Selector allKnownKeyPaths("allKnownKeyPaths");
    static const qx::Operation& ownPaths = *described.classOperation(allKnownKeyPaths);
    // Asked at every change; a class that names no keys of its own answers without a set.
    const qx::Operation* paths = receiver.classOperation(allKnownKeyPaths);
    return paths == &ownPaths || !qx::listsName(receiver.perform(allKnownKeyPaths), key);
}
