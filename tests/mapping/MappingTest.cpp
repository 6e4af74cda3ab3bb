// Mapping documents are read into nodes, refused with exact errors, and printed.

#include "support/Texts.h"

#include <QXXMLMarshalling/QXXMLDocumentMapping.h>
#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <gtest/gtest.h>

#include <regex>

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

// The description without addresses.
std::string printed(std::string_view content) {
    return std::regex_replace(mapping(content)->description().str(), std::regex(": 0x[0-9a-f]+"),
                              "");
}

} // namespace

// Single faults are samples of docs/mapping-format.md.
TEST(Mapping, RefusesFaultyDocumentsWithTheFirstFault) {
    const std::pair<const char*, const char*> cases[] = {
        {"<class name='A'/><class name='B'/><class type='C'/><class/>",
         "-202: Required attribute: name not found in element: <class type=\"C\"></class>"},
        {"<class name='A' self-first='yes'><map-to/><map-to/></class>",
         "-203: Boolean attribute: self-first has an illegal value: yes"},
        {"<class name='A'><field/><map-to/><map-to/></class>",
         "-201: Too many map-to elements in element: <class name=\"A\"><field></field>"
         "<map-to></map-to><map-to></map-to></class>"},
        {"<class name='A'><field lazy='no'/></class>",
         "-202: Required attribute: name not found in element: <field lazy=\"no\"></field>"},
        {"<class name='A'><field name='f' lazy=' true' direct='1'/></class>",
         "-203: Boolean attribute: lazy has an illegal value:  true"},
        {"<class name='A'><field name='f'><bind-xml/><bind-xml/><alt-xml/></field></class>",
         "-204: Too many bind-xml elements in element: <field name=\"f\"><bind-xml></bind-xml>"
         "<bind-xml></bind-xml><alt-xml></alt-xml></field>"},
        {"<class name='A'><field name='f'><bind-xml><class/><class/></bind-xml></field></class>",
         "-213: Too many class elements in element: "
         "<bind-xml><class></class><class></class></bind-xml>"},
        {"<class name='A'><field name='f'><bind-xml><class/></bind-xml></field></class>",
         "-202: Required attribute: name not found in element: <class></class>"},
        {"<class name='A'><field name='f'><bind-xml/><alt-xml><description/><description/>"
         "</alt-xml></field></class>",
         "-200: Too many descriptions in element: "
         "<alt-xml><description></description><description></description></alt-xml>"},
    };
    for (const auto& [content, expected] : cases) {
        Ref<Error> error;
        EXPECT_FALSE(mapping(content, &error)) << content;
        EXPECT_EQ(support::told(error), std::string(expected) + " (Invalid XML)");
        EXPECT_FALSE(mapping(content)) << "without a slot: " << content;
    }
}

TEST(Mapping, ReadsAndPrintsWhatIsThere) {
    const std::pair<const char*, const char*> cases[] = {
        {"<include href='b'/><class name='A'/><include/><other/><include href='b'/>"
         "<class name='B' type=''><map-to xml=''/></class><include href=''/>",
         "<QXXMLDocumentMapping> includes: ( b, b, ) classes: ( <QXXMLClassMapping> class: A, "
         "<QXXMLClassMapping> class: B )"},
        {"<class name='C'><field name='f'/><field name='g' container='FALSE' "
         "transient='tRuE'/></class>",
         "<QXXMLDocumentMapping> classes: ( <QXXMLClassMapping> class: C fields: ( "
         "<QXXMLFieldMapping> name: f container: true, "
         "<QXXMLFieldMapping> name: g transient: true ) )"},
        {"<class name='C'><field name='f'><bind-xml name='a'/><alt-xml name='b' location='l' "
         "node='text' type='t'><class/><class/></alt-xml><alt-xml/></field></class>",
         "<QXXMLDocumentMapping> classes: ( <QXXMLClassMapping> class: C fields: ( "
         "<QXXMLFieldMapping> name: f container: true bindTo: ( <QXXMLBindToMapping> bindTo: a, "
         "<QXXMLBindToMapping> bindTo: b location: l, <QXXMLBindToMapping> ) ) )"},
        {"<description>all</description><include href='i'/>"
         "<class name='C' extends='B' type='T' auto-complete='true'><description/>"
         "<map-to xml='c' ns-uri='u' ns-prefix='p'/>"
         "<field name='f' type='t' handler='h' get-method='g' set-method='s' create-method='m' "
         "collection='set' required='true' direct='true' lazy='true' transient='true'>"
         "<bind-xml name='n' type='t' node='text' location='l' references='r' matches='m' "
         "QName-prefix='q' auto-naming='a'><class name='N'/></bind-xml><alt-xml name='x'/></field>"
         "</class>",
         "<QXXMLDocumentMapping> description: all includes: ( i ) classes: ( <QXXMLClassMapping> "
         "class: C map-to: c ns-prefix: p ns-uri: u extends: B type: T fields: ( "
         "<QXXMLFieldMapping> name: f type: t handler: h get-method: g set-method: s "
         "create-method: m collection: set required: true direct: true lazy: true container: true "
         "transient: true bindTo: ( <QXXMLBindToMapping> bindTo: n type: t node: text location: l "
         "references: r matches: m QName-prefix: q auto-naming: a childClassMapping: "
         "<QXXMLClassMapping> class: N, <QXXMLBindToMapping> bindTo: x ) ) )"},
    };
    for (const auto& [content, expected] : cases)
        EXPECT_EQ(std::regex_replace(printed(content), std::regex("\\s+"), " "), expected);
    EXPECT_EQ(printed("<class name='C'><field name='f'><bind-xml><class name='N'/></bind-xml>"
                      "<alt-xml name='x'/></field></class>"),
              "<QXXMLDocumentMapping> classes:\n"
              "(\n"
              "    <QXXMLClassMapping> class: C fields:\n"
              "    (\n"
              "        <QXXMLFieldMapping> name: f container: true bindTo:\n"
              "        (\n"
              "            <QXXMLBindToMapping> childClassMapping:\n"
              "<QXXMLClassMapping> class: N,\n"
              "            <QXXMLBindToMapping> bindTo: x\n"
              "        )\n"
              "    )\n"
              ")");
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
