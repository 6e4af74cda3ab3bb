#pragma once

// Where in a tree something stands, for the message of what cannot be written.

#include <QXXMLMarshalling/xml/XMLNode.h>

#include <string>
#include <string_view>

namespace qx {

// A node, or what an element holds without a node of its own. One without a node stands for
// nowhere: in what has no nodes.
struct XMLPlace {
    XMLPlace() noexcept = default;
    XMLPlace(const XMLNode& where, bool isText = false, const String* attribute = nullptr) noexcept
        : node(&where), isItsText(isText), attributeName(attribute) {}

    const XMLNode* node = nullptr;
    bool isItsText = false;
    const String* attributeName = nullptr; // of the node's attribute
};

// The path of the node, such as /order/item[2]/@name. Deep ones begin with "...".
std::string pathOf(const XMLNode& node);

// Raises NSInvalidArgumentException that says what is refused, and where.
[[noreturn]] void refuse(std::string_view what, const XMLPlace& place);
[[noreturn]] void refuseBeyond(std::string_view what, std::size_t limit, const XMLPlace& place);

} // namespace qx
