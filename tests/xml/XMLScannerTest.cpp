#include "xml/XMLScanner.h"

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <iostream>
#include <random>

#include "xml/XMLDocumentContent.h"
#include "xml/XMLParser.h"

namespace {

using qx::XMLNode;
using qx::XMLParseOptions;
using qx::XMLParser;
using qx::XMLScanner;
using namespace std::string_literals;

std::string placeIn(const XMLNode& node) {
    return std::to_string(node.line()) + ":" + std::to_string(node.column());
}

// Every node on a line, children behind their parent.
void print(const XMLNode& node, std::string& text) {
    text += std::to_string(static_cast<int>(node.kind())) + node.name().str() + " " + placeIn(node);
    if (const qx::XMLElement* const element = node.asElement()) {
        for (const XMLNode& declaration : element->namespaces())
            text += " ns " + declaration.name().str() + "=" + declaration.stringValue().str();
        for (const XMLNode& attribute : element->attributes())
            text += " " + attribute.name().str() + "=" + attribute.stringValue().str();
    } else {
        text += "[" + node.stringValue().str() + "]";
    }
    text += "\n";
    for (const XMLNode& child : node.children())
        print(child, text);
    text += "\\";
}

// The whole tree, or the error.
std::string outcome(std::string_view bytes, const XMLParseOptions& options, XMLParser::Kept* kept,
                    XMLParser::Way way = XMLParser::Way::fastest) {
    qx::Ref<qx::Error> error;
    const auto document =
        qx::XMLDocumentContent::document(XMLParser::parseCopy(bytes, options, &error, kept, way));
    if (!document)
        return std::to_string(error->line()) + ":" + std::to_string(error->column()) + " " +
               std::to_string(error->code()) + " " + error->localizedDescription().str();
    std::string text = document->version().str() + "|" + document->standalone().str() + "|" +
                       document->characterEncoding().str() + "\n";
    for (const XMLNode& child : document->children())
        print(child, text);
    return text;
}

// Held against each other with white space kept and dropped, and with low limits; also with the
// names of all the documents before, whose limit is another from time to time.
void expectSame(const std::string& document) {
    static XMLParser::Kept kept;
    for (const XMLParseOptions& options :
         {XMLParseOptions{}, XMLParseOptions{.keepWhiteSpace = true},
          XMLParseOptions{.maximumDepth = 3, .maximumTextSize = 9}}) {
        const auto expected = outcome(document, options, nullptr, XMLParser::Way::cParserOnly);
        EXPECT_EQ(outcome(document, options, nullptr), expected) << document;
        EXPECT_EQ(outcome(document, options, &kept), expected) << document;
    }
}

bool isScanned(const std::string& document) {
    qx::XMLIndex index(document);
    return XMLScanner::scan(index, {});
}

const std::string sample =
    "<?xml version='1.0' encoding=\"UTF-8\" standalone='no' ?>\r\n<!--c\r-->\n<?p d\r\n?>\n"
    "<r xmlns='u' xmlns:p='v' p:x = \"1 &lt;&#x9;\r\n\t2\" y='\xC3\xA9\"'>\n  <p:e/>t&#65;&amp;\r\n"
    "<![CDATA[<]]]]><![CDATA[]]>\xF0\x9F\x98\x80]] ><e xml:space='preserve'> \n</e "
    ">\r</r><!---->\n";

// Read without the C parser: were one of these refused, all comparisons would still hold.
TEST(XMLScanner, TakesWhatMostDocumentsHold) {
    for (const std::string& document :
         {sample, "\n<a/>"s, "<a b='' c=''/><?p?>"s, "<a><![CDATA[]]>\n<![CDATA[]]></a>"s,
          "<a> \r <b/>\n\r\n</a>"s, "<a>&#13;&#xA;<b/>&#32;\n</a>"s, "<a x='1' p:x='2'/>"s,
          "<a xmlns=''><b xmlns='u'/></a>"s, "<a><?p  d ?><?q\n?><!-- - --></a>"s,
          "<\xC3\xA9 \xC3\xA9='\xEF\xBF\xBD'>\x7F</\xC3\xA9>"s, "<a>\n<!--x-->\n<b/> <c/>\n</a>"s,
          "<a><b>\n x</b>\n \n<b>\n</b></a>"s, "<a>\n<b/>\n<c>\n<d/> </c></a>"s,
          "<a>\n\t\t\t\t\t\t\t\t\t\n<b/></a>"s, "<a>\n<b/><![CDATA[ ]]></a>"s,
          "<a>\n<b>t</b>\n<c>\n</c>&#32;</a>"s}) {
        EXPECT_TRUE(isScanned(document)) << document;
        expectSame(document);
    }
}

TEST(XMLScanner, LeavesTheRestToTheCParser) {
    const std::vector<std::string> kinds[] = {
        {"<a>&e;</a>", "<a>&#0;</a>", "<a>&#x110000;</a>", "<a>&#99999999999;</a>", "<a>&#;</a>"},
        {"<a>\xED\xA0\x80</a>", "<a>\xC0\x80</a>", "<a>\xEF\xBF\xBF</a>", "<a>\xC3", "<a>\0</a>"s},
        {"<a></a", "<a></ab>", "<ab></a>", "<a/><b/>", "<a/>x", "<a b/>", "< a/>", "<1/>", "<:a/>"},
        {"<a>]]></a>", "<a b='<'/>", "<a b='1' b='2'/>", "<a b='1'c='2'/>", "<xmlns:a/>"},
        {"<a xmlns='' xmlns=''/>", "<a xmlns:p=''/>", "<a xmlns:xml='u'/>", "<a:b:c/>"},
        {"<a p:b='1' q:b='2' xmlns:p='u' xmlns:q='u'/>"},
        {"<a xmlns:p='http://www.w3.org/XML/1998/namespace'/>", "<!DOCTYPE a><a/>"},
        {"<a><!--a--b--></a>", "<a><!--a--->", "<a><?XML d?></a>", "<a><?p:q d?></a>"},
        {"<a><?p+?></a>", "<?xml", "<?xml?><a/>", "<?xml version='1.1'?><a/>"},
        {"<?xml version='1.'?><a/>", "<?xml version='1.0' standalone='maybe'?><a/>"},
        {"<?xml version='1.0'encoding='UTF-8'?><a/>"}};
    for (const auto& documents : kinds)
        for (const std::string& document : documents) {
            EXPECT_FALSE(isScanned(document)) << document;
            expectSame(document);
        }
}

TEST(XMLScanner, AgreesOnADocumentCutAnywhere) {
    for (std::size_t size = 0; size < sample.size(); ++size)
        expectSame(sample.substr(0, size));
    // Memory of that very size, so that the sanitizer sees a look behind the end.
    const std::string_view declared =
        "<!DOCTYPE a [<!ENTITY e 'x'><!ATTLIST a b CDATA 'c'>]><a>&e;</a>";
    for (std::size_t size = 0; size < declared.size(); ++size) {
        const std::vector<char> bytes(declared.begin(), declared.begin() + size);
        EXPECT_FALSE(qx::XMLDocument::initWithData(std::string_view(bytes.data(), size))) << size;
    }
}

TEST(XMLScanner, AgreesWhateverByteStandsAnywhere) {
    for (std::size_t at = 0; at < sample.size(); ++at)
        for (const char byte : "<>&;'\"/=!?-]:x0 \n\r\t\x01\x7F\x80\xC3"s) {
            std::string document = sample;
            document[at] = byte;
            expectSame(document);
        }
}

// At each limit, and one beyond.
TEST(XMLScanner, AgreesOnLimits) {
    const auto many = [](std::size_t count, std::string_view before, std::string_view behind) {
        std::string text = "<a";
        for (std::size_t i = 0; i < count; ++i)
            text.append(before).append(std::to_string(i)).append(behind);
        return text;
    };
    for (const std::size_t more : {0, 1}) {
        EXPECT_EQ(isScanned(many(4096 + more, " b", "=''") + "/>"), more == 0);
        expectSame(many(4096 + more, " b", "=''") + "/>");
        EXPECT_EQ(isScanned(many(1000 + more, " xmlns:p", "='u'") + "/>"), more == 0);
        expectSame(many(1000 + more, " xmlns:p", "='u'") + "/>");
        EXPECT_EQ(isScanned(many(99'999 + more, "><b", "/") + "></a>"), more == 0);
    }
}

TEST(XMLScanner, AgreesOnChangedDocuments) {
    const std::string_view pieces[] = {
        "<a>",      "</a>",     "<b/>",         "<a ",    " x='1'", " xmlns='u'", " xmlns:p='u'",
        " p:x='1'", "/>",       "&amp;",        "&#10;",  "]]>",    "]]",         "<![CDATA[",
        "<!--",     "-->",      "--",           "<?p ",   "?>",     "\r\n",       "\r",
        "\n  ",     "\xC3\xA9", "\xEF\xBF\xBF", "</p:a>", "<p:a>",  "</r><r>\n",  "'",
        "\"",       "=",        "<!DOCTYPE r>", "&e;"};
    std::mt19937 random(7);
    const auto below = [&](std::size_t limit) { return random() % limit; };
    for (int round = 0; round < 2000; ++round) {
        std::string document = sample;
        for (std::size_t changes = 1 + below(3); changes > 0; --changes) {
            const std::size_t at = below(document.size());
            switch (below(4)) {
            case 0:
                document[at] = static_cast<char>(random());
                break;
            case 1:
                document.erase(at, 1 + below(8));
                break;
            case 2:
                document.insert(at, document.substr(below(document.size()), below(30)));
                break;
            default:
                document.insert(at, pieces[below(std::size(pieces))]);
            }
        }
        expectSame(document);
    }
}

TEST(XMLScanner, NamesThatAreKeptAreThoseOfEachDocument) {
    XMLParser::Kept kept;
    const std::string longName(40, 'n');
    for (int round = 0; round < 3; ++round)
        for (const std::string& document :
             {"<a x='1' p:x='2' xmlns:p='u'/>"s, "<a x='1'><b x='2'/><a x='3'/></a>"s,
              "<" + longName + " " + longName + "m='1'></" + longName + ">", "<b x='1' x='2'/>"s}) {
            EXPECT_EQ(outcome(document, {}, &kept),
                      outcome(document, {}, nullptr, XMLParser::Way::cParserOnly));
            EXPECT_EQ(kept.names.has_value(), document[1] != 'b') << document; // which is faulty
        }
    std::string many = "<a>";
    for (int i = 0; i < 200; ++i)
        many += "<e" + std::to_string(i) + "/>";
    outcome(many + "</a>", {}, &kept);
    EXPECT_FALSE(kept.names) << "so many would be a burden for the next document";
    outcome("<" + std::string(5'000, 'n') + "/>", {}, &kept);
    EXPECT_FALSE(kept.names) << "so would one so long";
}

// scripts/conformance names the folder.
TEST(XMLScanner, AgreesOnTheDocumentsOfAFolder) {
    const char* const folder = std::getenv("QX_XML_FOLDER");
    if (folder == nullptr)
        GTEST_SKIP() << "QX_XML_FOLDER names none";
    std::size_t scanned = 0, parsed = 0, refused = 0;
    for (const auto& file : std::filesystem::recursive_directory_iterator(folder)) {
        if (file.path().extension() != ".xml")
            continue;
        const testing::ScopedTrace place(file.path().c_str(), 1, "");
        std::ifstream stream(file.path(), std::ios::binary);
        const std::string document(std::istreambuf_iterator<char>(stream), {});
        expectSame(document);
        const bool isRead = XMLParser::parseCopy(document, {}, nullptr) != nullptr;
        ++(!isRead ? refused : isScanned(document) ? scanned : parsed);
    }
    std::cout << scanned + parsed + refused << " documents: " << scanned << " read by the scanner, "
              << parsed << " by the C parser alone, " << refused << " refused by both\n";
    EXPECT_NE(scanned + parsed + refused, 0U);
}

} // namespace
