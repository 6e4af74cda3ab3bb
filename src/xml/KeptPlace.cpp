#include "xml/KeptPlace.h"

#include "model/ObjectExtras.h"

namespace qx {

const KeptPlace* KeptPlace::of(const XMLNode& node) noexcept {
    const auto* const extras = ObjectInternals::existingExtras(node);
    return extras != nullptr ? static_cast<const KeptPlace*>(extras->place.get()) : nullptr;
}

void KeptPlace::set(XMLNode& node, KeptPlace place) {
    ObjectInternals::extras(node).place = std::make_shared<const KeptPlace>(std::move(place));
}

void KeptPlace::copy(const XMLNode& node, XMLNode& copy) {
    const auto* const extras = ObjectInternals::existingExtras(node);
    if (extras != nullptr && extras->place)
        ObjectInternals::extras(copy).place = extras->place;
}

} // namespace qx
