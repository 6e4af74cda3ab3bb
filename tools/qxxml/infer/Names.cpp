#include "qxxml/infer/Names.h"

#include <algorithm>
#include <array>

namespace qxxml {

namespace {

constexpr auto keywords = std::to_array<std::string_view>({"alignas",
                                                           "alignof",
                                                           "and",
                                                           "and_eq",
                                                           "asm",
                                                           "assert",
                                                           "auto",
                                                           "bitand",
                                                           "bitor",
                                                           "bool",
                                                           "break",
                                                           "case",
                                                           "catch",
                                                           "char",
                                                           "char16_t",
                                                           "char32_t",
                                                           "char8_t",
                                                           "class",
                                                           "co_await",
                                                           "co_return",
                                                           "co_yield",
                                                           "compl",
                                                           "concept",
                                                           "const",
                                                           "const_cast",
                                                           "consteval",
                                                           "constexpr",
                                                           "constinit",
                                                           "continue",
                                                           "decltype",
                                                           "default",
                                                           "delete",
                                                           "do",
                                                           "double",
                                                           "dynamic_cast",
                                                           "else",
                                                           "enum",
                                                           "errno",
                                                           "explicit",
                                                           "export",
                                                           "extern",
                                                           "false",
                                                           "float",
                                                           "for",
                                                           "friend",
                                                           "goto",
                                                           "if",
                                                           "inline",
                                                           "int",
                                                           "linux",
                                                           "long",
                                                           "mutable",
                                                           "namespace",
                                                           "new",
                                                           "noexcept",
                                                           "not",
                                                           "not_eq",
                                                           "nullptr",
                                                           "operator",
                                                           "or",
                                                           "or_eq",
                                                           "private",
                                                           "protected",
                                                           "public",
                                                           "qx",
                                                           "register",
                                                           "reinterpret_cast",
                                                           "requires",
                                                           "return",
                                                           "short",
                                                           "signed",
                                                           "sizeof",
                                                           "static",
                                                           "static_assert",
                                                           "static_cast",
                                                           "std",
                                                           "stderr",
                                                           "stdin",
                                                           "stdout",
                                                           "struct",
                                                           "switch",
                                                           "template",
                                                           "this",
                                                           "thread_local",
                                                           "throw",
                                                           "true",
                                                           "try",
                                                           "typedef",
                                                           "typeid",
                                                           "typename",
                                                           "union",
                                                           "unix",
                                                           "unsigned",
                                                           "using",
                                                           "virtual",
                                                           "void",
                                                           "volatile",
                                                           "wchar_t",
                                                           "while",
                                                           "xor",
                                                           "xor_eq"});

static_assert(std::is_sorted(keywords.begin(), keywords.end()));

bool isUpper(char c) { return c >= 'A' && c <= 'Z'; }
bool isDigit(char c) { return c >= '0' && c <= '9'; }
char upper(char c) { return c >= 'a' && c <= 'z' ? static_cast<char>(c - 'a' + 'A') : c; }
char lower(char c) { return isUpper(c) ? static_cast<char>(c - 'A' + 'a') : c; }

// The parts between ":", "-", "." and "_", each but the first with a capital. Letters beyond ASCII
// stay: C++ takes them in names, too.
std::string joined(std::string_view xmlName) {
    std::string name;
    bool isBeginning = false;
    for (const char c : xmlName) {
        if (c == ':' || c == '-' || c == '.' || c == '_') {
            isBeginning = !name.empty();
            continue;
        }
        // Numbers that stand apart stay apart.
        if (isBeginning && isDigit(c) && isDigit(name.back()))
            name += '_';
        name += isBeginning ? upper(c) : c;
        isBeginning = false;
    }
    if (name.empty() || isDigit(name.front()))
        name.insert(0, "n");
    return name;
}

} // namespace

std::string UniqueNames::add(const std::string& name, const std::string& suffix) {
    if (_taken.insert(name).second)
        return name;
    const std::string other = name + suffix;
    if (!suffix.empty() && _taken.insert(other).second)
        return other;
    const std::string stem = isDigit(other.back()) ? other + "_" : other;
    std::size_t& number = _numbers.try_emplace(stem, 1).first->second;
    std::string numbered;
    do
        numbered = stem + std::to_string(++number);
    while (!_taken.insert(numbered).second);
    return numbered;
}

std::string classNameOf(std::string_view xmlName) {
    std::string name = joined(xmlName);
    name.front() = upper(name.front());
    // What the "type" of a field takes for no class, in any case; and what no struct can be called.
    std::string word = name;
    std::transform(word.begin(), word.end(), word.begin(), lower);
    const bool isType = word == "boolean" || word == "integer" || word == "int" || word == "string";
    const bool isMacro = name == "EOF" || name == "INFINITY" || name == "NAN" || name == "NULL";
    if (isType || isMacro)
        name += "Element";
    return name;
}

// Capitals at the beginning are made small, but for the last where a word begins with it: "ID" is
// id, "URLName" is urlName.
std::string fieldNameOf(std::string_view xmlName) {
    std::string name = joined(xmlName);
    for (std::size_t i = 0; i < name.size() && isUpper(name[i]); ++i) {
        const bool beginsWord = i > 0 && i + 1 < name.size() && lower(name[i + 1]) == name[i + 1] &&
                                !isDigit(name[i + 1]);
        if (beginsWord)
            break;
        name[i] = lower(name[i]);
    }
    return name;
}

std::string memberNameOf(const std::string& fieldName) {
    return std::binary_search(keywords.begin(), keywords.end(), fieldName) ? fieldName + "_"
                                                                           : fieldName;
}

} // namespace qxxml
