#pragma once

// XML names made identifiers: "atom:feed" is the class AtomFeed and the field atomFeed.

#include <map>
#include <set>
#include <string>
#include <string_view>

namespace qxxml {

// Names that are told apart by a number behind them: "line", "line2".
class UniqueNames {
public:
    explicit UniqueNames(std::set<std::string> taken = {}) : _taken(std::move(taken)) {}
    // The name, or the name with the suffix, or that with the first number that is free.
    std::string add(const std::string& name, const std::string& suffix = "");

private:
    std::set<std::string> _taken;
    std::map<std::string, std::size_t> _numbers; // the last one of each name
};

std::string classNameOf(std::string_view xmlName);
std::string fieldNameOf(std::string_view xmlName);

// Behind a keyword of C++ stands an underscore.
std::string memberNameOf(const std::string& fieldName);

} // namespace qxxml
