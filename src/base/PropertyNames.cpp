#include "base/PropertyNames.h"

namespace qx::detail {

void markAsProperty(Key key) noexcept {
    if (key._rep != nullptr)
        key._rep->count.fetch_or(Key::propertyBit, std::memory_order_relaxed);
}

} // namespace qx::detail
