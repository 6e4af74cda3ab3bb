#pragma once

// The names that the fields of a class take in an element, and what somebody who wrote another one
// may have meant by it. In a few words of English; null where there is nothing to say.

#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>

#include "plan/ClassPlan.h"

namespace qx::detail {

struct TakenNames {
    // What is looked for in a child of that name.
    struct Inside {
        String location;
        String name;
        bool isAttribute;
    };
    std::vector<String> attributes;
    std::vector<String> children; // locations among them
    std::vector<String> items;    // of typed collections without a location, own or inherited
    std::vector<Inside> inside;

    // With those of its ancestors, and of objects that are flattened into it, a few levels deep.
    static TakenNames of(const ClassPlan& type);
    static TakenNames of(const FieldPlan& field);
    // What is looked for in that child.
    TakenNames in(std::string_view location) const;
    bool isEmpty() const noexcept { return attributes.empty() && children.empty(); }
};

// What a node was found as that no field took.
struct UntakenNode {
    String name;
    bool isAttribute;
    std::vector<String> children; // of an element: the names of some elements in it
};
String suggestionFor(const UntakenNode& node, const TakenNames& names);
// For the name of a root that no class maps to.
String suggestedElement(const QXXMLMarshallingMapping& mapping, const String& written);
// The class of the mapping whose name is nearest.
String suggestedClass(const QXXMLMarshallingMapping& mapping, const String& wanted);

// A name in quotes, cut where it is long.
std::string quoted(std::string_view name);

} // namespace qx::detail
