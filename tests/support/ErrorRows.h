#pragma once

// The error texts of the library, taken from the headers that hold them: no list of them can be
// forgotten so.

#include "support/Patterns.h"

#include <fstream>
#include <iterator>
#include <string>
#include <utility>
#include <vector>

namespace support {

inline constexpr const char* libraryErrors = QX_SOURCE_DIR "/src/model/Errors.h";
inline constexpr const char* findingTexts = QX_SOURCE_DIR "/src/check/FindingTexts.h";
inline constexpr const char* parserErrors = QX_SOURCE_DIR "/src/xml/ParseFailure.h";

inline std::string contentOf(const char* header) {
    std::ifstream file(header);
    return {std::istreambuf_iterator<char>(file), {}};
}

// The code and the message of each row. A row that shares the message of another is left out.
inline std::vector<std::pair<std::string, std::string>> errorRows(const char* header) {
    return matches(contentOf(header), R"x(ErrorText \w+\{\s*(-?\d+),\s*"([^"]*)")x");
}

// All messages and reasons.
inline std::vector<std::string> errorTexts(const char* header) {
    std::vector<std::string> texts;
    for (const auto& [before, text] : matches(contentOf(header), R"x(([,={]\s*)"([^"]+)")x"))
        texts.push_back(text);
    return texts;
}

} // namespace support
