#pragma once

// What only some objects have, kept apart so that the others stay small.

#include <QXXMLMarshalling/model/WeakRef.h>

#include <functional>
#include <memory>
#include <vector>

namespace qx {

// Told once when an object that it was added to ends, while the object is still whole.
class EndListener {
public:
    virtual void objectEnds(Object& object) noexcept = 0;

protected:
    ~EndListener() = default;
};

// Hears of every change that is announced of an object; it belongs to the object.
class ChangeListener {
public:
    virtual ~ChangeListener() = default;
    virtual void willChange(Key key, ChangeKind kind, std::span<const std::size_t> indexes) = 0;
    virtual void didChange(Key key) = 0;
};

// What a class of object keeps of its own kind.
struct ObjectAttachment {
    virtual ~ObjectAttachment() = default;
};

struct Object::Extras {
    Ref<WeakAnchor> anchor;
    std::vector<EndListener*> endListeners;
    std::unique_ptr<ChangeListener> changeListener;
    Object* nextWaiting = nullptr; // of the ending objects that wait for their turn
    std::unique_ptr<ObjectAttachment> attachment;
};

// The extras for the rest of this folder, and for those above it.
struct ObjectInternals {
    static Object::Extras& extras(const Object& object) { return object.extras(); }
    // Null when the object has none.
    static Object::Extras* existingExtras(const Object& object) noexcept {
        return object._extras == nullptr || hasLinkForExtras(object) ? nullptr : object._extras;
    }
    // Whether anybody could hear of a change.
    static bool isHeard(const Object& object) noexcept { return object.hasObserversOrWeakRefs(); }
    // Whether the object's last reference is gone.
    static bool isEnding(const Object& object) noexcept;

    // Ending objects that wait for their turn are linked through their extras, or in the place of
    // these: no memory may be needed to end an object.
    static void linkWaiting(Object& object, Object* next) noexcept;
    static Object* unlinkWaiting(Object& object) noexcept;
    static bool hasLinkForExtras(const Object& object) noexcept;

    static void addEndListener(Object& object, EndListener& listener);
    // Does nothing when the listener was told already.
    static void removeEndListener(Object& object, EndListener& listener) noexcept;
    static void tellEndListeners(Object& object) noexcept;

    // Tells of the end of a change that an exception has ended. What an observer throws at that is
    // only reported.
    static void tellEndOfFailedChange(Key key, const std::function<void()>& tell) noexcept;
};

} // namespace qx
