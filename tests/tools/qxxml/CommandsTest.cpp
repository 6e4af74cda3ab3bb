// Runs the built tool as a user does: shell commands in a home folder of their own, with nothing of
// this machine in what they print.
//
//     /home/ada                           the folder where commands run, and its user's home
//     /usr/bin                            the folder of the tool
//     /usr/share/QXXMLMarshalling         the library's resources

#include "support/FileSandbox.h"
#include "support/Page.h"
#include "support/Patterns.h"

#include <gtest/gtest.h>

#include <cstdlib>

#include <sys/wait.h>

namespace {

struct Outcome {
    int status;
    std::string output;
    std::string errors;
};

class Shell {
public:
    Shell() {
        _home.setVariable("HOME", _home.root());
        _home.setVariable("XDG_DATA_HOME", std::nullopt);
        _home.setVariable("XDG_CONFIG_HOME", std::nullopt);
    }
    // Writes a file; its name may hold folders.
    void write(const std::string& name, const std::string& text) { _home.write(name, text); }
    // Standard input is empty unless the command says otherwise.
    Outcome run(const std::string& command) const {
        const std::string output = _outside.path("output"), errors = _outside.path("errors");
        const std::string line = "cd '" + _home.root() +
                                 "' && PATH='" QX_BUILD_DIR "/bin':\"$PATH\" && { " + command +
                                 "\n} </dev/null >'" + output + "' 2>'" + errors + "'";
        const int status = std::system(line.c_str());
        return {WIFEXITED(status) ? WEXITSTATUS(status) : -1, withoutPaths(_outside.read("output")),
                withoutPaths(_outside.read("errors"))};
    }

private:
    std::string withoutPaths(std::string text) const {
        using std::filesystem::canonical;
        const std::pair<std::string, const char*> places[] = {
            {_home.root(), "/home/ada"},
            {canonical(QX_BUILD_DIR "/bin"), "/usr/bin"},
            {canonical(QX_SOURCE_DIR "/share"), "/usr/share/QXXMLMarshalling"}};
        for (const auto& [place, name] : places)
            for (std::size_t at; (at = text.find(place)) != std::string::npos;)
                text.replace(at, place.size(), name);
        return text;
    }

    FileSandbox _home;
    FileSandbox _outside; // what the commands print is no part of the user's home
};

// The page's documents ("xml NAME") are laid out; `answer` tells what comes of each of its commands
// ("console").
template <class Answer>
void run(const std::string& page, std::size_t least, Answer answer) {
    // What the parser's version decides: the column and the text of its error.
    const std::string parserError = "(qxxml: error 76: [^:\n]+:[0-9]+):[0-9]+: .+(\n(! )?    .*)*";
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
        EXPECT_EQ(support::replaced(answer(home, text.substr(2, end - 2)), parserError, "$1"),
                  support::replaced(text.substr(end + 1), parserError, "$1"))
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
        const auto [status, output, errors] = home.run(command);
        return output + support::replaced(errors, "(.+)", "! $1") +
               (status != 0 ? "= " + std::to_string(status) + "\n" : "");
    });
}
