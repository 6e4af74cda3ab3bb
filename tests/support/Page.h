#pragma once

// The blocks of a page of the documentation, or the samples in a source file.

#include <algorithm>
#include <fstream>
#include <string>
#include <vector>

namespace support {

struct Block {
    std::string heading; // what stands behind the opening
    std::string text;    // outdented as far as the opening is indented
    std::size_t line = 0;
    std::string section; // the page's heading above it
};

// The blocks between a line that begins with `opening` and the next line `closing`.
inline std::vector<Block> blocksOf(const std::string& path, const std::string& opening = "```",
                                   const std::string& closing = "```") {
    std::vector<Block> blocks;
    std::ifstream file(path);
    std::string section;
    std::size_t number = 0, indent = 0;
    bool isInside = false;
    for (std::string line; std::getline(file, line);) {
        ++number;
        const std::size_t blanks = std::min(line.find_first_not_of(' '), line.size());
        if (isInside && line.substr(blanks) == closing) {
            isInside = false;
        } else if (isInside) {
            blocks.back().text += line.substr(std::min(indent, blanks)) + "\n";
        } else if (line.compare(blanks, opening.size(), opening) == 0) {
            isInside = true;
            indent = blanks;
            blocks.push_back({line.substr(blanks + opening.size()), "", number, section});
        } else if (line.starts_with('#')) {
            section = line.substr(std::min(line.find_first_not_of("# "), line.size()));
        }
    }
    return blocks;
}

} // namespace support
