#pragma once

// Bytes as text of the base64 alphabet.

#include <optional>
#include <string>
#include <string_view>

namespace qx {

// With padding, without line breaks.
std::string encodeBase64(std::string_view bytes);

// White space is passed over. None for any other character, for a length that no bytes have, for
// padding that is wrong and for bits left over.
std::optional<std::string> decodeBase64(std::string_view text);

} // namespace qx
