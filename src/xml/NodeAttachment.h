#pragma once

// What only some nodes have beside their members.

#include "model/ObjectExtras.h"
#include "xml/KeptPlace.h"

namespace qx {

struct NodeAttachment final : ObjectAttachment {
    std::unique_ptr<ObjectAttachment> indexes; // an element's, see XMLElement.cpp
    std::shared_ptr<const KeptPlace> place;    // shared with copies of the node

    // Null where the node has none.
    static NodeAttachment* of(const XMLNode& node) noexcept {
        const auto* const extras = ObjectInternals::existingExtras(node);
        return extras != nullptr ? static_cast<NodeAttachment*>(extras->attachment.get()) : nullptr;
    }
    static NodeAttachment& made(const XMLNode& node) {
        auto& attachment = ObjectInternals::extras(node).attachment;
        if (!attachment)
            attachment = std::make_unique<NodeAttachment>();
        return static_cast<NodeAttachment&>(*attachment);
    }
};

} // namespace qx
