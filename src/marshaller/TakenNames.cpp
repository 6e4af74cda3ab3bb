#include "marshaller/TakenNames.h"

#include "base/NearestName.h"
#include "base/Unicode.h"
#include "plan/MappingPlan.h"
#include "xml/XMLCharacters.h"

#include <algorithm>

namespace qx::detail {

namespace {

// Mappings may chain classes, and flatten one into another, without end.
constexpr std::size_t mostAncestors = 64;
constexpr std::size_t mostFlattened = 4;

std::string_view withoutPrefix(std::string_view name) { return name.substr(name.find(':') + 1); }

bool contains(const std::vector<String>& names, const String& name) {
    return std::ranges::find(names, name) != names.end();
}

void addFields(const ClassPlan& type, std::size_t flattened, TakenNames& names);

void addField(const FieldPlan& field, std::size_t flattened, TakenNames& names) {
    const bool isCollection = field.isCollection();
    if (field.kind == BindingKind::flattened && !isCollection) {
        const std::size_t own = names.items.size();
        if (field.typeClass != nullptr && flattened != 0)
            addFields(*field.typeClass, flattened - 1, names);
        names.items.resize(own);
        return;
    }
    const bool mayBeAttribute = !isCollection && (field.kind == BindingKind::attribute ||
                                                  field.kind == BindingKind::automatic);
    const bool mayBeChild = isCollection || field.kind != BindingKind::attribute;
    const bool looksInside = isCollection ? field.hasType() : mayBeAttribute;
    for (const BindingPlan& binding : field.bindings) {
        const bool isNameless = field.kind == BindingKind::text && !isCollection;
        if (isNameless && binding.bindTo.isEmpty())
            continue;
        if (looksInside && !binding.location.isEmpty()) {
            names.children.push_back(binding.location);
            names.inside.push_back({binding.location, binding.name, mayBeAttribute});
            continue;
        }
        if (mayBeAttribute)
            names.attributes.push_back(binding.name);
        if (isCollection && field.hasType())
            names.items.push_back(binding.name);
        if (mayBeChild)
            names.children.push_back(binding.name);
    }
}

void addFields(const ClassPlan& type, std::size_t flattened, TakenNames& names) {
    ExtendsWalk walk(type);
    for (std::size_t level = 0; level < mostAncestors; ++level) {
        for (const FieldPlan& field : walk.current().fields)
            addField(field, flattened, names);
        if (!walk.next())
            return;
    }
}

// For a name of the document that the mapping does not have, by those that it has.
String meantFor(const String& written, const std::vector<String>& known) {
    NearestName nearest(written);
    for (const String& name : known)
        if (isXMLName(name))
            nearest.consider(name);
    const std::string_view name = nearest.name();
    if (name.empty())
        return nullptr;
    if (withoutPrefix(name) == withoutPrefix(written))
        return "the document says " + quoted(written) + ", the mapping " + quoted(name) +
               ": map the prefix with --prefix";
    return "did you mean " + quoted(name) + "?";
}

} // namespace

TakenNames TakenNames::of(const ClassPlan& type) {
    TakenNames names;
    addFields(type, mostFlattened, names);
    return names;
}

TakenNames TakenNames::of(const FieldPlan& field) {
    TakenNames names;
    addField(field, 0, names);
    return names;
}

TakenNames TakenNames::in(std::string_view location) const {
    TakenNames names;
    for (const Inside& one : inside)
        if (one.location == location)
            (one.isAttribute ? names.attributes : names.children).push_back(one.name);
    return names;
}

String suggestionFor(const UntakenNode& node, const TakenNames& names) {
    if (node.name.isNull())
        return nullptr;
    const std::string name = quoted(node.name);
    if (contains(node.isAttribute ? names.children : names.attributes, node.name))
        return "the mapping has " + name +
               (node.isAttribute ? " as a child element" : " as an attribute");
    if (contains(node.isAttribute ? names.attributes : names.children, node.name))
        return node.isAttribute ? "its field took another" : "the mapping takes only one";
    for (const TakenNames::Inside& one : names.inside)
        if (one.name == node.name && one.isAttribute == node.isAttribute)
            return "the mapping looks for " + name + " in " + quoted(one.location);
    for (const String& child : node.children)
        if (contains(names.items, child))
            return "the mapping looks for " + quoted(child) + " beside it: is location=" + name +
                   " missing?";
    return meantFor(node.name, node.isAttribute ? names.attributes : names.children);
}

String suggestedElement(const QXXMLMarshallingMapping& mapping, const String& written) {
    constexpr std::size_t mostListed = 6;
    std::vector<String> names;
    for (const auto& type : mapping.mapping()->classMappings())
        names.push_back(MappingPlan::elementNameOf(*type));
    if (names.empty())
        return "the mapping holds no class";
    if (String near = meantFor(written, names); !near.isNull())
        return near;
    std::string list;
    for (std::size_t i = 0; i < std::min(names.size(), mostListed); ++i)
        list += (i == 0 ? "" : ", ") + quoted(names[i]);
    return "the mapping has " + list + (names.size() > mostListed ? " and others" : "");
}

String suggestedClass(const QXXMLMarshallingMapping& mapping, const String& wanted) {
    NearestName nearest(wanted);
    for (const auto& type : mapping.mapping()->classMappings())
        nearest.consider(type->className());
    return nearest.name().empty() ? String()
                                  : String("did you mean class " + quoted(nearest.name()) + "?");
}

std::string quoted(std::string_view name) {
    constexpr std::size_t longest = 60;
    const std::size_t end = unicode::endOfCharacters(name, longest);
    return "\"" + std::string(name.substr(0, end)) + (end < name.size() ? "..." : "") + "\"";
}

} // namespace qx::detail
