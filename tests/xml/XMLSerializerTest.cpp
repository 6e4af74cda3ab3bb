#include "support/Texts.h"

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <functional>
#include <gtest/gtest.h>

namespace {

using qx::Ref;
using qx::XMLDocument;
using qx::XMLElement;
using qx::XMLNode;
using namespace std::string_literals;

std::string utf8(char32_t c) {
    const auto byte = [](char32_t bits) { return static_cast<char>(bits); };
    if (c < 0x80)
        return {byte(c)};
    if (c < 0x800)
        return {byte(0xC0 | c >> 6), byte(0x80 | (c & 0x3F))};
    if (c < 0x10000)
        return {byte(0xE0 | c >> 12), byte(0x80 | (c >> 6 & 0x3F)), byte(0x80 | (c & 0x3F))};
    return {byte(0xF0 | c >> 18), byte(0x80 | (c >> 12 & 0x3F)), byte(0x80 | (c >> 6 & 0x3F)),
            byte(0x80 | (c & 0x3F))};
}

// <a b="text">text</a>
Ref<XMLDocument> holding(const std::string& text) {
    const auto root = XMLElement::initWithName("a", text);
    root->addAttribute(XMLNode::attributeWithName("b", text));
    return XMLDocument::initWithRootElement(root);
}

void expectReadBack(const std::string& text, const std::string& bytes) {
    const auto read = XMLDocument::initWithData(bytes);
    ASSERT_TRUE(read) << bytes;
    const XMLElement& root = *read->rootElement();
    EXPECT_TRUE(root.stringValue().view() == text) << bytes.substr(0, 200);
    EXPECT_TRUE(root.attributeForName("b")->stringValue().view() == text) << bytes.substr(0, 200);
}

TEST(XMLSerializer, EachCharacterThatXMLAllowsIsReadBackAndNoOtherIsWritten) {
    std::string all;
    for (char32_t c = 0; c <= 0x10FFFF; ++c) {
        const bool isAllowed = c == 9 || c == 10 || c == 13 || (c >= 0x20 && c < 0xD800) ||
                               (c >= 0xE000 && c <= 0xFFFD) || c >= 0x10000;
        // Each of the first, and those at the ends of the allowed ranges, stand alone too.
        const bool isNotable = c < 0x100 || (c >= 0xD7F0 && c <= 0xE010) ||
                               (c >= 0xFFF0 && c <= 0x10010) || c >= 0x10FFF0;
        if (isAllowed)
            all += utf8(c);
        if (!isNotable)
            continue;
        const auto document = holding(utf8(c));
        if (isAllowed)
            expectReadBack(utf8(c), document->XMLData());
        else
            EXPECT_THROW(document->XMLData(), qx::Exception) << static_cast<std::uint32_t>(c);
    }
    expectReadBack(all, holding(all)->XMLData());
}

TEST(XMLSerializer, TextsThatAParserWouldChangeAreReadBack) {
    for (const char* text : {"]]>", "&amp;", "<![CDATA[x]]>", "\r\n", "\n", " \n ", "\t", " a ",
                             "\n\na", "&#10;", "\"'"}) {
        const auto document = holding(text);
        expectReadBack(text, document->XMLData());
        expectReadBack(text, document->XMLData(qx::XMLPrettyPrint));
        document->rootElement()->addChild(XMLElement::initWithName("c"));
        expectReadBack(text, document->XMLData());
    }
}

// Rows make <a> with as much in it as may be read, or one more. Lower limits: documents.md.
TEST(XMLSerializer, WhatIsBeyondALimitOfReadingIsNotWritten) {
    const auto x = [](std::size_t size) { return std::string(size, 'x'); };
    const auto number = [](std::size_t i) { return "n" + std::to_string(i); };
    const auto nested = [](XMLElement& a, std::size_t depth) {
        Ref<XMLElement> inner = XMLElement::initWithName("b", "text");
        for (std::size_t i = 2; i < depth; ++i) {
            auto outer = XMLElement::initWithName("b");
            outer->addChild(inner);
            inner = outer;
        }
        a.addChild(inner);
    };
    const auto declared = [&](XMLElement& element, std::size_t from, std::size_t to) {
        for (std::size_t i = from; i < to; ++i)
            element.addNamespace(XMLNode::namespaceWithName(number(i), "u"));
    };
    const struct {
        const char* reason;
        std::function<void(XMLElement& a, std::size_t extra)> fill;
    } rows[] = {
        {"elements nest deeper than the limit of 256",
         [&](auto& a, auto extra) { nested(a, 256 + extra); }},
        {"an element has more attributes than the limit of 4096",
         [&](auto& a, auto extra) {
             declared(a, 0, 96);
             for (std::size_t i = 0; i < 4000 + extra; ++i)
                 a.addAttribute(number(i), "value");
         }},
        {"more namespace declarations are in force than the limit of 1000",
         [&](auto& a, auto extra) {
             declared(a, 0, 600);
             a.addAttribute("xmlns:p", "u");
             for (int i = 0; i < 3; ++i) { // one beside the other
                 auto b = XMLElement::initWithName("b");
                 declared(*b, 600, 999 + extra);
                 a.addChild(b);
             }
         }},
        {"an attribute's value is larger than the limit of 10000000",
         [&](auto& a, auto extra) { a.addAttribute("b", x(10'000'000 + extra)); }},
        {"the document has more different names than the limit of 100000",
         [&](auto& a, auto extra) {
             a.addNamespace(XMLNode::namespaceWithName("p", "u"));
             for (std::size_t i = 0; i < 100'000 - 3 + extra; ++i)
                 a.addChild(XMLElement::initWithName(number(i)));
             a.addChild(XMLElement::initWithName(number(7)));
         }},
    };
    for (const auto& row : rows)
        for (const std::size_t extra : {0, 1}) {
            const auto document = XMLDocument::initWithRootElement(XMLElement::initWithName("a"));
            row.fill(*document->rootElement(), extra);
            Ref<qx::Error> error;
            const auto read = XMLDocument::initWithData(
                document->XMLString(qx::XMLCompactEmptyElements), {}, &error);
            EXPECT_EQ(read.get() != nullptr, extra == 0)
                << row.reason << (error ? error->localizedDescription().str() : "");
            const std::string outcome = support::raised([&] {
                static_cast<void>(document->XMLData(qx::XMLPrettyPrint));
                static_cast<void>(document->XMLString());
            });
            const std::string refusal = "NSInvalidArgumentException: "s + row.reason + " at ";
            EXPECT_EQ(outcome.substr(0, refusal.size()), extra == 0 ? "nothing" : refusal);
        }
}

TEST(XMLSerializer, ANamespacesURIBeyondALimitIsNotWritten) {
    const auto document = support::parsed("<a xmlns='1234567890'/>");
    const qx::XMLParseOptions small{.maximumTextSize = 9};
    EXPECT_EQ(support::raised([&] { static_cast<void>(document->XMLString({}, small)); }),
              "NSInvalidArgumentException: a namespace's URI is larger than the limit of 9 at "
              "/a/@xmlns");
}

TEST(XMLSerializer, EncodingsHoldWhatTheyCanAndReferToTheRest) {
    const std::string text = "a\xC3\xA9\xE2\x82\xAC\xF0\x9F\x98\x80\n";
    const auto document = holding(text);
    for (const char* encoding : {"UTF-8", "UTF-16", "UTF-16LE", "UTF-16BE", "ISO-8859-1",
                                 "US-ASCII", "windows-1252", "Shift_JIS"}) {
        document->setCharacterEncoding(encoding);
        expectReadBack(text, document->XMLData());
        expectReadBack(text, document->XMLData(qx::XMLPrettyPrint));
    }
    const std::string others = "a\\~\xC2\xA5"; // have each other's places in some encodings
    for (const char* encoding : {"Shift_JIS", "EUC-JP", "CP932"}) {
        const auto other = holding(others);
        other->setCharacterEncoding(encoding);
        expectReadBack(others, other->XMLData());
    }
    const auto joined = holding("e\xCC\x81");
    joined->setCharacterEncoding("windows-1258");
    EXPECT_THROW(joined->XMLData(), qx::Exception);
    document->setCharacterEncoding("ISO-8859-1");
    document->rootElement()->removeAttributeForName("b");
    EXPECT_EQ(document->XMLData(), "<?xml version=\"1.0\" encoding=\"ISO-8859-1\"?>"
                                   "<a>a\xE9&#8364;&#128512;\n</a>");
    const auto named = XMLDocument::initWithData("<\xC3\xA9/>");
    named->setCharacterEncoding("ISO-8859-1");
    EXPECT_NE(named->XMLData().find("<\xE9>"), std::string::npos);
    named->setCharacterEncoding("US-ASCII");
    EXPECT_THROW(named->XMLData(), qx::Exception);
    for (const char* encoding : {"nope", "UTF-7", "UTF-16//TRANSLIT", "IBM037"}) {
        document->setCharacterEncoding(encoding);
        EXPECT_THROW(document->XMLData(), qx::Exception) << encoding;
    }
}

} // namespace
