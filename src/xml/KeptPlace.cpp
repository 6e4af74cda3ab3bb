#include "xml/KeptPlace.h"

#include "xml/NodeAttachment.h"

namespace qx {

const KeptPlace* KeptPlace::of(const XMLNode& node) noexcept {
    const NodeAttachment* const attachment = NodeAttachment::of(node);
    return attachment != nullptr ? attachment->place.get() : nullptr;
}

void KeptPlace::set(XMLNode& node, KeptPlace place) {
    NodeAttachment::made(node).place = std::make_shared<const KeptPlace>(std::move(place));
}

void KeptPlace::copy(const XMLNode& node, XMLNode& copy) {
    if (const NodeAttachment* const attachment = NodeAttachment::of(node);
        attachment != nullptr && attachment->place)
        NodeAttachment::made(copy).place = attachment->place;
}

} // namespace qx
