#pragma once

// Runs the built tool as a user does: shell commands in a home folder of their own, with nothing of
// this machine in what they print.
//
//     /home/ada                           the folder where commands run, and its user's home
//     /usr/bin                            the folder of the tool
//     /usr/share/QXXMLMarshalling         the library's resources

#include "support/FileSandbox.h"

#include <string>

struct Outcome {
    int status;
    std::string output;
    std::string errors;
};

class Shell {
public:
    Shell();

    // Writes a file; its name may hold folders.
    void write(const std::string& name, const std::string& text) { _home.write(name, text); }
    // Standard input is empty unless the command says otherwise.
    Outcome run(const std::string& command) const;

private:
    std::string withoutPaths(std::string text) const;

    FileSandbox _home;
    FileSandbox _outside; // what the commands print is no part of the user's home
};
