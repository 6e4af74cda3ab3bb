// What docs/qxxml.md shows is what the tool does: its documents are laid out, its commands run, and
// what they print is compared.
//
//     ```xml maps/order.xml        a document, under the name behind the language
//     ```console                   a "$ command", then everything that it prints

#include "tools/qxxml/Shell.h"

#include <gtest/gtest.h>

#include <fstream>
#include <sstream>

namespace {

std::string pageText() {
    std::ostringstream text;
    text << std::ifstream(QX_SOURCE_DIR "/docs/qxxml.md").rdbuf();
    return text.str();
}

struct Block {
    std::string heading; // what stands behind the opening fence
    std::string text;
};

std::vector<Block> blocksOf(const std::string& page) {
    const std::string fence = "```";
    std::vector<Block> blocks;
    std::istringstream lines(page);
    bool inside = false;
    for (std::string line; std::getline(lines, line);) {
        if (line.starts_with(fence)) {
            inside = !inside;
            if (inside)
                blocks.push_back({line.substr(fence.size()), ""});
        } else if (inside) {
            blocks.back().text += line + "\n";
        }
    }
    return blocks;
}

} // namespace

TEST(Docs, ShowWhatTheToolPrints) {
    Shell home;
    std::size_t commands = 0;
    for (const Block& block : blocksOf(pageText())) {
        if (block.heading.starts_with("xml "))
            home.write(block.heading.substr(4), block.text);
        if (block.heading != "console")
            continue;
        const std::size_t end = block.text.find('\n');
        ASSERT_TRUE(block.text.starts_with("$ ")) << block.text;
        const std::string command = block.text.substr(2, end - 2);
        EXPECT_EQ(home.run(command + " 2>&1").output, block.text.substr(end + 1)) << command;
        ++commands;
    }
    EXPECT_GE(commands, 8U);
}
