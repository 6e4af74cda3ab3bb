#include "qxxml/pages/Usage.h"

#include <QXXMLMarshalling/base/Version.h>

namespace qxxml {

namespace {

// A backslash, a hyphen, and a dot or an apostrophe that begins a line mean something to roff.
std::string escaped(const std::string& text) {
    std::string result;
    for (const char c : text) {
        if (c == '\\')
            result += "\\e";
        else if (c == '-')
            result += "\\-";
        else if ((c == '.' || c == '\'') && result.empty())
            result += std::string("\\&") + c;
        else
            result += c;
    }
    return result;
}

std::string bold(const std::string& text) { return "\\fB" + escaped(text) + "\\fR"; }
std::string italic(const std::string& text) { return "\\fI" + escaped(text) + "\\fR"; }

std::string entry(const Argument& argument) {
    std::string text = ".TP\n";
    if (!argument.shortName.empty())
        text += bold(argument.shortName) + ", ";
    text += argument.name.starts_with("-") ? bold(argument.name) : italic(argument.name);
    if (!argument.value.empty())
        text += " " + italic(argument.value);
    return text + "\n" + escaped(argument.description) + ".\n";
}

std::string synopsis(const CommandUsage& command) {
    std::string text = bold("qxxml");
    if (!command.name.empty())
        text += " " + bold(command.name);
    text += " [" + italic("OPTION") + "]...";
    for (const Argument& argument : command.positionals)
        text += " " + italic(argument.name) + (argument.repeats ? "..." : "");
    return text + "\n";
}

std::string section(const CommandUsage& command) {
    std::string text = ".SS " + escaped(command.name) + "\n" + synopsis(command) + ".PP\n" +
                       escaped(command.description) + ".\n";
    for (const auto* arguments : {&command.positionals, &command.options})
        for (const Argument& argument : *arguments)
            text += entry(argument);
    return text;
}

} // namespace

std::string manualPage(const Usage& usage) {
    const std::string version(qx::libraryVersionText());
    std::string text =
        ".TH QXXML 1 \"\" \"qxxml " + version + "\" \"User Commands\"\n" +
        ".SH NAME\nqxxml \\- try mapping documents on XML documents\n" + ".SH SYNOPSIS\n" +
        bold("qxxml") + " " + italic("COMMAND") + " [" + italic("OPTION") + "]... [" +
        italic("ARGUMENT") + "]...\n.SH DESCRIPTION\n" + escaped(usage.tool.description) +
        "\nA mapping document says what becomes of elements and attributes. "
        "The tool shows what a program would read and write under it.\n.SH OPTIONS\n";
    for (const Argument& option : usage.tool.options)
        text += entry(option);
    text += ".SH COMMANDS\n";
    for (const CommandUsage& command : usage.commands)
        text += section(command);
    return text + ".SH EXIT STATUS\n"
                  ".TP\n0\nThe command has done its work.\n"
                  ".TP\n1\nIt failed, with a line on standard error that begins with "
                  "\\(lqqxxml: error\\(rq.\n"
                  ".TP\n2\nThe command line is wrong.\n";
}

} // namespace qxxml
