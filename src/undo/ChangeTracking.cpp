#include <QXXMLMarshalling/undo/ChangeTracking.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Null.h>

#include "model/NameList.h"
#include "model/Warning.h"

#include <array>
#include <exception>

namespace qx {

namespace {

Value nullForMarker(const Value& value) { return value.isNullOrMarker() ? Value() : value; }

// The remembered value, or the dictionary's own for a key such as "@count".
Value entry(const Dictionary& cache, Key key) {
    try {
        return cache.valueForKey(key);
    } catch (const UndefinedKeyException&) {
        return {};
    }
}

// The operation that undoing calls.
Selector restoring() {
    static const Selector selector("_setValue:forKey:");
    return selector;
}

// A key that is announced by hand need not be readable.
Value readable(const Object& owner, Key key) {
    try {
        return owner.valueForKey(key);
    } catch (const UndefinedKeyException& exception) {
        if (!exception.concerns(&owner, key))
            throw;
        return {};
    }
}

} // namespace

// An owner may offer its cache as a property. It is no value to remember: it would hold itself.
bool ChangeTracking::isCache(const Value& value) const noexcept {
    return _cache && value.object() == _cache.get();
}

Ref<Dictionary> ChangeTracking::changeCache() const {
    if (!_cache)
        _cache = make<Dictionary>();
    return _cache;
}

void ChangeTracking::willChangeValueForKey(Key key) {
    cacheValueForKey(key);
    if (_undoManager) {
        restoring();
        _undoManager->prepareChange(_owner);
    }
}

void ChangeTracking::cacheValueForKey(Key key) {
    Value current = readable(_owner, key);
    if (isCache(current))
        return;
    if (current.isNullOrMarker())
        current = Value(Null::marker());
    const Ref<Dictionary> cache = changeCache();
    const Value cached = entry(*cache, key);
    if (cached.isNull() || !(cached.isSameAs(current) || cached.isEqual(current)))
        cache->set(key.string(), std::move(current));
}

// Asks and tells the host, whose code may throw.
bool ChangeTracking::isToBeRegistered(const UndoManager& manager, Key key,
                                      const Value& before) const {
    if (!isUndoRegistrationEnabledForKey(key))
        return false;
    const Value now = nullForMarker(readable(_owner, key));
    if (isCache(now) || now.isSameAs(before) || (!now.isNull() && now.isEqual(before)))
        return false;
    if (const DebugSink log = debugSink()) {
        const std::array<Value, 3> arguments{key.string(), before, now};
        log(manager.isUndoing()   ? "Undo for key: %@ existing: %@ value: %@"
            : manager.isRedoing() ? "Redo for key: %@ existing: %@ value: %@"
                                  : "Set for key: %@ existing: %@ value: %@",
            arguments);
    }
    return true;
}

void ChangeTracking::didChangeValueForKey(Key key) {
    // The vetoes are the host's code: they may take the manager away.
    const Ref<UndoManager> manager = _undoManager;
    if (!manager || !manager->isUndoRegistrationEnabled())
        return;
    const Value before = nullForMarker(_cache ? _cache->get(key.string()) : Value());
    std::exception_ptr thrown;
    try {
        if (!isToBeRegistered(*manager, key, before))
            return;
    } catch (...) {
        // The change has taken place: without its action, those before it would be undone alone.
        thrown = std::current_exception();
    }
    manager->registerChange(_owner, restoring(), before, key);
    cacheValueForKey(key); // the cache holds the new value now
    if (thrown)
        std::rethrow_exception(thrown);
}

bool ChangeTracking::isUndoRegistrationEnabledForKey(Key key) const {
    static const Selector disabledKeyPaths("disabledKeyPathsForUndoRegistration");
    if (key.view().empty())
        return true;
    const Class& type = _owner.isa();
    if (type.classOperation(disabledKeyPaths) != nullptr &&
        listsName(type.perform(disabledKeyPaths), key))
        return false;
    const String name =
        String::concat({"isUndoRegistrationEnabledFor", key.string().capitalized()});
    // A name that was never used is no operation of anybody.
    if (Key::existing(name).isNull())
        return true;
    const Selector hook(name.view());
    if (_owner.respondsTo(hook))
        return _owner.perform(hook).boolValue();
    if (type.classOperation(hook) == nullptr)
        return true;
    type.perform(hook);
    return false;
}

void ChangeTracking::restoreValue(const Value& value, Key key) {
    if (const DebugSink log = debugSink()) {
        const std::array<Value, 4> arguments{
            _owner.isa().name(), reinterpret_cast<std::uintptr_t>(&_owner), key.string(), value};
        log("<%@:0x%08lx: _setValue:forKey: %@, %@", arguments);
    }
    _owner.setValueForKey(value, key);
}

} // namespace qx
