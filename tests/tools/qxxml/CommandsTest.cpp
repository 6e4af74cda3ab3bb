#include "support/Page.h"
#include "tools/qxxml/Shell.h"

#include <gtest/gtest.h>

#include <regex>

namespace {

// The page's documents ("xml NAME") are laid out; `answer` tells what comes of each of its commands
// ("console").
template <class Answer>
void run(const std::string& page, std::size_t least, Answer answer) {
    // What the parser's version decides: the column and the text of its error.
    static const std::regex parserError("(qxxml: error 76: [^:\n]+:[0-9]+):[0-9]+: .+");
    Shell home;
    const auto blocks = support::blocksOf(QX_SOURCE_DIR "/" + page);
    for (const auto& block : blocks)
        if (block.heading.starts_with("xml "))
            home.write(block.heading.substr(4), block.text);
    std::size_t commands = 0;
    for (const auto& [heading, text, line, section] : blocks) {
        if (heading != "console")
            continue;
        const std::size_t end = text.find('\n');
        ASSERT_TRUE(text.starts_with("$ ")) << page << ":" << line;
        EXPECT_EQ(std::regex_replace(answer(home, text.substr(2, end - 2)), parserError, "$1"),
                  std::regex_replace(text.substr(end + 1), parserError, "$1"))
            << page << ":" << line;
        ++commands;
    }
    EXPECT_GE(commands, least);
}

} // namespace

TEST(Commands, DoWhatTheirPagesShow) {
    const auto answer = [](const Shell& home, const std::string& command) {
        return home.run(command + " 2>&1").output;
    };
    run("docs/qxxml.md", 8, answer);
    run("docs/large-documents.md", 2, answer);
}

TEST(Commands, AreAnsweredWithOutputErrorsAndStatus) {
    run("tests/tools/qxxml/commands.md", 25, [](const Shell& home, const std::string& command) {
        static const std::regex line("(.+)");
        const auto [status, output, errors] = home.run(command);
        return output + std::regex_replace(errors, line, "! $1") +
               (status != 0 ? "= " + std::to_string(status) + "\n" : "");
    });
}
