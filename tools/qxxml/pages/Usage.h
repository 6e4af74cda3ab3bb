#pragma once

// What the command line takes, as data: manual page and shell completions are printed from the same
// definitions as --help.

#include <string>
#include <vector>

namespace CLI {
class App;
}

namespace qxxml {

struct Argument {
    std::string name;                 // "--strict"; of what stands by its place, "MAPPING"
    std::string shortName;            // "-h", or empty
    std::string value;                // "DIR"; empty for a flag, and for what stands by its place
    std::vector<std::string> choices; // the words that the value may be; empty for any
    std::string description;
    bool repeats = false;

    bool takesFolder() const { return value == "DIR"; }
};

struct CommandUsage {
    std::string name; // empty for the tool itself
    std::string description;
    std::vector<Argument> options;
    std::vector<Argument> positionals;
};

struct Usage {
    CommandUsage tool;
    std::vector<CommandUsage> commands;

    explicit Usage(const CLI::App& app);
};

// A manual page in roff, for section 1.
std::string manualPage(const Usage& usage);

// The script that lets a shell complete commands, options and paths; empty for a shell other than
// "bash", "zsh" and "fish".
std::string completionScript(const Usage& usage, const std::string& shell);

} // namespace qxxml
