#pragma once

// What the tables of scenarios run through: a marshaller from mapping text, and an object or an
// error as one text.
//
// A mapping may be written in short: its elements are classes, those in them fields, each with the
// attributes of its <map-to> or <bind-xml> among its own. Names of the mapping language stand as
// they are. These two say the same:
//
//     <Order xml='order'><lines type='Line' collection='array' name='line' location='all'/></Order>
//
//     <class name='Order'><map-to xml='order'/><field name='lines' type='Line' collection='array'>
//     <bind-xml name='line' location='all'/></field></class>

#include <QXXMLMarshalling/QXXMLMarshaller.h>

#include "support/Show.h"
#include "support/Texts.h"

#include <gtest/gtest.h>

#include <set>

namespace scenario {

// How a marshaller is set up: as it is made, or with some options off.
enum Options : unsigned { usual = 0, strict = 1, discard = 2, noNamespaces = 4 };

// An element of a mapping, written in full.
inline qx::Ref<qx::XMLNode> spelledOut(const qx::XMLElement& element, bool isClass) {
    static const std::set<std::string> words = {"class",  "description", "include",
                                                "map-to", "field",       "alt-xml"};
    static const std::set<std::string> ofBinding = {"xml",  "ns-uri", "ns-prefix",
                                                    "name", "node",   "location"};
    if (words.contains(element.name().str()))
        return element.copy();
    const auto whole = qx::XMLElement::initWithName(isClass ? "class" : "field");
    const auto binding = qx::XMLElement::initWithName(isClass ? "map-to" : "bind-xml");
    whole->addAttribute("name", element.name());
    for (const qx::XMLNode& attribute : element.attributes())
        (ofBinding.contains(attribute.name().str()) ? binding : whole)
            ->addAttribute(attribute.name(), attribute.stringValue());
    if (!isClass || !binding->attributes().empty())
        whole->addChild(binding);
    for (const qx::XMLNode& child : element.children())
        whole->addChild(spelledOut(*child.asElement(), false));
    return whole;
}

inline qx::Ref<QXXMLMarshaller> marshaller(std::string_view mapping, unsigned options = usual) {
    qx::Ref<qx::Error> error;
    const auto brief = qx::XMLDocument::initWithData(
        "<mapping>" + std::string(mapping) + "</mapping>", {}, &error);
    EXPECT_TRUE(brief) << error->description().view();
    const auto root = qx::XMLElement::initWithName("mapping");
    for (const qx::XMLNode& type : brief->rootElement()->children())
        root->addChild(spelledOut(*type.asElement(), true));
    const auto document = qx::XMLDocument::initWithRootElement(root);
    auto made = QXXMLMarshaller::initWithMappingXML(document.get(), &error);
    EXPECT_TRUE(made) << (error ? error->description().view() : "no error");
    made->setLenient((options & strict) == 0);
    made->setSaveUnknownXML((options & discard) == 0);
    made->setUsingNamespaceURIs((options & noNamespaces) == 0);
    return made;
}

using support::repeated;
using support::told;

// The object that the document gives, or the error.
inline std::string read(QXXMLMarshaller& marshaller, std::string_view document) {
    qx::Ref<qx::Error> error;
    const auto object = marshaller.readString(document, &error);
    EXPECT_FALSE(object && error) << "both an object and an error";
    return error ? told(error) : support::show(object);
}

// The object's root element, or the error.
inline std::string write(QXXMLMarshaller& marshaller, const qx::Value& object) {
    qx::Ref<qx::Error> error;
    const auto element = marshaller.marshallObject(object, &error);
    EXPECT_FALSE(element && error) << "both an element and an error";
    return error ? told(error) : element ? element->XMLString().str() : "null";
}

// Elements in one another.
inline std::string nested(const std::string& name, std::size_t depth,
                          const std::string& innermost = "") {
    return repeated("<" + name + ">", depth) + innermost + repeated("</" + name + ">", depth);
}

} // namespace scenario
