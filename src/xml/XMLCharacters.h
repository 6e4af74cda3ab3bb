#pragma once

// Which characters XML 1.0 allows, and where; which texts are names and versions.

#include "base/WhiteSpace.h"

#include <cstddef>
#include <string>
#include <string_view>

namespace qx {

// What decodeCharacter answers for bytes that are no UTF-8.
constexpr char32_t malformedCharacter = 0xFFFFFFFF;

// The code point at `position`, which moves behind it (by one byte for malformed ones). The
// position must lie inside the text.
char32_t decodeCharacter(std::string_view text, std::size_t& position) noexcept;

// Adds the code point in UTF-8.
void appendCharacter(char32_t c, std::string& text);

// What stands for the character in a document: its entity where it has one, "&lt;" and its like,
// else its number, "&#10;".
std::string referenceTo(char32_t c);

bool isXMLCharacter(char32_t c) noexcept;
// UTF-8 whose every character XML allows in some place of a document.
bool isXMLText(std::string_view text) noexcept;
// A name of an element, an attribute or a target, colons included.
bool isXMLName(std::string_view text) noexcept;
// A version of XML 1: "1." and digits.
bool isXMLVersion(std::string_view text) noexcept;

} // namespace qx
