#include "Text.h"
#include "support/Texts.h"

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <ctime>
#include <functional>
#include <gtest/gtest.h>
#include <thread>

namespace {

using qx::Ref;
using qx::XMLDocument;
using qx::XMLElement;
using qx::XMLNode;
using support::parsed;
using namespace std::string_literals;

TEST(XMLNode, AKeptNodeOutlivesItsDocument) {
    auto document = parsed("<a><b c='1'>text</b></a>");
    const Ref<XMLNode> kept(document->rootElement()->firstChild());
    const Ref<XMLNode> attribute(kept->asElement()->attributeForName("c"));
    document.reset();
    EXPECT_EQ(kept->parent(), nullptr);
    EXPECT_EQ(kept->rootDocument(), nullptr);
    EXPECT_EQ(kept->XMLString(), "<b c=\"1\">text</b>");
    EXPECT_EQ(attribute->parent(), kept.get());
}

// The names of an element's children, walked forth and back.
std::string childrenOf(const XMLElement& element) {
    std::string forth, back;
    for (const XMLNode& child : element.children())
        forth += child.name().view();
    for (const XMLNode* child = element.lastChild(); child; child = child->previousSibling())
        back.insert(0, child->name().view());
    EXPECT_EQ(forth, back);
    return forth;
}

TEST(XMLNode, AMovedNodeStaysTheSameAndIsLinkedBothWays) {
    const auto from = parsed("<a><b/><c/><d/><e/></a>"), to = parsed("<x/>");
    XMLElement& source = *from->rootElement();
    XMLElement& target = *to->rootElement();
    const struct {
        const char *moved, *before;
        const char *sourceAfter, *targetAfter;
    } steps[] = {{"c", nullptr, "bde", "c"},
                 {"e", "c", "bd", "ec"},
                 {"b", "c", "d", "ebc"},
                 {"d", nullptr, "", "ebcd"}};
    for (const auto& step : steps) {
        const Ref<XMLNode> node(source.elementsForName(step.moved).at(0));
        node->detach();
        EXPECT_EQ(node->previousSibling(), nullptr);
        target.insertChild(node, step.before ? target.elementsForName(step.before)[0] : nullptr);
        EXPECT_EQ(node->rootDocument(), to.get());
        EXPECT_EQ(childrenOf(source), step.sourceAfter);
        EXPECT_EQ(childrenOf(target), step.targetAfter);
    }
}

TEST(XMLNode, ACopyIsDeepKeepsPositionsAndSharesNoNode) {
    constexpr std::string_view text =
        "<a xmlns=\"u\" b=\"1\">x<c d=\"2\"><e></e>\n</c>y<f><!--g--></f><?h i?></a>";
    const auto document = parsed(text, {.keepWhiteSpace = true});
    const Ref<XMLNode> copy = document->copy();
    const Ref<XMLNode> inner = document->rootElement()->elementsForName("c").at(0)->copy();
    EXPECT_EQ(inner->parent(), nullptr);
    EXPECT_EQ(inner->column(), 21U);
    document->rootElement()->setStringValue("gone");
    EXPECT_EQ(copy->XMLString().view(), text);
    EXPECT_EQ(inner->XMLString(), "<c d=\"2\"><e></e>\n</c>");
}

TEST(XMLNode, NoDepthNeedsStack) {
    constexpr std::size_t depth = 100'000;
    const std::string text = repeated("<a>", depth) + "x" + repeated("</a>", depth);
    auto document = parsed(text, {.maximumDepth = depth});
    const Ref<XMLNode> copy = document->copy();
    EXPECT_EQ(document->stringValue(), "x");
    document.reset();
    EXPECT_EQ(copy->XMLString().view(), text);
    EXPECT_TRUE(
        copy->XMLString(qx::XMLPrettyPrint).view().starts_with("<a>\n    <a>\n        <a>"));
}

TEST(XMLNode, WhatCannotBeAChildRaises) {
    const auto document = parsed("<a><b/></a>");
    XMLElement& root = *document->rootElement();
    XMLElement& inner = *root.firstChild()->asElement();
    const auto loose = XMLElement::initWithName("loose");
    loose->addChild(XMLElement::initWithName("below"));
    XMLElement& below = *loose->firstChild()->asElement();
    const Ref<XMLNode> bad[] = {Ref<XMLNode>(&inner),
                                Ref<XMLNode>(&root),
                                document,
                                XMLNode::attributeWithName("x", "y"),
                                XMLNode::namespaceWithName("x", "y"),
                                Ref<XMLNode>()};
    for (const Ref<XMLNode>& node : bad)
        EXPECT_THROW(inner.addChild(node), qx::Exception);
    EXPECT_THROW(below.addChild(loose), qx::Exception);
    EXPECT_THROW(loose->addChild(loose), qx::Exception);
    EXPECT_THROW(loose->insertChild(XMLElement::initWithName("x"), &inner), qx::Exception);
    EXPECT_THROW(document->addChild(XMLElement::initWithName("second")), qx::Exception);
    EXPECT_THROW(document->addChild(XMLNode::initTextWithStringValue("t")), qx::Exception);
    EXPECT_EQ(document->XMLString(), "<a><b></b></a>");
}

TEST(XMLElement, AnAttributeThatIsThereKeepsItsValue) {
    const auto element = XMLElement::initWithName("a");
    element->addAttribute(XMLNode::attributeWithName("b", "1"));
    element->addAttribute(XMLNode::attributeWithName("c", "2"));
    const Ref<XMLNode> second = XMLNode::attributeWithName("b", "3");
    element->addAttribute(second);
    EXPECT_EQ(second->parent(), nullptr);
    EXPECT_EQ(element->XMLString(), "<a b=\"1\" c=\"2\"></a>");
    EXPECT_THROW(element->addAttribute(Ref<XMLNode>(element->attributeForName("b"))),
                 qx::Exception);
    EXPECT_THROW(element->addAttribute(XMLNode::namespaceWithName("b", "3")), qx::Exception);
    element->removeAttributeForName("b");
    element->removeAttributeForName("nothing");
    EXPECT_EQ(element->XMLString(), "<a c=\"2\"></a>");
}

TEST(XMLElement, AttributesAreTheSameWithAndWithoutNodes) {
    std::string many = "<a";
    for (int i = 0; i < 40; ++i)
        many += " n" + std::to_string(i) + "=\"" + std::to_string(i) + "\"";
    for (const std::string& text : {"<a b=\"1\" c=\"\"></a>"s, many + "></a>"}) {
        const auto document = parsed(text);
        const auto made = XMLElement::initForAttributes("a", 32);
        for (const XMLNode& attribute : document->rootElement()->attributes())
            made->addAttribute(attribute.name(), attribute.stringValue());
        XMLElement& held = *made;
        const Ref<XMLNode> copied = held.copy();
        std::string seen = "<a";
        held.forEachAttribute([&](const qx::String& name, const qx::String& value) {
            EXPECT_TRUE(name != "n7" || held.attributeForName("n39")); // makes nodes of all
            seen += " " + name.str() + "=\"" + value.str() + "\"";
        });
        EXPECT_EQ(seen + "></a>", text);
        EXPECT_EQ(held.XMLString().view(), text);
        std::string spelledOut = "<a";
        for (const XMLNode& attribute : held.attributes()) {
            EXPECT_EQ(attribute.parent(), &held);
            spelledOut += " " + attribute.XMLString().str();
        }
        EXPECT_EQ(spelledOut + "></a>", text);
        EXPECT_EQ(held.XMLString().view(), text);
        EXPECT_EQ(copied->XMLString().view(), text);
    }
}

TEST(XMLElement, AttributesByNameAndValueNeedNoNodes) {
    const auto element = XMLElement::initForAttributes("a", 2);
    element->addAttribute("b", "1");
    element->addAttribute("b", "2");
    EXPECT_EQ(element->attributeValue("b"), "1");
    EXPECT_TRUE(element->attributeValue("c").isNull());
    element->addAttribute("c", nullptr);
    element->addAttribute("d", "\x1F");
    EXPECT_EQ(element->description(), "<a b=\"1\" c=\"\" d=\"\x1F\"></a>");
    EXPECT_EQ(support::raised([&] { static_cast<void>(element->XMLString()); }),
              "NSInvalidArgumentException: a text holds a control character at /a/@d");
    element->removeAttributeForName("d");
    EXPECT_EQ(element->XMLString(), "<a b=\"1\" c=\"\"></a>");
    EXPECT_EQ(element->attributeForName("d"), nullptr);
    const auto nameless = XMLElement::initForAttributes("a", 2);
    nameless->addAttribute(nullptr, "1");
    nameless->addAttribute(nullptr, "2");
    EXPECT_EQ(nameless->description(), "<a =\"1\"></a>");
}

TEST(XMLElement, VeryManyAttributesAndNamespacesTakeNoLongerEach) {
    constexpr int count = 40'000;
    const std::clock_t start = std::clock();
    const auto element = XMLElement::initWithName("a");
    std::vector<Ref<XMLNode>> declarations;
    const auto name = [](int i) { return "n" + std::to_string(i % count); };
    for (int i = 0; i < count + 100; ++i) { // the last ones are there already
        element->addAttribute(name(i), std::to_string(i));
        element->addNamespace(XMLNode::namespaceWithName(name(i), std::to_string(i)));
        declarations.push_back(XMLNode::namespaceWithName(name(i), "set"));
    }
    const Ref<XMLElement> copied(element->copy()->asElement());
    element->setNamespaces(declarations);
    for (const Ref<XMLElement>& one : {element, copied}) {
        int at = 0;
        for (const XMLNode& attribute : one->attributes())
            EXPECT_EQ(attribute.stringValue().view(), std::to_string(at++));
        for (const XMLNode& declaration : one->namespaces()) {
            const std::string value = one == element ? "set" : std::to_string(at - count);
            EXPECT_TRUE(declaration.stringValue().view() == value && ++at > 0);
        }
        EXPECT_EQ(at, 2 * count);
        for (int i = 0; i < count; ++i) {
            EXPECT_EQ(one->attributeValue(name(i)).view(), std::to_string(i));
            one->removeAttributeForName(name(i));
            EXPECT_TRUE(one->attributeValue(name(i)).isNull());
        }
        EXPECT_TRUE(one->attributes().empty());
        one->addAttribute("n7", "again");
        EXPECT_EQ(one->attributeForName("n7")->stringValue(), "again");
    }
    element->setNamespaces({});
    element->addNamespace(XMLNode::namespaceWithName("n7", "again"));
    EXPECT_EQ(element->XMLString(), "<a xmlns:n7=\"again\" n7=\"again\"></a>");
    EXPECT_LT(std::clock() - start, 15 * CLOCKS_PER_SEC);
}

TEST(XMLElement, TheFirstOfTwoEqualPrefixesWins) {
    const auto element = XMLElement::initWithName("a");
    element->addNamespace(XMLNode::namespaceWithName("old", "urn:old"));
    const Ref<XMLNode> both = XMLNode::namespaceWithName("q", "urn:q");
    const Ref<XMLNode> set[] = {XMLNode::namespaceWithName("p", "urn:1"), both, both,
                                XMLNode::namespaceWithName("p", "urn:2"),
                                XMLNode::namespaceWithName("", "urn:3")};
    element->setNamespaces(set);
    EXPECT_EQ(element->XMLString(), "<a xmlns:p=\"urn:1\" xmlns:q=\"urn:q\" xmlns=\"urn:3\"></a>");
    const Ref<XMLNode> bad[] = {XMLNode::namespaceWithName("r", "urn:4"), both};
    EXPECT_THROW(element->setNamespaces(bad), qx::Exception);
    EXPECT_EQ(element->namespaces().begin()->name(), "p");
}

TEST(XMLElement, ItsStringValueIsAllTextInsideAndAPieceAloneIsShared) {
    const std::pair<const char*, const char*> cases[] = {
        {"<a/>", ""},
        {"<a>x<b>y<c/></b><!--no--><?no no?>z</a>", "xyz"},
        {"<a><b><c>deep</c></b></a>", "deep"}};
    for (const auto& [text, value] : cases)
        EXPECT_EQ(parsed(text)->rootElement()->stringValue(), value) << text;
    const auto document = parsed("<a>shared text</a>");
    const qx::String value = document->stringValue();
    EXPECT_TRUE(value.isSameAs(document->rootElement()->firstChild()->stringValue()));
}

TEST(XMLElement, SettingItsStringValueReplacesTheContent) {
    const auto document = parsed("<a b='1'><c/>x</a>");
    document->setStringValue("<&");
    EXPECT_EQ(document->XMLString(), "<a b=\"1\">&lt;&amp;</a>");
    document->rootElement()->setStringValue(nullptr);
    EXPECT_EQ(document->XMLString(), "<a b=\"1\"></a>");
    EXPECT_EQ(document->rootElement()->childCount(), 0U);
    document->rootElement()->addChild(XMLElement::initWithName("some-long-name"));
    document->setStringValue(document->rootElement()->firstChild()->name()); // of what goes
    EXPECT_EQ(document->XMLString(), "<a b=\"1\">some-long-name</a>");
}

TEST(XMLElement, AnOnlyTextIsAChildLikeAnyOther) {
    const auto document = parsed("<a><b>one</b><c>two</c></a>");
    auto* b = document->rootElement()->firstChild()->asElement();
    EXPECT_EQ(document->stringValue(), "onetwo");
    EXPECT_EQ(b->childCount(), 1U);
    b->insertChild(XMLElement::initWithName("i"), b->lastChild());
    EXPECT_EQ(document->XMLString(), "<a><b><i></i>one</b><c>two</c></a>");
    const Ref<XMLNode> text(b->lastChild());
    text->detach();
    EXPECT_EQ(text->stringValue(), "one");
    EXPECT_EQ(document->copy()->XMLString(), "<a><b><i></i></b><c>two</c></a>");
}

TEST(XMLNode, NodesMayDieOnAnotherThread) {
    std::vector<Ref<XMLNode>> nodes;
    std::thread maker([&] {
        for (int i = 0; i < 5000; ++i)
            nodes.push_back(XMLNode::initTextWithStringValue(std::to_string(i)));
    });
    maker.join();
    EXPECT_EQ(nodes.back()->stringValue(), "4999");
    std::thread([&] { nodes.erase(nodes.begin(), nodes.end() - 1); }).join();
    EXPECT_EQ(nodes.back()->stringValue(), "4999");
}

} // namespace
