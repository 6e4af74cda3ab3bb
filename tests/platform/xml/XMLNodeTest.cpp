#include <QXXMLMarshalling/platform/Exception.h>
#include <QXXMLMarshalling/platform/XMLDocument.h>

#include <gtest/gtest.h>
#include <thread>

namespace {

using qx::Ref;
using qx::XMLDocument;
using qx::XMLElement;
using qx::XMLNode;

Ref<XMLDocument> parsed(std::string_view text, const qx::XMLParseOptions& options = {}) {
    Ref<qx::Error> error;
    auto document = XMLDocument::initWithData(text, options, &error);
    EXPECT_TRUE(document) << (error ? error->description().str() : "no error");
    return document;
}

TEST(XMLNode, NamesAndValuesFollowTheKind) {
    const auto document = parsed("<p:a xmlns:p='urn:x' b='1'>t<!--c--><?go fast?></p:a>");
    XMLElement& root = *document->rootElement();
    EXPECT_EQ(root.name(), "p:a");
    EXPECT_EQ(root.namespaces().begin()->name(), "p");
    EXPECT_EQ(root.namespaces().begin()->stringValue(), "urn:x");
    EXPECT_EQ(root.attributeForName("b")->stringValue(), "1");
    const XMLNode* text = root.firstChild();
    EXPECT_TRUE(text->name().isNull());
    EXPECT_EQ(text->stringValue(), "t");
    EXPECT_TRUE(text->nextSibling()->name().isNull());
    EXPECT_EQ(root.lastChild()->name(), "go");
    EXPECT_EQ(root.lastChild()->stringValue(), "fast");
    EXPECT_EQ(root.childCount(), 3U);
    EXPECT_EQ(text->rootDocument(), document.get());
}

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

TEST(XMLNode, AMovedNodeStaysTheSameAndLeavesItsOldPlace) {
    const auto from = parsed("<a><b/><c/><d/></a>");
    const auto to = parsed("<x/>");
    for (const char* name : {"c", "b", "d"}) {
        const Ref<XMLNode> node(from->rootElement()->elementsForName(name).at(0));
        node->detach();
        EXPECT_EQ(node->previousSibling(), nullptr);
        to->rootElement()->addChild(node);
        EXPECT_EQ(node->rootDocument(), to.get());
    }
    EXPECT_EQ(from->XMLString(), "<a></a>");
    EXPECT_EQ(to->XMLString(), "<x><c></c><b></b><d></d></x>");
    EXPECT_EQ(from->rootElement()->lastChild(), nullptr);
    EXPECT_EQ(to->rootElement()->lastChild()->previousSibling()->name(), "b");
}

TEST(XMLNode, SiblingsAreLinkedBothWaysAfterEachInsertionAndRemoval) {
    const auto element = XMLElement::initWithName("a");
    const auto add = [&](const char* name, XMLNode* before) {
        element->insertChild(XMLElement::initWithName(name), before);
        return before != nullptr ? before->previousSibling() : element->lastChild();
    };
    XMLNode* m = add("m", nullptr);
    XMLNode* z = add("z", nullptr);
    add("c", m);
    XMLNode* p = add("p", z);
    const auto bothWays = [&] {
        std::string forth;
        std::string back;
        for (const XMLNode& child : element->children())
            forth += child.name().view();
        for (const XMLNode* child = element->lastChild(); child != nullptr;
             child = child->previousSibling())
            back.insert(0, child->name().view());
        EXPECT_EQ(forth, back);
        return forth;
    };
    EXPECT_EQ(bothWays(), "cmpz");
    p->detach();
    EXPECT_EQ(bothWays(), "cmz");
    z->detach();
    EXPECT_EQ(bothWays(), "cm");
    element->firstChild()->detach();
    EXPECT_EQ(bothWays(), "m");
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
    std::string text;
    for (std::size_t i = 0; i < depth; ++i)
        text += "<a>";
    text += "x";
    for (std::size_t i = 0; i < depth; ++i)
        text += "</a>";
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

TEST(XMLElement, ItsStringValueIsAllTextInside) {
    const std::pair<const char*, const char*> cases[] = {
        {"<a/>", ""},
        {"<a>x</a>", "x"},
        {"<a>x<b>y<c/></b><!--no--><?no no?>z</a>", "xyz"},
        {"<a><b><c>deep</c></b></a>", "deep"}};
    for (const auto& [text, value] : cases) {
        const auto document = parsed(text);
        EXPECT_EQ(document->rootElement()->stringValue(), value) << text;
        EXPECT_FALSE(document->rootElement()->stringValue().isNull()) << text;
    }
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
