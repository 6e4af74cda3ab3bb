#include "support/Steps.h"
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
using support::repeated;
using namespace std::string_literals;

// What trees.md does with nodes.
class TreeSteps : public support::Steps {
public:
    TreeSteps() {
        know("parse", [this](auto& words) { document = parsed(words.at(0)); });
        know("new", [this](auto& words) { nodes[words.at(0)] = make(words); });
        know("last", [this](auto& words) {
            nodes[words.at(0)] = Ref<XMLNode>(element(words.at(1)).lastChild());
        });
        know("add", [this](auto& words) { element(words.at(0)).addChild(child(words.at(1))); });
        know("add-to-document", [this](auto& words) { document->addChild(child(words.at(0))); });
        know("insert", [this](auto& words) {
            element(words.at(0)).insertChild(child(words.at(1)), &node(words.at(2)));
        });
        know("add-attribute",
             [this](auto& words) { element(words.at(0)).addAttribute(child(words.at(1))); });
        know("add-namespace",
             [this](auto& words) { element(words.at(0)).addNamespace(child(words.at(1))); });
        know("set-namespaces", [this](auto& words) {
            std::vector<Ref<XMLNode>> declarations;
            for (std::size_t i = 1; i < words.size(); ++i)
                declarations.push_back(child(words[i]));
            element(words.at(0)).setNamespaces(declarations);
        });
        know("set-attribute", [this](auto& words) {
            element(words.at(0)).addAttribute(text(words, 1), text(words, 2));
        });
        know("remove-attribute",
             [this](auto& words) { element(words.at(0)).removeAttributeForName(words.at(1)); });
        know("attribute", [this](auto& words) {
            say(qx::Value(element(words.at(0)).attributeValue(words.at(1))).description().str());
        });
        know("detach", [this](auto& words) { node(words.at(0)).detach(); });
        know("set-text", [this](auto& words) { node(words.at(0)).setStringValue(text(words, 1)); });
        know("text", [this](auto& words) { say(node(words.at(0)).stringValue().str()); });
        know("declare", [this](auto& words) {
            document->setVersion(text(words, 0));
            document->setCharacterEncoding(text(words, 1));
            document->setStandalone(text(words, 2));
        });
        know("show", [this](auto& words) { say(node(words.at(0)).description().str()); });
        know("write", [this](auto& words) { say(node(words.at(0)).XMLString().str()); });
        know("write-compact", [this](auto& words) {
            say(node(words.at(0)).XMLString(qx::XMLCompactEmptyElements).str());
        });
        know("data", [this](auto&) { say(document->XMLData()); });
    }

private:
    static qx::String text(const Arguments& words, std::size_t i) {
        return words.at(i) == "null" ? qx::String() : qx::String(support::unescaped(words[i]));
    }
    static Ref<XMLNode> make(const Arguments& words) {
        const std::string& kind = words.at(1);
        const qx::String first = text(words, 2);
        if (kind == "text")
            return XMLNode::initTextWithStringValue(first);
        if (kind == "comment")
            return XMLNode::initCommentWithStringValue(first);
        if (kind == "element")
            return XMLElement::initWithName(first);
        if (kind == "sized-element")
            return XMLElement::initForAttributes(first, 2);
        if (kind == "attribute")
            return XMLNode::attributeWithName(first, text(words, 3));
        if (kind == "namespace")
            return XMLNode::namespaceWithName(first, text(words, 3));
        return XMLNode::initProcessingInstructionWithName(first, text(words, 3));
    }
    // A node that was named, "document", or the first element of a name.
    XMLNode& node(const std::string& name) const {
        const auto named = nodes.find(name);
        if (named != nodes.end())
            return *named->second;
        XMLNode* const found = name == "document" ? document.get() : find(*document, name);
        return found != nullptr ? *found : throw std::invalid_argument("no node " + name);
    }
    XMLElement& element(const std::string& name) const { return *node(name).asElement(); }
    Ref<XMLNode> child(const std::string& name) const {
        return name == "nothing" ? nullptr : Ref<XMLNode>(&node(name));
    }
    static XMLNode* find(XMLNode& below, std::string_view name) {
        XMLNode* found = nullptr;
        for (XMLNode& each : below.children())
            if (found == nullptr)
                found = each.isElement() && each.name().view() == name ? &each : find(each, name);
        return found;
    }

    Ref<XMLDocument> document;
    std::map<std::string, Ref<XMLNode>> nodes;
};
const bool added = support::addSteps<TreeSteps>("tests/xml/trees.md");

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

TEST(XMLElement, AStringValueMayBeANameOfWhatItReplaces) {
    const auto document = parsed("<a><some-long-name/></a>");
    document->setStringValue(document->rootElement()->firstChild()->name());
    EXPECT_EQ(document->XMLString(), "<a>some-long-name</a>");
}

TEST(XMLElement, APieceOfTextAloneIsSharedAsItsStringValue) {
    const auto document = parsed("<a>shared text</a>");
    const qx::String value = document->stringValue();
    EXPECT_TRUE(value.isSameAs(document->rootElement()->firstChild()->stringValue()));
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
