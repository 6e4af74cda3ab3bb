#include "marshaller/Suggestion.h"

#include <QXXMLMarshalling/detail/TakenTexts.h>
#include <QXXMLMarshalling/model/Class.h>

#include "base/NearestName.h"
#include "model/Errors.h"
#include "plan/MappingPlan.h"

#include <algorithm>

namespace qx::detail {

namespace {

// They may go in a circle.
constexpr std::size_t mostAncestors = 64;

std::string quoted(std::string_view name) {
    constexpr std::size_t longest = 60;
    return "\"" + std::string(name.substr(0, longest)) + (name.size() > longest ? "..." : "") +
           "\"";
}

std::string_view withoutPrefix(std::string_view name) { return name.substr(name.find(':') + 1); }

bool contains(const std::vector<String>& names, const String& name) {
    return std::ranges::find(names, name) != names.end();
}

// The names that a class and its ancestors have in elements.
struct KnownNames {
    std::vector<String> attributes;
    std::vector<String> children;
};

void addNames(const QXXMLFieldMapping& field, KnownNames& known) {
    for (const auto& binding : field.bindToMappings()) {
        const String& name = binding->bindTo().isEmpty() ? field.name() : binding->bindTo();
        const bool isLocated = !binding->location().isEmpty();
        if (isLocated)
            known.children.push_back(binding->location());
        const bool isCollection = !field.collection().isEmpty();
        if (!isLocated && !isCollection && field.nodeType() != QXXMLNodeTypeElement &&
            field.nodeType() != QXXMLNodeTypeText)
            known.attributes.push_back(name);
        if (!isLocated && (isCollection || field.nodeType() != QXXMLNodeTypeAttribute))
            known.children.push_back(name);
    }
}

KnownNames namesOf(const Failed& failed) {
    KnownNames known;
    const auto* mapping =
        failed.classOfObject != nullptr ? failed.classOfObject : failed.classOfField;
    for (std::size_t i = 0; mapping != nullptr && i < mostAncestors; ++i) {
        for (const auto& field : mapping->fields())
            addNames(*field, known);
        mapping = mapping->extends().isEmpty()
                      ? nullptr
                      : failed.mapping->mappingForClassName(mapping->extends());
    }
    return known;
}

// For a name of the document that the mapping does not have, by those that it has.
String meantFor(const String& written, const std::vector<String>& known) {
    const std::string nearest(nearestName(written.view(), known));
    if (nearest.empty())
        return nullptr;
    if (withoutPrefix(nearest) == withoutPrefix(written.view()))
        return "the document says " + quoted(written.view()) + ", the mapping " + quoted(nearest) +
               ": map the prefix with --prefix";
    return "did you mean " + quoted(nearest) + "?";
}

String forUnknown(const Failed& failed, bool isAttribute) {
    const KnownNames known = namesOf(failed);
    const String name = failed.places.nameOf(failed.number);
    if (name.isNull())
        return nullptr;
    if (contains(isAttribute ? known.children : known.attributes, name))
        return "the mapping has " + quoted(name.view()) +
               (isAttribute ? " as a child element" : " as an attribute");
    if (contains(isAttribute ? known.attributes : known.children, name))
        return "the mapping takes only one";
    return meantFor(name, isAttribute ? known.attributes : known.children);
}

String nearestClass(const Failed& failed, const String& wanted) {
    std::vector<String> names;
    for (const auto& mapping : failed.mapping->mapping()->classMappings())
        names.push_back(mapping->className());
    const std::string nearest(nearestName(wanted.view(), names));
    return nearest.empty() ? String() : String("did you mean class " + quoted(nearest) + "?");
}

String forUnknownCollection(const Failed& failed) {
    constexpr std::string_view words[] = {"array", "vector", "collection", "set"};
    const std::string nearest(
        failed.field != nullptr ? nearestName(failed.field->collection().view(), words) : "");
    return nearest.empty() ? String() : String("did you mean " + quoted(nearest) + "?");
}

// The first that is not there of the classes that the class of the object extends.
String forMissingAncestor(const Failed& failed) {
    const QXXMLClassMapping* mapping = failed.classOfObject;
    for (std::size_t i = 0; i < mostAncestors && !mapping->extends().isEmpty(); ++i) {
        const auto* const parent = failed.mapping->mappingForClassName(mapping->extends());
        if (parent == nullptr)
            return nearestClass(failed, mapping->extends());
        mapping = parent;
    }
    return nullptr;
}

String forUnknownElement(const Failed& failed) {
    if (failed.field == nullptr && failed.classOfObject != nullptr)
        return forMissingAncestor(failed);
    std::vector<String> names;
    for (const auto& mapping : failed.mapping->mapping()->classMappings())
        names.push_back(MappingPlan::elementNameOf(*mapping));
    const String name = failed.places.nameOf(failed.number);
    return name.isNull() ? String() : meantFor(name, names);
}

// What is there, and no field takes, may be what is missing.
String forMissing(const Failed& failed) {
    if (failed.field == nullptr)
        return nullptr;
    KnownNames wanted;
    addNames(*failed.field, wanted);
    const KnownNames known = namesOf(failed);
    const bool isAttribute = !wanted.attributes.empty() && wanted.children.empty();
    auto there = isAttribute ? failed.places.attributesOf(failed.number)
                             : failed.places.childrenOf(failed.number);
    const auto others = isAttribute ? failed.places.childrenOf(failed.number)
                                    : failed.places.attributesOf(failed.number);
    std::erase_if(there, [&](const String& name) {
        return contains(isAttribute ? known.attributes : known.children, name);
    });
    for (const String& name : isAttribute ? wanted.attributes : wanted.children) {
        if (contains(others, name))
            return "the document has " + quoted(name.view()) +
                   (isAttribute ? " as a child element" : " as an attribute");
        const std::string nearest(nearestName(name.view(), there));
        if (!nearest.empty())
            return "the document has " + quoted(nearest) + ": is " + quoted(name.view()) +
                   " meant?";
    }
    return nullptr;
}

// By the type of the member that did not take the text.
String forRefused(const Failed& failed) {
    const Class* const type =
        failed.classOfObject != nullptr
            ? Class::named(failed.classOfObject->classNameToInstantiate().view())
            : nullptr;
    const Property* const property =
        type != nullptr && failed.field != nullptr ? type->property(failed.field->name()) : nullptr;
    if (property == nullptr)
        return type != nullptr && failed.field != nullptr
                   ? String("class " + quoted(type->name().view()) + " has no property " +
                            quoted(failed.field->name().view()))
                   : String();
    const TakenTexts texts = property->texts != nullptr ? property->texts() : TakenTexts();
    const String text = failed.places.textOf(failed.number);
    if (const auto nearest = nearestName(text.view(), texts.words); !nearest.empty())
        return "did you mean " + quoted(nearest) + "?";
    constexpr std::size_t mostListed = 8;
    std::string list;
    for (std::size_t i = 0; i < std::min(texts.words.size(), mostListed); ++i)
        list += (i == 0 ? "" : ", ") + quoted(texts.words[i]);
    if (!list.empty())
        return "it takes " + list + (texts.words.size() > mostListed ? " and others" : "");
    return texts.kind != nullptr ? String(std::string("it takes ") + texts.kind) : String();
}

} // namespace

String suggestionFor(const Failed& failed) {
    if (failed.mapping == nullptr || failed.mapping->mapping() == nullptr)
        return nullptr;
    switch (failed.code) {
    case errors::requiredAttributeMissing.code:
        return forMissing(failed);
    case errors::noMappingForClass.code:
        return failed.field != nullptr ? nearestClass(failed, failed.field->type()) : String();
    case errors::unknownCollectionClass.code:
        return forUnknownCollection(failed);
    case errors::tooManyChildren.code:
        return "collection=\"array\" takes several";
    case errors::noDefinitionForElement.code:
        return forUnknownElement(failed);
    case errors::unknownFields.code:
    case errors::unknownAttributes.code:
        return forUnknown(failed, failed.code == errors::unknownAttributes.code);
    case errors::notAnInteger.code:
        return "it takes a whole number";
    case errors::unableToSetValue.code:
        return forRefused(failed);
    default:
        return nullptr;
    }
}

} // namespace qx::detail
