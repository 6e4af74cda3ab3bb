#include "model/ObjectExtras.h"

#include <algorithm>

namespace qx {

void ObjectInternals::addEndListener(Object& object, EndListener& listener) {
    extras(object).endListeners.push_back(&listener);
}

void ObjectInternals::removeEndListener(Object& object, EndListener& listener) noexcept {
    Object::Extras* extras = existingExtras(object);
    if (extras == nullptr)
        return;
    auto& listeners = extras->endListeners;
    const auto found = std::find(listeners.begin(), listeners.end(), &listener);
    if (found != listeners.end())
        listeners.erase(found);
}

// One at a time: a listener may take others away, and what it releases may add some.
void ObjectInternals::tellEndListeners(Object& object) noexcept {
    if (object._extras == nullptr)
        return;
    auto& listeners = object._extras->endListeners;
    while (!listeners.empty()) {
        EndListener* listener = listeners.back();
        listeners.pop_back();
        listener->objectEnds(object);
    }
}

} // namespace qx
