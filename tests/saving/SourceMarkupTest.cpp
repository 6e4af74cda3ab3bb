// Where things stand in a text, told by the scanner's index and found anew for the C parser's.

#include "saving/SourceMarkup.h"
#include "xml/XMLParser.h"

#include <gtest/gtest.h>

#include <set>

namespace {

using qx::XMLParser;
using qx::detail::SourceMarkup;

// The C parser lists declarations before attributes, and layout, too.
std::set<std::string> spotsOf(const std::string& text, XMLParser::Way way) {
    const auto parsed = XMLParser::parseCopy(std::string_view(text), {}, nullptr, nullptr, way);
    const qx::XMLIndex& index = parsed->index();
    const SourceMarkup markup(index);
    std::set<std::string> all;
    for (SourceMarkup::Number at = 0; at < index.entries().size(); ++at) {
        const SourceMarkup::Number parent = markup.parent(at);
        const bool isRoot = parent == SourceMarkup::none;
        if (isRoot && index[at].nodeKind() != qx::XMLNodeKind::element)
            continue; // around the root nothing is edited
        if (!isRoot && qx::XMLIndex::isLayout(index[at], index[parent]))
            continue;
        const SourceMarkup::Spot spot = markup[at];
        std::string line(index.name(index[at]).view());
        for (const auto place : {spot.begin, spot.insideBegin, spot.insideEnd, spot.end})
            line += " " + std::to_string(place);
        all.insert(line + " in " + (isRoot ? "none" : std::to_string(markup[parent].begin)));
    }
    return all;
}

TEST(SourceMarkup, TellsTheSameWhoeverFilledTheIndex) {
    for (const std::string text :
         {"<a/>", "<?xml version='1.0'?><!-- <b> -->\n<a ></a >\n<!-- end -->",
          "<a x = '1>2'\n\ty=\"a='b'\" xmlns='u' xmlns:p = \"v\" p:z='' />",
          "<a>\r\n  <b q='x/'>t<c/>&lt;u<!-- </b> --><?p /> ?><![CDATA[</b>]]> v</b>\n<d  />\n</a>",
          "<a xml:space='preserve'> <b\n/> <b\n>\n</b\n> é€ </a>"})
        EXPECT_EQ(spotsOf(text, XMLParser::Way::fastest),
                  spotsOf(text, XMLParser::Way::cParserOnly))
            << text;
}

} // namespace
