#include "support/Steps.h"
#include "support/Texts.h"

#include <QXXMLMarshalling/xml/XMLDocument.h>

#include <ctime>
#include <functional>
#include <gtest/gtest.h>

namespace {

using qx::Ref;
using qx::XMLDocument;
using qx::XMLElement;
using qx::XMLNode;
using support::repeated;
using namespace std::string_literals;

// The document as XML, or its error as "line:column code message".
std::string outcome(qx::XMLBytes bytes, const qx::XMLParseOptions& options = {}) {
    Ref<qx::Error> error;
    const auto document = XMLDocument::initWithData(bytes, options, &error);
    if (document)
        return document->XMLString().str();
    EXPECT_EQ(error->domain(), qx::Error::parserDomain);
    EXPECT_FALSE(error->localizedDescription().isEmpty());
    return std::to_string(error->line()) + ":" + std::to_string(error->column()) + " " +
           std::to_string(error->code()) + " " + error->localizedDescription().str();
}

struct Case {
    std::string document;
    std::string expected;
};

// An error may be expected without its message: those of the C parser differ among its versions.
void run(const std::vector<Case>& cases, const qx::XMLParseOptions& options = {}) {
    for (const auto& [document, expected] : cases) {
        // Once with a zero byte behind it, as the scanner likes it, once with nothing.
        const std::vector<char> bare(document.begin(), document.end());
        for (std::string came : {outcome(document, options),
                                 outcome(std::string_view(bare.data(), bare.size()), options)}) {
            if (expected.front() != '<' && came.starts_with(expected + " "))
                came = expected;
            EXPECT_EQ(came, expected) << document.substr(0, 200);
        }
    }
}

// "name line:column" of each element.
std::string positions(std::string_view bytes) {
    const auto document = XMLDocument::initWithData(bytes);
    if (!document)
        return outcome(bytes);
    std::string all;
    const std::function<void(const XMLElement&)> visit = [&](const XMLElement& element) {
        all += element.name().str() + " " + std::to_string(element.line()) + ":" +
               std::to_string(element.column()) + "\n";
        for (const XMLNode& child : element.children())
            if (child.isElement())
                visit(*child.asElement());
    };
    visit(*document->rootElement());
    return all;
}

qx::XMLParseOptions optionsOf(const support::Words& words) {
    qx::XMLParseOptions options;
    options.keepWhiteSpace = words.contains("white-space");
    options.refuseDoctype = words.contains("no-doctype");
    const std::pair<const char*, std::size_t*> limits[] = {{"depth=", &options.maximumDepth},
                                                           {"text=", &options.maximumTextSize},
                                                           {"subset=", &options.maximumSubsetSize}};
    for (const std::string& word : words)
        for (const auto& [limit, value] : limits)
            if (word.starts_with(limit))
                *value = std::stoul(word.substr(std::string(limit).size()));
    return options;
}

// What reading refuses for the size of a part, writing refuses in the same words.
void expectNotWritten(const std::string& document, const std::string& error,
                      const qx::XMLParseOptions& options) {
    std::string reason = error.substr(error.find(' ', error.find(' ') + 1) + 1);
    reason =
        reason.substr(1, reason.find_first_of(" \n", reason.find("limit of ") + 9) - 1) + " at ";
    const std::string raised = support::raised([&] {
        static_cast<void>(XMLDocument::initWithData(document)->XMLData(qx::XMLNoOptions, options));
    });
    EXPECT_NE(raised.find(reason), std::string::npos) << raised;
}

// An error may be expected without its message, here as in run().
void check(const support::Expectation& expectation) {
    std::string document = support::unescaped(expectation.given.at("document"));
    document.pop_back();
    const std::string expected = support::unescaped(expectation.text);
    if (expectation.kind == "places") {
        EXPECT_EQ(positions(document), expected);
    } else if (expectation.kind == "pretty") {
        const auto read = XMLDocument::initWithData(document);
        EXPECT_EQ(read->XMLData(qx::XMLPrettyPrint), expected);
        EXPECT_TRUE(XMLDocument::initWithData(expected)->isSameXML(*read));
    } else {
        const qx::XMLParseOptions options = optionsOf(expectation.options);
        run({{document, expected.substr(0, expected.size() - 1)}}, options);
        if (expectation.kind == "error" &&
            std::min(options.maximumDepth, options.maximumTextSize) < 10)
            expectNotWritten(document, expected, options);
    }
}

const bool added = support::addCases("tests/xml/documents.md", {"document"},
                                     {"tree", "error", "places", "pretty"}, check);

// The parser moves its buffer while it reads; positions must not follow it.
TEST(XMLParser, PositionsHoldToTheEndOfLongLinesAndDocuments) {
    const std::string line = repeated("<b c='\xC3\xA9'>\xE2\x82\xAC text</b>", 40'000);
    const auto onOneLine = XMLDocument::initWithData("<a>" + line + "<z/></a>");
    EXPECT_EQ(onOneLine->rootElement()->lastChild()->line(), 1U);
    EXPECT_EQ(onOneLine->rootElement()->lastChild()->column(), 4U + 40'000U * 19U);
    const auto onMany =
        XMLDocument::initWithData("<a>" + repeated("\n<b>x</b>", 40'000) + "\n <z/></a>");
    EXPECT_EQ(onMany->rootElement()->lastChild()->line(), 40'002U);
    EXPECT_EQ(onMany->rootElement()->lastChild()->column(), 2U);
}

TEST(XMLParser, BeyondALimitIsAnErrorThatNamesIt) {
    const std::string deep = repeated("<a>", 256);
    EXPECT_EQ(outcome(deep + "\n<b/>"), "2:1 1 Elements nest deeper than the limit of 256");
    EXPECT_EQ(outcome("<a>" + repeated("x", 10'000'001) + "</a>"),
              "1:4 1 A text is larger than the limit of 10000000 bytes");
}

TEST(XMLParser, RaisedLimitsGoBeyondTheParsersOwn) {
    const std::string deep = repeated("<a>", 2000) + repeated("</a>", 2000);
    EXPECT_EQ(outcome(deep, {.maximumDepth = 2000}).size(), deep.size());
    EXPECT_EQ(outcome("<a>" + deep + "</a>", {.maximumDepth = 2000}),
              "1:6001 1 Elements nest deeper than the limit of 2000");
    const std::string wide =
        "<a b=\"" + repeated("x", 10'500'000) + "\">" + repeated("y", 10'500'000) + "</a>";
    EXPECT_EQ(outcome(wide, {.maximumTextSize = 11'000'000}).size(), wide.size());
}

// What each number from 0 on adds, together with the one before it.
template <class Text>
std::string joined(int count, Text text) {
    std::string all;
    for (int i = 0; i < count; ++i) {
        const std::string number = std::to_string(i);
        const std::string before = std::to_string(i - 1);
        all += text(number, before);
    }
    return all;
}

std::string withSubset(const std::string& subset, const std::string& root) {
    return "<!DOCTYPE a [" + subset + "]>" + root;
}

// Entities of which each refers ten times to the one before it.
std::string laughs(const std::string& innermost, const std::string& kind = "") {
    const std::string reference = kind.empty() ? "&e" : "&#37;e";
    return joined(10, [&](const std::string& number, const std::string& before) {
        return "<!ENTITY " + kind + "e" + number + " \"" +
               (number == "0" ? innermost : repeated(reference + before + ";", 10)) + "\">";
    });
}

// Each of these took more than linear time or memory, in one version of the C parser or another.
TEST(XMLParser, HostileDocumentsEndSoon) {
    const std::string expansion = " 89 Entities and attribute defaults bring in more than";
    const std::string subset = " 1 The DOCTYPE declares more than the limit of 65536 bytes";
    const std::string attributes = joined(5000, [](auto& i, auto&) { return " a" + i + "='='"; });
    const std::string few = joined(600, [](auto& i, auto&) { return " a" + i + "&#61;''"; });
    const std::string names = joined(2500, [](auto& i, auto&) { return " a" + i + " CDATA ''"; });
    const std::string tokens = joined(20'000, [](auto& i, auto&) { return "|t" + i; });
    // Names that differ in their last bytes only, and the latest of them again and again.
    const std::string letters = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ";
    std::string alike = "<a>";
    for (const char c : letters)
        for (const char d : letters)
            alike += std::string("<abcdef") + c + d + "/>";
    alike += repeated("<abcdefZZ/>", 400'000) + "</a>";
    const Case cases[] = {
        {withSubset(laughs("lol"), "<a>&e9;</a>"), expansion},
        {withSubset(laughs(""), "<a b='&e9;'/>"), expansion},
        {withSubset(laughs("<b/>"), "<a>&e9;</a>"), expansion},
        {withSubset(laughs("") + "<!ATTLIST a b CDATA '&e9;'>", "<a/>"), expansion},
        {withSubset("<!ENTITY e '" + repeated("x", 10'000) + "'>",
                    "<a>" + repeated("&e;", 10'000) + "</a>"),
         expansion},
        {withSubset("<!ENTITY e '<b/>'>", "<a>" + repeated("&e;", 60'000) + "</a>"), expansion},
        {withSubset("<!ATTLIST a" + names.substr(0, names.find(" a1999 ")) + ">",
                    repeated("<a>\n", 200)),
         expansion},
        {withSubset("<!ATTLIST a" + names + ">", "<a/>"),
         " 1 More attributes have defaults than the limit of 2000"},
        {withSubset(laughs("", "% ") + "%e9;", "<a/>"), subset},
        {withSubset("<!ENTITY % p '&#37;p;&#37;p;'> %p;", "<a/>"), " 8"},
        {withSubset("<!ENTITY % p \"<!ENTITY e '&#37;p;&#37;p;'>\"> %p;", "<a/>"), " 8"},
        {withSubset("<!ENTITY e '&f;'><!ENTITY f '&e;'>", "<a b='&e;'/>"),
         " 89 Entities refer to themselves"},
        {withSubset("<!ENTITY e-1 ''>" + joined(40,
                                                [](auto& i, auto& before) {
                                                    return "<!ENTITY e" + i + " '<b>&e" + before +
                                                           ";</b>'>";
                                                }),
                    "<a>&e39;</a>"),
         " 89 Entities refer to themselves, or nest deeper than the limit of 32"},
        {withSubset("<!ENTITY e \"<b" + few + "/>\">", "<a>&e;</a>"),
         " 1 An element has more attributes than the limit of 512"},
        {withSubset("<!ATTLIST a b (x" + tokens + ") #IMPLIED>", "<a/>"), subset},
        {withSubset("<!ENTITY % p '<!ATTLIST a b (x" + tokens.substr(0, 20'000) + ") #IMPLIED>'>" +
                        repeated("%p;<?p?>", 1000),
                    "<a/>"),
         subset},
        {withSubset("<!-- ] ' --><?p ] \" ?><!ENTITY e ']'>" + repeated(" ", 65'500), "<a/>"),
         subset},
        {withSubset("<!ELEMENT a " + repeated("(", 30'000) + "b" + repeated(")", 30'000) + ">",
                    "<a/>"),
         "1:2075 "},
        {"<!--" + repeated("-", 500'000) + "--><a/>", " 80"},
        {repeated("<!-- --", 100'000) + "<a/>", " 80"},
        {"<a><!--" + repeated("--a", 100'000) + "--></a>", " 80"},
        {repeated("<a ", 300'000), " 68"},
        {"<r>\n" + repeated("x", 40'000) + "<a" + attributes + "/></r>",
         "2:40001 1 An element has more attributes than the limit of 4096"},
        {"<r>\n<a" + joined(2000, [](auto& i, auto&) { return " xmlns:n" + i + "='u'"; }) +
             "/></r>",
         "2:1 1 More namespace declarations are in force than the limit of 1000"},
        {"<a>" + joined(100'001, [](auto& i, auto&) { return "\n<b" + i + "/>"; }),
         "100001:1 1 The document has more different names than the limit of 100000"},
        {alike, "<a><abcdefaa"},
    };
    for (const auto& [document, expected] : cases) {
        const std::clock_t start = std::clock();
        const std::string came = outcome(document);
        EXPECT_LT(std::clock() - start, 2 * CLOCKS_PER_SEC) << document.substr(0, 200);
        EXPECT_NE(came.find(expected), std::string::npos) << document.substr(0, 200) << '\n'
                                                          << came.substr(0, 200);
    }
}

TEST(XMLParser, OnlyAttributesCountAsAttributes) {
    const std::string many = repeated(" a='b'", 5000);
    for (const std::string& inside :
         {"<!--" + many + "-->", "<b c=\"" + many + "\"></b>", "<b></b>" + many})
        EXPECT_EQ(outcome("<a>" + inside + "</a>").size(), inside.size() + 7)
            << inside.substr(0, 20);
}

// Encodings of one byte: documents.md.
TEST(XMLParser, DocumentsComeInUTF16) {
    const auto wide = [](std::string_view text, bool big) {
        std::string bytes;
        for (std::size_t i = 0; i < text.size(); ++i) {
            const char low = text[i] == '\xC3' ? text[++i] + 0x40 : text[i];
            bytes += big ? std::string{'\0', low} : std::string{low, '\0'};
        }
        return bytes;
    };
    const std::string accent = "<a>\xC3\xA9</a>";
    const std::string labelled = "<?xml version=\"1.0\" encoding=\"UTF-16\"?>" + accent;
    run({{"\xFE\xFF" + wide(labelled, true), labelled},
         {"\xFF\xFE" + wide(labelled, false), labelled},
         {wide(accent, true), accent},
         {wide(accent, false), accent},
         {"\xFE\xFF" + wide("<a>\n</a>", true) + "x",
          "2:5 81 A character is not in the encoding UTF-16BE"},
         {"\xFF\xFE", "1:1 4 The document is empty"}});
}

} // namespace
