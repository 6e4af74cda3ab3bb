#include "support/Patterns.h"

#include <regex>

namespace support {

std::string replaced(const std::string& text, const std::string& pattern, const std::string& by) {
    return std::regex_replace(text, std::regex(pattern), by);
}

std::vector<std::pair<std::string, std::string>> matches(const std::string& text,
                                                         const std::string& pattern) {
    const std::regex regex(pattern);
    std::vector<std::pair<std::string, std::string>> found;
    for (std::sregex_iterator match(text.begin(), text.end(), regex), end; match != end; ++match)
        found.emplace_back(match->str(1), match->str(2));
    return found;
}

} // namespace support
