#include "xml/XMLPlace.h"

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/xml/XMLElement.h>

namespace qx {

namespace {

// The number among the siblings of its kind and name, behind a node that is not the only such.
std::string positionOf(const XMLNode& node) {
    const auto isLike = [&node](const XMLNode& other) {
        return other.kind() == node.kind() && other.name() == node.name();
    };
    std::size_t before = 0;
    for (const XMLNode* other = node.previousSibling(); other; other = other->previousSibling())
        before += isLike(*other);
    bool isAlone = before == 0;
    for (const XMLNode* other = node.nextSibling(); other && isAlone; other = other->nextSibling())
        isAlone = !isLike(*other);
    return isAlone ? "" : "[" + std::to_string(before + 1) + "]";
}

std::string stepTo(const XMLNode& node) {
    const std::string name = node.name().str();
    switch (node.kind()) {
    case XMLNodeKind::attribute:
        return "/@" + name;
    case XMLNodeKind::namespaceDeclaration:
        return (name.empty() ? "/@xmlns" : "/@xmlns:") + name;
    case XMLNodeKind::text:
        return "/text()" + name;
    case XMLNodeKind::comment:
        return "/comment()" + name;
    case XMLNodeKind::processingInstruction:
        return "/?" + name;
    default:
        return "/" + name;
    }
}

// Makes the node where the element holds what it stands for.
const XMLNode& nodeAt(const XMLPlace& place) {
    if (place.attributeName != nullptr)
        return *place.node->asElement()->attributeForName(*place.attributeName);
    return place.isItsText ? *place.node->firstChild() : *place.node;
}

} // namespace

std::string pathOf(const XMLNode& node) {
    // How many levels are named; what stands above them is left out.
    constexpr std::size_t namedLevels = 32;
    std::string path;
    std::size_t named = 0;
    const XMLNode* at = &node;
    for (; at != nullptr && at->kind() != XMLNodeKind::document && named < namedLevels;
         at = at->parent(), ++named)
        path.insert(0, stepTo(*at) + positionOf(*at));
    if (at != nullptr && at->kind() != XMLNodeKind::document)
        path.insert(0, "...");
    return path.empty() ? "/" : path;
}

void refuse(std::string_view what, const XMLPlace& place) {
    if (place.node == nullptr)
        throw Exception(Exception::invalidArgument, what);
    throw Exception(Exception::invalidArgument,
                    String::concat({what, " at ", pathOf(nodeAt(place))}));
}

void refuseBeyond(std::string_view what, std::size_t limit, const XMLPlace& place) {
    refuse(std::string(what) + " the limit of " + std::to_string(limit), place);
}

} // namespace qx
