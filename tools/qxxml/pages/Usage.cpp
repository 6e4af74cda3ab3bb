#include "qxxml/pages/Usage.h"

#include <CLI/CLI.hpp>

#include <sstream>

namespace qxxml {

namespace {

// "bash|zsh|fish" are the words that are taken.
std::vector<std::string> choicesIn(const std::string& text) {
    std::vector<std::string> choices;
    if (text.find('|') != std::string::npos) {
        std::istringstream rest(text);
        for (std::string choice; std::getline(rest, choice, '|');)
            choices.push_back(choice);
    }
    return choices;
}

Argument argumentOf(const CLI::Option& option) {
    Argument argument;
    argument.description = option.get_description();
    argument.choices = choicesIn(option.get_option_text());
    argument.repeats = option.get_items_expected_max() > 1;
    if (option.get_positional()) {
        argument.name = option.get_name(true);
        return argument;
    }
    argument.name = "--" + option.get_lnames().front();
    if (!option.get_snames().empty())
        argument.shortName = "-" + option.get_snames().front();
    if (option.get_items_expected_max() > 0)
        argument.value = option.get_option_text();
    return argument;
}

CommandUsage usageOf(const CLI::App& command) {
    CommandUsage usage{command.get_name(), command.get_description(), {}, {}};
    for (const CLI::Option* option : command.get_options())
        (option->get_positional() ? usage.positionals : usage.options)
            .push_back(argumentOf(*option));
    return usage;
}

} // namespace

Usage::Usage(const CLI::App& app) : tool(usageOf(app)) {
    tool.name.clear();
    for (const CLI::App* command : app.get_subcommands({}))
        commands.push_back(usageOf(*command));
}

} // namespace qxxml
