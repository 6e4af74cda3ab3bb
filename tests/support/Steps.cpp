#include "support/Steps.h"

#include <gtest/gtest.h>

#include <iomanip>
#include <sstream>

namespace support {

void Steps::perform(const std::string& steps) {
    std::istringstream lines(steps);
    int number = 0;
    for (std::string line; std::getline(lines, line);) {
        ++number;
        const std::size_t arrow = line.find("=>");
        std::istringstream text(line.substr(0, arrow));
        std::string command;
        Arguments arguments;
        text >> command;
        for (std::string word; text >> std::quoted(word);)
            arguments.push_back(word);
        _said.clear();
        try {
            call(command, arguments);
        } catch (const std::exception& raised) {
            say(raised.what());
        }
        EXPECT_EQ(_said, arrow == std::string::npos ? "" : line.substr(arrow + 3))
            << "step " << number << ": " << line;
    }
}

void Steps::call(const std::string& command, const Arguments& arguments) {
    const auto known = _commands.find(command);
    ASSERT_NE(known, _commands.end()) << command << " is no command of the page";
    known->second(arguments);
}

void Steps::say(const std::string& what) { _said += (_said.empty() ? "" : "; ") + what; }

std::string unescaped(const std::string& text) {
    std::string bytes = text;
    for (std::size_t at = 0; (at = bytes.find("\\x", at)) != std::string::npos; ++at)
        bytes.replace(at, 4, 1, static_cast<char>(std::stoi(bytes.substr(at + 2, 2), nullptr, 16)));
    return bytes;
}

} // namespace support
