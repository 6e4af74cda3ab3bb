#include "qxxml/CommandLine.h"

#include "qxxml/Commands.h"
#include "qxxml/Failure.h"
#include "qxxml/Output.h"
#include "qxxml/pages/Usage.h"

#include <QXXMLMarshalling/base/Version.h>

#include <CLI/CLI.hpp>

#include <cstdio>
#include <cstdlib>
#include <functional>
#include <new>
#include <sstream>

#include <unistd.h>

namespace qxxml {

namespace {

using Command = std::function<std::string(const Options&)>;

constexpr int failed = 1;
constexpr int wrongUsage = 2;

// Standard error may be gone as well: there is nobody left to tell.
int fail(const std::string& message) {
    std::fputs(("qxxml: error " + message + "\n").c_str(), stderr);
    return failed;
}

// Colours are for people who see them, and who did not say that they want none.
bool showsColours() {
    const char* const refused = std::getenv("NO_COLOR");
    const char* const terminal = std::getenv("TERM");
    return ::isatty(STDERR_FILENO) != 0 && (refused == nullptr || *refused == '\0') &&
           (terminal == nullptr || std::string_view(terminal) != "dumb");
}

int fail(const Failure& failure, const Options& options) {
    const auto form = options.json      ? Failure::Form::json
                      : options.oneLine ? Failure::Form::oneLine
                      : showsColours()  ? Failure::Form::coloured
                                        : Failure::Form::text;
    std::fputs(failure.text(form).c_str(), stderr);
    return failed;
}

// What is wrong with the value of --application; nothing when it is empty.
std::string checkApplication(const std::string& application) {
    const std::size_t slash = application.find('/');
    const std::string name = application.substr(0, slash);
    if (name.empty() || name == "." || name == "..")
        return "an application's name is a file name, not \"" + name + "\"";
    if (slash == std::string::npos)
        return {};
    const std::string version = application.substr(slash + 1);
    if (version.empty() || version.find('/') != std::string::npos)
        return "NAME or NAME/VERSION is expected, not \"" + application + "\"";
    // Of any other beginning nothing would be left, see QXXMLFileSystemDataRepository.
    if (version.find_first_of("0123456789") >= version.find_first_not_of("0123456789.("))
        return "a version begins with a number, unlike \"" + version + "\"";
    return {};
}

// What is wrong with the value of --prefix; nothing when it is empty. The library knows which are
// prefixes.
std::string checkPrefix(const std::string& prefix) {
    const std::size_t equals = prefix.find('=');
    if (equals == std::string::npos || equals + 1 == prefix.size())
        return "PREFIX=URI or =URI is expected, not \"" + prefix + "\"";
    return {};
}

void addSearch(CLI::App& command, Options& options) {
    command
        .add_option("--search-path", options.searchPaths,
                    "Look in this folder before the usual places; may be given more than once")
        ->option_text("DIR")
        ->allow_extra_args(false);
    command
        .add_option("--application", options.application,
                    "Look in the places of this application, for this version of it")
        ->option_text("NAME[/VERSION]")
        ->check(CLI::Validator(checkApplication, ""));
}

void addMapping(CLI::App& command, Options& options) {
    command.add_option("MAPPING", options.mapping, "The path of a mapping document")
        ->option_text(" ")
        ->required();
}

// How what goes wrong is told.
void addTelling(CLI::App& command, Options& options) {
    command.add_flag("--json", options.json, "Tell errors and warnings as JSON, an object a line");
    command.add_flag("--one-line", options.oneLine,
                     "Tell errors as editors read them: FILE:LINE:COLUMN: error CODE: MESSAGE");
}

CLI::Option* addOutput(CLI::App& command, Options& options) {
    return command
        .add_option("-o,--output", options.output, "Write to this file, once all went well")
        ->option_text("FILE");
}

void addMatching(CLI::App& command, Options& options) {
    command
        .add_option("--prefix", options.prefixes,
                    "Match names by namespace: the mapping has this prefix, or none, for the "
                    "namespace of that URI; may be given more than once")
        ->option_text("[PREFIX]=URI")
        ->allow_extra_args(false)
        ->check(CLI::Validator(checkPrefix, ""));
    command.add_flag("--match-namespaces", options.matchNamespaces,
                     "The same for the namespaces that the class mappings declare");
}

void addReading(CLI::App& command, Options& options) {
    addMapping(command, options);
    addTelling(command, options);
    command.add_flag("--quiet", options.quiet, "Do not tell what no field takes")
        ->excludes(command.add_flag("--verbose", options.verbose,
                                    "Tell each place of it, instead of one line for all"));
    command
        .add_option("--errors", options.errors,
                    "Go on until there are that many errors, and tell them all")
        ->option_text("NUMBER")
        ->check(CLI::PositiveNumber);
    command.add_option("DOCUMENT", options.document, "The path of a document; - is standard input")
        ->option_text(" ")
        ->required();
    command.add_flag("--strict", options.strict,
                     "Fail at an item of an untyped collection that no class handles; with "
                     "--discard-unknown, at child elements and attributes that no field takes");
    command.add_flag("--discard-unknown", options.discardUnknown,
                     "Do not keep XML that the mapping does not describe");
    command.add_flag("--no-namespace-uris", options.noNamespaceURIs,
                     "Do not write namespace declarations");
    addMatching(command, options);
    command.add_flag("--keep-white-space", options.keepWhiteSpace,
                     "Keep the white space between elements");
    command.add_flag("--no-doctype", options.noDoctype, "Fail at a document that has a DOCTYPE");
}

void addChecking(CLI::App& command, Options& options) {
    addMapping(command, options);
    command
        .add_option("DOCUMENT", options.documents,
                    "The paths of documents to try the mapping on; - is standard input")
        ->option_text("...");
    command
        .add_option("--why", options.why,
                    "Tell why this node of the last document is bound or not, and nothing else")
        ->option_text("PATH");
    command.add_flag("--notes", options.notes, "Print the notes on the mapping, too");
    command.add_flag("--json", options.json, "Print an array of findings as JSON");
    command.add_flag("--discard-unknown", options.discardUnknown,
                     "Do not keep XML that the mapping does not describe");
    addMatching(command, options);
    command.add_flag("--no-doctype", options.noDoctype, "Fail at a document that has a DOCTYPE");
}

// What is wrong with an assignment; nothing when it is empty.
std::string checkAssignment(const std::string& assignment) {
    const std::size_t equals = assignment.find('=');
    if (equals == std::string::npos || equals == 0)
        return "KEYPATH=VALUE is expected, not \"" + assignment + "\"";
    return {};
}

void addSaving(CLI::App& command, Options& options) {
    CLI::Option* const inPlace =
        command.add_flag("--in-place", options.inPlace, "Write the document, and print nothing");
    addOutput(command, options)->excludes(inPlace);
    command.add_flag("--diff", options.diff, "Print the lines that change");
}

void addInferring(CLI::App& command, Options& options) {
    command
        .add_option("DOCUMENT", options.documents, "The paths of documents; - is standard input")
        ->option_text("...")
        ->required();
    command.add_flag("--classes", options.classes,
                     "Print C++ structs for the mapping instead of it");
    command.add_flag("--keep-order", options.keepOrder,
                     "Keep the order of children that stand in different ones, in an untyped "
                     "collection");
    command.add_flag("--no-doctype", options.noDoctype, "Fail at a document that has a DOCTYPE");
}

// Defines the commands; the one that was called is left in `chosen`, what it says of its exit in
// `status`.
void define(CLI::App& tool, Options& options, Command& chosen, int& status) {
    tool.require_subcommand(1);
    tool.set_version_flag("--version", "qxxml " + std::string(qx::libraryVersionText()),
                          "Print the version and exit");
    const auto add = [&](const char* name, const char* purpose, Command command) {
        CLI::App* const added = tool.add_subcommand(name, purpose);
        added->callback([&chosen, command] { chosen = command; });
        return added;
    };
    CLI::App* command =
        add("describe", "Resolve a mapping with its includes and print its description", describe);
    addMapping(*command, options);
    addTelling(*command, options);
    addSearch(*command, options);

    command = add("graph", "Print a mapping as a graph for Graphviz", graph);
    addMapping(*command, options);
    command->add_flag("--svg", options.svg, "Print the picture itself, which dot draws");
    addSearch(*command, options);

    command = add("read", "Read a document into an object and print it as JSON", nullptr);
    command->callback([&] { chosen = options.each.empty() ? read : readEach; });
    addReading(*command, options);
    command
        ->add_option("--each", options.each,
                     "Read each element of this name by itself and print one object a line, "
                     "however large the document is")
        ->option_text("NAME");
    addSearch(*command, options);

    command = add("roundtrip", "Read a document, write its object and print that", roundtrip);
    addReading(*command, options);
    command->add_flag("--pretty", options.pretty, "Print one element a line");
    addOutput(*command, options);
    addSearch(*command, options);

    command = add("check",
                  "Tell what a mapping does, by itself and to documents, that its "
                  "author may not want",
                  nullptr);
    command->callback(
        [&] { chosen = [&status](const Options& given) { return check(given, status); }; });
    addChecking(*command, options);
    addSearch(*command, options);

    command =
        add("set", "Set values in a document by their key paths, and change nothing else", set);
    addReading(*command, options);
    command->add_option("ASSIGNMENT", options.assignments, "Key paths with their new values")
        ->option_text("KEYPATH=VALUE...")
        ->required()
        ->check(CLI::Validator(checkAssignment, ""));
    addSaving(*command, options);
    addSearch(*command, options);

    command =
        add("update",
            "Save an object into a document, as JSON like that of read, and change nothing else",
            update);
    addReading(*command, options);
    command->add_option("OBJECT", options.object, "The path of the JSON; - is standard input")
        ->option_text(" ")
        ->required();
    addSaving(*command, options);
    addSearch(*command, options);

    command = add("infer", "Print a mapping that fits documents which have none", infer);
    addInferring(*command, options);
    addTelling(*command, options);
    addOutput(*command, options);

    command =
        add("where", "Print the file that a name resolves to, and where it was looked for", where);
    command->add_option("NAME", options.name, "The name of a document, as an include has it")
        ->option_text(" ")
        ->required();
    addSearch(*command, options);

    const auto usage = [&tool] { return Usage(tool); };
    add("manual", "Print the manual page, which \"man -l -\" shows",
        [usage](const Options&) { return manualPage(usage()); });

    command = add("completion", "Print what lets a shell complete the command line",
                  [usage](const Options& given) { return completionScript(usage(), given.name); });
    command->add_option("SHELL", options.name, "The shell that it is for")
        ->option_text("bash|zsh|fish")
        ->required()
        ->check(CLI::IsMember({"bash", "zsh", "fish"}));
}

// Help and version are asked for; anything else is wrong usage.
int endParsing(const CLI::App& tool, const CLI::ParseError& error) {
    std::ostringstream text;
    if (tool.exit(error, text, text) == 0) {
        print(text.str());
        flushOutput();
        return 0;
    }
    std::fputs(("qxxml: " + text.str()).c_str(), stderr);
    return wrongUsage;
}

int run(int argc, const char* const* argv, Options& options) {
    Command command = nullptr;
    CLI::App tool("Tries mapping documents on XML documents.", "qxxml");
    int status = 0;
    define(tool, options, command, status);
    try {
        tool.parse(argc, argv);
    } catch (const CLI::ParseError& error) {
        return endParsing(tool, error);
    }
    const std::string text = command(options);
    if (!options.output.empty())
        save(text, options.output);
    else
        print(text);
    flushOutput();
    return status;
}

} // namespace

int runCommandLine(int argc, const char* const* argv) {
    Options options;
    try {
        return run(argc, argv, options);
    } catch (const std::bad_alloc&) {
        std::fputs("qxxml: error 12: Out of memory\n", stderr);
        return failed;
    } catch (const Failure& failure) {
        return fail(failure, options);
    } catch (const std::exception& problem) {
        return fail(problem.what());
    }
}

} // namespace qxxml
