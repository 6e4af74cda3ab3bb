#pragma once

// Where a node of unknown XML stood in its element: behind which field's value. Known of what was
// read by a marshaller that keeps exactly; it goes with the node and with its copies.
//
//     <order><a/><x/><lines><y/><line/><z/></lines></order>
//
//     x   field "a",     all items
//     y   field "lines", inside its wrapper, 0 items
//     z   field "lines", inside its wrapper, 1 item

#include <QXXMLMarshalling/base/Key.h>
#include <QXXMLMarshalling/xml/XMLNode.h>

#include <cstdint>
#include <vector>

namespace qx {

struct KeptPlace {
    static constexpr std::uint32_t all = UINT32_MAX;

    // The field's key, behind those of the fields that hold the flattened objects around it. Empty
    // at the start of the element.
    std::vector<Key> field;
    std::uint32_t items = all; // how many of the field's stand before it
    bool isInside = false;     // the field's wrapper
    std::uint32_t order = 0;   // among all that is kept of the element

    // Null where the node has none.
    static const KeptPlace* of(const XMLNode& node) noexcept;
    static void set(XMLNode& node, KeptPlace place);
    // What the node has, the copy has, too.
    static void copy(const XMLNode& node, XMLNode& copy);
};

} // namespace qx
