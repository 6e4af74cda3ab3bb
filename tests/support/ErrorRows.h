#pragma once

// The error texts of the library, taken from the headers that hold them: no list of them can be
// forgotten so.

#include <fstream>
#include <iterator>
#include <regex>
#include <string>
#include <utility>
#include <vector>

namespace support {

inline constexpr const char* libraryErrors = QX_SOURCE_DIR "/src/model/Errors.h";
inline constexpr const char* findingTexts = QX_SOURCE_DIR "/src/check/FindingTexts.h";
inline constexpr const char* parserErrors = QX_SOURCE_DIR "/src/xml/ParseFailure.h";

// What the groups of the pattern match, for each of its matches.
inline std::vector<std::pair<std::string, std::string>> matches(const char* header,
                                                                const char* pattern) {
    std::ifstream file(header);
    const std::string text{std::istreambuf_iterator<char>(file), {}};
    const std::regex regex(pattern);
    std::vector<std::pair<std::string, std::string>> found;
    for (std::sregex_iterator match(text.begin(), text.end(), regex), end; match != end; ++match)
        found.emplace_back(match->str(1), match->str(2));
    return found;
}

// The code and the message of each row. A row that shares the message of another is left out.
inline std::vector<std::pair<std::string, std::string>> errorRows(const char* header) {
    return matches(header, R"x(ErrorText \w+\{\s*(-?\d+),\s*"([^"]*)")x");
}

// All messages and reasons.
inline std::vector<std::string> errorTexts(const char* header) {
    std::vector<std::string> texts;
    for (const auto& [before, text] : matches(header, R"x(([,={]\s*)"([^"]+)")x"))
        texts.push_back(text);
    return texts;
}

} // namespace support
