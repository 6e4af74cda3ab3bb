// Mapping documents are read into nodes, refused with exact errors, and printed.

#include "support/Cases.h"
#include "support/Patterns.h"
#include "support/Texts.h"

#include <QXXMLMarshalling/QXXMLDocumentMapping.h>
#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <gtest/gtest.h>

namespace {

using qx::Error;
using qx::Ref;
using qx::String;
using support::parsed;

Ref<QXXMLDocumentMapping> mapping(std::string_view content, Ref<Error>* error = nullptr) {
    const auto document = parsed("<mapping>" + std::string(content) + "</mapping>");
    return QXXMLDocumentMapping::initWithXML(document->rootElement(), error);
}

// The only field of the only class.
Ref<QXXMLFieldMapping> field(std::string_view xml) {
    const auto document = mapping("<class name='C'>" + std::string(xml) + "</class>");
    return document->classMappings().at(0)->fields().at(0);
}

// Each prints as its description, without addresses, or is refused, with a slot for the error or
// without.
const bool added = support::addCases(
    "tests/mapping/mappings.md", {"mapping"}, {"description", "error"}, [](const auto& expected) {
        const std::string& content = expected.given.at("mapping");
        Ref<Error> error;
        const auto document = mapping(content, &error);
        EXPECT_EQ(!document, !mapping(content));
        EXPECT_EQ((document ? support::replaced(document->description().str(), ": 0x[0-9a-f]+", "")
                            : support::told(error)) +
                      "\n",
                  expected.text);
    });

} // namespace

TEST(Mapping, TellsAnEmptyNameFromNone) {
    const auto bare = mapping("<class name='A'/><class name='B' type=''><map-to xml=''/></class>");
    EXPECT_TRUE(bare->classMappings()[0]->mapTo().isNull());
    EXPECT_EQ(bare->classMappings()[1]->mapTo(), "");
    EXPECT_EQ(bare->classMappings()[0]->classNameToInstantiate(), "A");
    EXPECT_EQ(bare->classMappings()[1]->classNameToInstantiate(), "");
}

TEST(Mapping, KnowsTheNodeKindByItsWord) {
    const std::pair<const char*, QXXMLNodeType> cases[] = {
        {"<bind-xml node='Element'/>", QXXMLNodeTypeElement},
        {"<bind-xml node='ATTRIBUTE'/>", QXXMLNodeTypeAttribute},
        {"<bind-xml node='text'/>", QXXMLNodeTypeText},
        {"<bind-xml node='elements'/>", QXXMLNodeTypeUnknown},
        {"<bind-xml/>", QXXMLNodeTypeUnknown},
        {"", QXXMLNodeTypeAttribute},
    };
    for (const auto& [binding, expected] : cases)
        EXPECT_EQ(field("<field name='f'>" + std::string(binding) + "</field>")->nodeType(),
                  expected)
            << binding;
}

TEST(Mapping, KnowsWhereItsNodesStand) {
    auto source = parsed("<mapping>\n <include href='i'/>\n\n <class name='ä'><field name='f'>\n"
                         "<bind-xml/> <alt-xml/></field></class></mapping>");
    source->setDocumentName("maps/orders.xml");
    const auto document = QXXMLDocumentMapping::initWithXML(source->rootElement());
    source = nullptr; // nodes outlive it
    const auto told = [](const QXXMLMappingPlace& place) {
        return place.documentName.str() + ':' + std::to_string(place.line) + ':' +
               std::to_string(place.column);
    };
    const auto& type = *document->classMappings()[0];
    const auto& member = *type.fields()[0];
    EXPECT_EQ(told(document->place()), "maps/orders.xml:1:1");
    EXPECT_EQ(told(document->includePlace(0)), "maps/orders.xml:2:2");
    EXPECT_EQ(told(type.place()), "maps/orders.xml:4:2");
    EXPECT_EQ(told(member.place()), "maps/orders.xml:4:18");
    EXPECT_EQ(told(member.bindToMappings()[1]->place()), "maps/orders.xml:5:13");
    const auto copy = type.copyWithZone().as<QXXMLClassMapping>();
    EXPECT_EQ(told(copy->place()), "maps/orders.xml:4:2");
    EXPECT_EQ(copy->includedFrom().size(), 0U);
    EXPECT_EQ(told(QXXMLMapping::initWithXML(nullptr)->place()), ":0:0");
}

TEST(Mapping, KeepsNoFieldsClassAlive) {
    Ref<QXXMLFieldMapping> kept;
    {
        const auto document = mapping("<class name='C'><field name='f'/></class>");
        kept = document->classMappings()[0]->fields()[0];
        EXPECT_EQ(kept->classMapping(), document->classMappings()[0]);
    }
    EXPECT_FALSE(kept->classMapping());
}

TEST(Mapping, CopiesClassesWithTheirVeryFields) {
    const auto document = mapping("<class name='C' self-first='true'><description>d</description>"
                                  "<map-to xml='c'/><field name='f'/></class>");
    const auto original = document->classMappings()[0];
    original->setMapTo("other");
    const auto copy = original->copyWithZone().as<QXXMLClassMapping>();
    EXPECT_EQ(copy->mapTo(), "other");
    EXPECT_TRUE(copy->isSelfFirst());
    EXPECT_EQ(copy->mappingDescription(), "d");
    EXPECT_EQ(copy->fields(), original->fields());
    EXPECT_EQ(copy->fields()[0]->classMapping(), original);
}

TEST(Mapping, GivesNoCopyOnceTheElementIsFaulty) {
    const auto source = parsed("<field name='f'/>");
    const auto original = QXXMLFieldMapping::initWithXML(source->rootElement());
    EXPECT_FALSE(original->copyWithZone().as<QXXMLFieldMapping>()->classMapping());
    source->rootElement()->removeAttributeForName("name");
    EXPECT_FALSE(original->copyWithZone());
}

TEST(Mapping, MergesClassesAndNothingElse) {
    const auto first = mapping("<include href='i'/><class name='A'/>");
    const auto second = mapping("<include href='j'/><class name='B'/><class name='C'/>");
    first->mergeDocumentMapping(second.get());
    first->mergeDocumentMapping(nullptr);
    ASSERT_EQ(first->classMappings().size(), 3U);
    EXPECT_EQ(first->classMappings()[2], second->classMappings()[1]);
    EXPECT_EQ(first->includes().size(), 1U);
    first->mergeDocumentMapping(first.get());
    EXPECT_EQ(first->classMappings().size(), 6U);
}

TEST(Mapping, TakesNoElementForAnEmptyOne) {
    const auto document = QXXMLDocumentMapping::initWithXML(nullptr);
    EXPECT_TRUE(document->classMappings().empty() && document->includes().empty());
    EXPECT_FALSE(QXXMLClassMapping::initWithXML(nullptr));
}

TEST(Mapping, RefusesNodesNestedByHandDeeperThanTheStack) {
    auto inner = qx::XMLElement::initWithName("class");
    for (int i = 0; i < 20'000; ++i) {
        for (const char* name : {"bind-xml", "field", "class"}) {
            auto outer = qx::XMLElement::initWithName(name);
            outer->addAttribute(qx::XMLNode::attributeWithName("name", "n"));
            outer->addChild(inner);
            inner = outer;
        }
    }
    Ref<Error> error;
    EXPECT_FALSE(QXXMLClassMapping::initWithXML(inner.get(), &error));
    EXPECT_EQ(error->localizedDescription(), "Objects nest deeper than the limit of 1024: field");
}
