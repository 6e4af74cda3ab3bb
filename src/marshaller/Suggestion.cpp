#include "marshaller/Suggestion.h"

#include <QXXMLMarshalling/detail/TakenTexts.h>
#include <QXXMLMarshalling/model/Class.h>

#include "base/NearestName.h"
#include "marshaller/TakenNames.h"
#include "model/Errors.h"
#include "plan/MappingPlan.h"

#include <algorithm>

namespace qx::detail {

namespace {

// They may go in a circle.
constexpr std::size_t mostAncestors = 64;

bool contains(const std::vector<String>& names, const String& name) {
    return std::ranges::find(names, name) != names.end();
}

// What the class of the object takes, or that which has the field.
TakenNames namesOf(const Failed& failed) {
    const auto* const type =
        failed.classOfObject != nullptr ? failed.classOfObject : failed.classOfField;
    const ClassPlan* const plan =
        type != nullptr ? MappingPlan::of(failed.mapping).planOf(*type) : nullptr;
    return plan != nullptr ? TakenNames::of(*plan) : TakenNames();
}

String forUnknown(const Failed& failed, bool isAttribute) {
    const DocumentPlaces& places = failed.places;
    auto children = isAttribute ? std::vector<String>() : places.childrenOf(failed.number);
    return suggestionFor({places.nameOf(failed.number), isAttribute, std::move(children)},
                         namesOf(failed));
}

String forUnknownCollection(const Failed& failed) {
    constexpr std::string_view words[] = {"array", "vector", "collection", "set"};
    const std::string nearest(
        failed.field != nullptr ? nearestName(failed.field->collection().view(), words) : "");
    return "did you mean " + quoted(nearest.empty() ? words[0] : nearest) + "?";
}

// The first that is not there of the classes that the class of the object extends.
String forMissingAncestor(const Failed& failed) {
    const QXXMLClassMapping* mapping = failed.classOfObject;
    for (std::size_t i = 0; i < mostAncestors && !mapping->extends().isEmpty(); ++i) {
        const auto* const parent = failed.mapping->mappingForClassName(mapping->extends());
        if (parent == nullptr)
            return suggestedClass(*failed.mapping, mapping->extends());
        mapping = parent;
    }
    return nullptr;
}

String forUnknownElement(const Failed& failed) {
    if (failed.field == nullptr && failed.classOfObject != nullptr)
        return forMissingAncestor(failed);
    const String name = failed.places.nameOf(failed.number);
    return name.isNull() ? String() : suggestedElement(*failed.mapping, name);
}

// What is there, and no field takes, may be what is missing.
String forMissing(const Failed& failed) {
    const FieldPlan* const field =
        failed.field != nullptr ? MappingPlan::of(failed.mapping).planOf(*failed.field) : nullptr;
    if (field == nullptr)
        return nullptr;
    TakenNames wanted = TakenNames::of(*field);
    TakenNames known = namesOf(failed);
    const String around = failed.places.nameOf(failed.number);
    if (TakenNames inside = wanted.in(around); !inside.isEmpty()) { // the wrapper is there
        wanted = std::move(inside);
        known = known.in(around);
    }
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
        return failed.field != nullptr ? suggestedClass(*failed.mapping, failed.field->type())
                                       : String();
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
