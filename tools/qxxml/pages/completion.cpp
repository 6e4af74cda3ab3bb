#include "qxxml/pages/Usage.h"

namespace qxxml {

namespace {

std::string replaced(std::string text, const std::string& what, const std::string& by) {
    for (std::size_t at = 0; (at = text.find(what, at)) != std::string::npos; at += by.size())
        text.replace(at, what.size(), by);
    return text;
}

// Between apostrophes.
std::string quoted(const std::string& text) { return "'" + replaced(text, "'", R"('\'')") + "'"; }

std::string words(const std::vector<std::string>& list) {
    std::string text;
    for (const std::string& word : list)
        text += (text.empty() ? "" : " ") + word;
    return text;
}

std::vector<std::string> optionNames(const CommandUsage& command) {
    std::vector<std::string> names;
    for (const Argument& option : command.options) {
        names.push_back(option.name);
        if (!option.shortName.empty())
            names.push_back(option.shortName);
    }
    return names;
}

std::vector<std::string> commandNames(const Usage& usage) {
    std::vector<std::string> names;
    for (const CommandUsage& command : usage.commands)
        names.push_back(command.name);
    return names;
}

std::vector<std::string> choicesOf(const CommandUsage& command) {
    return command.positionals.empty() ? std::vector<std::string>()
                                       : command.positionals.front().choices;
}

// Options that are followed by a value, as a pattern of `case`; by a folder or by anything else.
std::string valueOptions(const Usage& usage, bool folders) {
    std::string pattern;
    for (const CommandUsage& command : usage.commands)
        for (const Argument& option : command.options) {
            if (option.value.empty() || option.takesFolder() != folders ||
                ("|" + pattern + "|").find("|" + option.name + "|") != std::string::npos)
                continue;
            pattern += (pattern.empty() ? "" : "|") + option.name;
        }
    return pattern;
}

// What no word fits is completed as a path by the shell itself.
std::string bashScript(const Usage& usage) {
    const auto names = commandNames(usage);
    std::string cases;
    for (const CommandUsage& command : usage.commands)
        cases += "    " + command.name + ") options='" + words(optionNames(command)) +
                 "' choices='" + words(choicesOf(command)) + "' ;;\n";
    return R"(# Completion of qxxml for bash.
_qxxml() {
    local word command= options= choices= current=${COMP_WORDS[COMP_CWORD]}
    COMPREPLY=()
    case ${COMP_WORDS[COMP_CWORD - 1]} in
    )" + valueOptions(usage, true) +
           R"()
        compopt -o filenames
        mapfile -t COMPREPLY < <(compgen -d -- "$current")
        return ;;
    )" + valueOptions(usage, false) +
           R"()
        compopt +o default
        return ;;
    esac
    for word in "${COMP_WORDS[@]:1:COMP_CWORD-1}"; do
        case $word in
        )" +
           replaced(words(names), " ", "|") +
           R"()
            command=$word
            break ;;
        esac
    done
    case $command in
    '') options=')" +
           words(optionNames(usage.tool)) + "' choices='" + words(names) + "' ;;\n" + cases +
           R"(    esac
    [[ $current == -* ]] || options=$choices
    mapfile -t COMPREPLY < <(compgen -W "$options" -- "$current")
}
complete -o default -F _qxxml qxxml
)";
}

// "[text]" of an option, where brackets end it and a colon what follows.
std::string zshText(const std::string& text) {
    return replaced(replaced(replaced(text, "[", "\\["), "]", "\\]"), ":", "\\:");
}

std::string zshArguments(const CommandUsage& command) {
    std::string text = "_arguments";
    for (const Argument& option : command.options) {
        std::string spec = "[" + zshText(option.description) + "]";
        if (!option.value.empty())
            spec += ":" + zshText(option.value) + ":" + (option.takesFolder() ? "_files -/" : "");
        text += " \\\n        " + quoted((option.repeats ? "*" : "") + option.name + spec);
        if (!option.shortName.empty())
            text += " \\\n        " + quoted(option.shortName + spec);
    }
    for (const Argument& argument : command.positionals)
        text += " \\\n        " +
                quoted((argument.repeats ? "*:" : ":") + argument.name + ":" +
                       (argument.choices.empty() ? std::string("_files")
                                                 : "(" + words(argument.choices) + ")"));
    return text;
}

std::string zshScript(const Usage& usage) {
    std::string text = "#compdef qxxml\n# Completion of qxxml for zsh.\n_qxxml() {\n"
                       "    if ((CURRENT == 2)); then\n        local -a commands=(";
    for (const CommandUsage& command : usage.commands)
        text += "\n            " + quoted(command.name + ":" + command.description);
    text += ")\n        _describe command commands\n        " + zshArguments(usage.tool) +
            "\n        return\n    fi\n    local command=$words[2]\n    shift words\n"
            "    ((CURRENT--))\n    case $command in\n";
    for (const CommandUsage& command : usage.commands)
        text += "    " + command.name + ") " + zshArguments(command) + " ;;\n";
    return text + "    esac\n}\n_qxxml \"$@\"\n";
}

std::string fishOptions(const CommandUsage& command, const std::string& condition) {
    std::string text;
    for (const Argument& option : command.options) {
        text += "complete -c qxxml -n " + quoted(condition) + " -l " + option.name.substr(2);
        if (!option.shortName.empty())
            text += " -s " + option.shortName.substr(1);
        if (option.takesFolder())
            text += " -x -a '(__fish_complete_directories)'";
        else if (!option.value.empty())
            text += " -x";
        text += " -d " + quoted(option.description) + "\n";
    }
    return text;
}

std::string fishScript(const Usage& usage) {
    const std::string none = "__fish_use_subcommand";
    std::string text = "# Completion of qxxml for fish.\ncomplete -c qxxml -f\n";
    text += fishOptions(usage.tool, none);
    for (const CommandUsage& command : usage.commands) {
        const std::string given = "__fish_seen_subcommand_from " + command.name;
        text += "complete -c qxxml -n " + none + " -a " + command.name + " -d " +
                quoted(command.description) + "\n" + fishOptions(command, given);
        if (const auto choices = choicesOf(command); !choices.empty())
            text +=
                "complete -c qxxml -n " + quoted(given) + " -a " + quoted(words(choices)) + "\n";
        else if (!command.positionals.empty())
            text += "complete -c qxxml -n " + quoted(given) + " -F\n";
    }
    return text;
}

} // namespace

std::string completionScript(const Usage& usage, const std::string& shell) {
    if (shell == "bash")
        return bashScript(usage);
    if (shell == "zsh")
        return zshScript(usage);
    return shell == "fish" ? fishScript(usage) : std::string();
}

} // namespace qxxml
