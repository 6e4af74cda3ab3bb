#include <QXXMLMarshalling/model/ChangeScope.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Class.h>

#include "model/ObjectExtras.h"
#include "model/Warning.h"

#include <exception>

namespace qx {

namespace {

// Null when nobody ever listened to the object.
ChangeListener* listenerOf(const Object& object) noexcept {
    const auto* extras = ObjectInternals::existingExtras(object);
    return extras != nullptr ? extras->changeListener.get() : nullptr;
}

} // namespace

void Object::willChangeValueForKey(Key key) {
    if (ChangeListener* listener = listenerOf(*this))
        listener->willChange(key, ChangeKind::setting, {});
}

void Object::didChangeValueForKey(Key key) {
    if (ChangeListener* listener = listenerOf(*this))
        listener->didChange(key);
}

void Object::willChange(ChangeKind kind, std::span<const std::size_t> indexes, Key key) {
    if (ChangeListener* listener = listenerOf(*this))
        listener->willChange(key, kind, indexes);
}

void Object::didChange(ChangeKind, std::span<const std::size_t>, Key key) {
    if (ChangeListener* listener = listenerOf(*this))
        listener->didChange(key);
}

void Object::observeValueForKeyPath(const String& keyPath, Object*, const Dictionary&, Selector) {
    throw Exception(Exception::internalInconsistency,
                    String::concat({"class ", isa().name(), " observes ", keyPath.view(),
                                    " but does not take the change"}));
}

ChangeScope::ChangeScope(Object& object, Key key)
    : _object(object), _key(key), _exceptions(std::uncaught_exceptions()) {
    object.willChangeValueForKey(key);
}

ChangeScope::ChangeScope(Object& object, Key key, ChangeKind kind, std::vector<std::size_t> indexes)
    : _object(object), _key(key), _kind(kind), _indexes(std::move(indexes)),
      _exceptions(std::uncaught_exceptions()) {
    if (kind == ChangeKind::setting)
        object.willChangeValueForKey(key);
    else
        object.willChange(kind, _indexes, key);
}

namespace {

void reportThrown(Key key, const char* what) noexcept {
    try {
        reportWarning(String::concat(
            {"An observer of ", key.view(), " threw while the change failed: ", what}));
    } catch (...) { // NOLINT(bugprone-empty-catch): there is no memory left to say it
    }
}

} // namespace

void ObjectInternals::tellEndOfFailedChange(Key key, const std::function<void()>& tell) noexcept {
    try {
        tell();
    } catch (const std::exception& exception) {
        reportThrown(key, exception.what());
    } catch (...) {
        reportThrown(key, "an exception of its own");
    }
}

ChangeScope::~ChangeScope() noexcept(false) {
    if (std::uncaught_exceptions() == _exceptions)
        announceEnd();
    else
        ObjectInternals::tellEndOfFailedChange(_key, [this] { announceEnd(); });
}

void ChangeScope::announceEnd() {
    if (_kind == ChangeKind::setting)
        _object.didChangeValueForKey(_key);
    else
        _object.didChange(_kind, _indexes, _key);
}

} // namespace qx
