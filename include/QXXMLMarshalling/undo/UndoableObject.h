#pragma once

// A base class for a host's own classes: given an undo manager, every change of a described
// property through setValueForKey, and every change of a value announced by a ChangeScope, can be
// undone. A change announced by the indexes of items is not registered.
//
//     class Person : public qx::UndoableObject {
//     public:
//         void rename(const qx::String& name) {
//             const qx::ChangeScope scope(*this, "name");
//             _name = name;
//         }
//         …
//     };
//     qx::Class::define<Person, qx::UndoableObject>("Person").property<&Person::_name>("name");
//
// Keys are kept out of undo as ChangeTracking.h says. An undo manager keeps old values alive, and
// these may hold the object that holds the manager: call removeAllActions when an editor closes.
// So does the change cache, which holds the latest old value of a key that is not registered:
// setChangeCache(nullptr) drops it.

#include <QXXMLMarshalling/undo/ChangeTracking.h>

namespace qx {

class QX_API UndoableObject : public Object {
public:
    UndoableObject();
    // Removes the undo actions that target the object.
    ~UndoableObject() override;
    static const Class& classObject();

    // Null, as from the start: nothing is registered.
    Ref<UndoManager> undoManager() const { return _tracking.undoManager(); }
    void setUndoManager(Ref<UndoManager> undoManager) {
        _tracking.setUndoManager(std::move(undoManager));
    }
    // The values before the latest changes, by key, the null marker for null; never null.
    virtual Ref<Dictionary> changeCache() const { return _tracking.changeCache(); }
    virtual void setChangeCache(Ref<Dictionary> cache) {
        _tracking.setChangeCache(std::move(cache));
    }
    // False where the class, or the object, vetoes undo for the key.
    bool isUndoRegistrationEnabledForKey(Key key) const {
        return _tracking.isUndoRegistrationEnabledForKey(key);
    }

    void willChangeValueForKey(Key key) override;
    void didChangeValueForKey(Key key) override;
    void willChange(ChangeKind kind, std::span<const std::size_t> indexes, Key key) override;

protected:
    const Class& describedClass() const override;

    ChangeTracking& tracking() noexcept { return _tracking; }
    const ChangeTracking& tracking() const noexcept { return _tracking; }
    // Removes the undo actions that target the object and lets go of the manager. For a destructor
    // whose members, as they end, may call code that undoes.
    void endUndo() noexcept;

private:
    void restoreValue(const Value& value, const String& key);

    ChangeTracking _tracking;
};

} // namespace qx
