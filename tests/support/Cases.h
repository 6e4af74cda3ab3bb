#pragma once

// Cases on a page: Markdown, where each heading asks a question and fenced blocks answer it.
//
//     ## A required attribute is missed by its name
//     ```xml mapping          a language, and what is given from here on, below other headings too
//     ```xml document
//     ```text error strict    what comes of it, compared, and under which options
//
// Each heading with something to compare is a test of its own: Reading.ARequiredAttributeIs….

#include <functional>
#include <map>
#include <set>
#include <string>

namespace support {

using Words = std::set<std::string>;

struct Expectation {
    std::string kind; // "error"
    std::string text;
    Words options;
    std::map<std::string, std::string> given; // texts by their kind
};

// Makes the tests of a page below QX_SOURCE_DIR. A block of XML or text whose kind is none of these
// raises std::invalid_argument; one without a kind is left alone.
bool addCases(const std::string& page, const Words& given, const Words& compared,
              std::function<void(const Expectation&)> check);

// Listings are laid out for the reader: white space outside quotes does not count.
std::string withoutLayout(const std::string& text);

} // namespace support
