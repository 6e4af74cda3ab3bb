// An object from its making to its end: the count, the end of long chains, weak references, and the
// extras that only some objects have.

#include "model/ObjectExtras.h"

#include <utility>

namespace qx {

namespace {

#ifndef NDEBUG
std::atomic<std::int64_t> liveObjects{0};
#endif

// Objects that end while this many others are ending above them on the stack wait for their turn.
constexpr unsigned deepestRelease = 64;

// What an object's count says. A destructor may make and drop references to it: none of these
// brings the count from one range into another.
//
//     0x00000001 and up     so many references
//     about 0x40000000      the object ends: its destructor runs, or is about to
//     about 0x80000000      it waits for its turn, has no extras, and _extras is the link to the
//     next
//                           object that waits
constexpr std::uint32_t endingCount = 0x40000000U;
constexpr std::uint32_t waitingCount = 2 * endingCount;

struct Ending {
    unsigned depth = 0;
    Object* waiting = nullptr; // the latest; the others are linked to it
};
// In the library's initial block of thread memory: it is looked at for every object that ends.
[[gnu::tls_model("initial-exec")]] thread_local Ending ending;

} // namespace

Object::Object() noexcept {
#ifndef NDEBUG
    liveObjects.fetch_add(1, std::memory_order_relaxed);
#endif
}

Object::~Object() {
    // Told already unless this object was never counted, or gained listeners while it ended.
    if (_extras != nullptr) {
        _count.store(endingCount, std::memory_order_relaxed);
        if (_extras->anchor)
            _extras->anchor->clear();
        ObjectInternals::tellEndListeners(*this);
        delete _extras;
    }
#ifndef NDEBUG
    liveObjects.fetch_sub(1, std::memory_order_relaxed);
#endif
}

std::int64_t Object::liveCount() noexcept {
#ifndef NDEBUG
    return liveObjects.load(std::memory_order_relaxed);
#else
    return 0;
#endif
}

// A long chain of objects would end by recursion, one frame a link. Past a fixed depth they queue
// up instead. While an object waits it is whole, and others may still read it.
void Object::destroy() const noexcept {
    auto* self = const_cast<Object*>(this);
    _count.store(endingCount, std::memory_order_relaxed);
    if (_extras != nullptr && _extras->anchor)
        _extras->anchor->clear();
    if (ending.depth >= deepestRelease) {
        ObjectInternals::linkWaiting(*self, ending.waiting);
        ending.waiting = self;
        return;
    }
    const auto finish = [](Object& object) {
        ++ending.depth;
        if (object._extras != nullptr)
            ObjectInternals::tellEndListeners(object);
        delete &object;
        --ending.depth;
    };
    finish(*self);
    while (ending.depth == 0 && ending.waiting != nullptr) {
        Object* next = ending.waiting;
        ending.waiting = ObjectInternals::unlinkWaiting(*next);
        finish(*next);
    }
}

bool ObjectInternals::isEnding(const Object& object) noexcept {
    return object._count.load(std::memory_order_relaxed) >= endingCount / 2;
}

bool ObjectInternals::hasLinkForExtras(const Object& object) noexcept {
    return object._count.load(std::memory_order_relaxed) >= waitingCount - endingCount / 2;
}

void ObjectInternals::linkWaiting(Object& object, Object* next) noexcept {
    if (object._extras != nullptr) {
        object._extras->nextWaiting = next;
        return;
    }
    object._extras = reinterpret_cast<Object::Extras*>(next);
    object._count.fetch_add(waitingCount - endingCount, std::memory_order_relaxed);
}

Object* ObjectInternals::unlinkWaiting(Object& object) noexcept {
    if (!hasLinkForExtras(object))
        return object._extras->nextWaiting;
    object._count.fetch_sub(waitingCount - endingCount, std::memory_order_relaxed);
    return reinterpret_cast<Object*>(std::exchange(object._extras, nullptr));
}

Object::Extras& Object::extras() const {
    auto* existing = ObjectInternals::existingExtras(*this);
    if (existing != nullptr)
        return *existing;
    auto* made = new Extras;
    if (ObjectInternals::hasLinkForExtras(*this))
        made->nextWaiting = ObjectInternals::unlinkWaiting(const_cast<Object&>(*this));
    _extras = made;
    return *made;
}

// Of an object that ends there is nothing to refer to any more.
Ref<WeakAnchor> Object::weakAnchor() const {
    Ref<WeakAnchor>& anchor = extras().anchor;
    if (!anchor)
        anchor = make<WeakAnchor>(ObjectInternals::isEnding(*this) ? nullptr
                                                                   : const_cast<Object*>(this));
    return anchor;
}

} // namespace qx
