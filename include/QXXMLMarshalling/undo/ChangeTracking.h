#pragma once

// Turns the change notifications of an object into undo actions. A class that holds one hands its
// will and did on to it:
//
//     void willChangeValueForKey(Key key) override {
//         _tracking.willChangeValueForKey(key);
//         Object::willChangeValueForKey(key);
//     }
//
// and describes the operation "_setValue:forKey:", which undoing calls (see restoreValue).
// UndoableObject (UndoableObject.h) is such a class, ready to derive from.
//
// Before a change the value is remembered; after it, where the value differs, an action that sets
// the old one back is registered with the undo manager. What memory that takes is had before the
// change: where it fails, there is neither. The owner's class may veto the registration:
//
//     class operation "disabledKeyPathsForUndoRegistration"     returns the keys, a set or an array
//     operation "isUndoRegistrationEnabledForTitle"             returns false (for the key "title")
//     class operation "isUndoRegistrationEnabledForTitle"       vetoes whatever it returns
//
// The key is capitalized word by word in these names: "firstName" gives "…ForFirstname". A veto
// that throws is none: the change is registered, and the exception comes out.

#include <QXXMLMarshalling/model/Dictionary.h>
#include <QXXMLMarshalling/undo/UndoManager.h>

namespace qx {

class QX_API ChangeTracking {
public:
    // The owner holds the tracking as a member: it is only used while it lives.
    explicit ChangeTracking(Object& owner) noexcept : _owner(owner) {}
    ChangeTracking(const ChangeTracking&) = delete;
    ChangeTracking& operator=(const ChangeTracking&) = delete;

    // Null, as from the start: nothing is registered.
    const Ref<UndoManager>& undoManager() const noexcept { return _undoManager; }
    void setUndoManager(Ref<UndoManager> undoManager) noexcept {
        _undoManager = std::move(undoManager);
    }

    // The values before the latest changes, by key, the null marker for null; made when asked for.
    Ref<Dictionary> changeCache() const;
    void setChangeCache(Ref<Dictionary> cache) noexcept { _cache = std::move(cache); }

    // True while there is no undo manager and nothing is remembered.
    bool isIdle() const noexcept { return !_undoManager && !_cache; }

    // Remembers the value of the key, for changes of a collection's items too.
    void willChangeValueForKey(Key key);
    // No more than that, for when no change follows.
    void cacheValueForKey(Key key);
    // Registers the change, if it is one. To be called before observers are told.
    void didChangeValueForKey(Key key);

    // False where the owner's class vetoes undo for the key.
    bool isUndoRegistrationEnabledForKey(Key key) const;

    // What the owner's "_setValue:forKey:" does: sets the value through setValueForKey, so that
    // undoing an undo is registered like any change.
    void restoreValue(const Value& value, Key key);

private:
    bool isToBeRegistered(const UndoManager& manager, Key key, const Value& before) const;
    bool isCache(const Value& value) const noexcept;

    Object& _owner;
    Ref<UndoManager> _undoManager;
    mutable Ref<Dictionary> _cache;
};

} // namespace qx
