#pragma once

// What only some objects have, kept apart so that the others stay small.

#include <QXXMLMarshalling/platform/Object.h>

#include <memory>
#include <vector>

namespace qx {

struct ObservationInfo;

// Told once when an object that it was added to ends, while the object is still whole.
class EndListener {
public:
    virtual void objectEnds(Object& object) noexcept = 0;

protected:
    ~EndListener() = default;
};

// What a class of object keeps of its own kind.
struct ObjectAttachment {
    virtual ~ObjectAttachment() = default;
};

struct Object::Extras {
    std::unique_ptr<ObjectAttachment> attachment;
    Ref<WeakAnchor> anchor;
    std::vector<EndListener*> endListeners;
    std::unique_ptr<ObservationInfo> observation;

    Extras() noexcept;
    ~Extras();
};

// The extras for the rest of this room.
struct ObjectInternals {
    static Object::Extras& extras(const Object& object) { return object.extras(); }
    // Null when the object has none.
    static Object::Extras* existingExtras(const Object& object) noexcept { return object._extras; }
    // Whether the object's last reference is gone.
    static bool isEnding(const Object& object) noexcept;

    static void addEndListener(Object& object, EndListener& listener);
    // Does nothing when the listener was told already.
    static void removeEndListener(Object& object, EndListener& listener) noexcept;
    static void tellEndListeners(Object& object) noexcept;
};

} // namespace qx
