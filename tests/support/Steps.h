#pragma once

// Steps on a page of cases (support/Cases.h): in a ```text steps block each line is a command and,
// behind "=>", what it says or raises. A line without "=>" says nothing.
//
//     set rome.city Roma      => city: Rome > Roma
//
// A world has the commands of a page by their first words. Each block begins in a new world.

#include "support/Cases.h"

#include <vector>

namespace support {

class Steps {
public:
    void perform(const std::string& steps);

protected:
    using Arguments = std::vector<std::string>; // the other words of the line
    using Command = std::function<void(const Arguments&)>;

    void know(const std::string& name, Command command) { _commands[name] = std::move(command); }
    void call(const std::string& command, const Arguments& arguments);
    void say(const std::string& what);

private:
    std::map<std::string, Command> _commands;
    std::string _said;
};

// With bytes in the place of "\x1F" and the like.
std::string unescaped(const std::string& text);

template <class World>
bool addSteps(const std::string& page) {
    return addCases(page, {}, {"steps"},
                    [](const Expectation& expected) { World().perform(expected.text); });
}

} // namespace support
