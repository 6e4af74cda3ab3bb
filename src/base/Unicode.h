#pragma once

// Case rules of Unicode in the root locale and its white space, over UTF-8; and what is UTF-8.

#include <string>
#include <string_view>

namespace qx::unicode {

std::string lowercased(std::string_view text);
std::string capitalized(std::string_view text);
bool equalIgnoringCase(std::string_view a, std::string_view b);
// The text from the first character on that is no white space; line ends count as such.
std::string_view withoutLeadingSpace(std::string_view text) noexcept;
// The bytes that so many characters (code points) at the text's beginning take: all where it has
// fewer. A byte that is no UTF-8 counts as one.
std::size_t endOfCharacters(std::string_view text, std::size_t count) noexcept;
// How many columns of a terminal the character takes: 0 of a mark that stands above another, 2 of
// wide ones.
std::size_t terminalWidth(std::string_view character) noexcept;

// The text as a terminal may be given it: a blank for each control character, those of 8 bits among
// them, U+FFFD for what turns the direction of writing and for bytes that are no UTF-8.
std::string printable(std::string_view text);

bool isWellFormed(std::string_view text);
// A half of a surrogate pair without the other becomes U+FFFD.
std::string fromUTF16(std::u16string_view units);

} // namespace qx::unicode
