#include "base/Base64.h"

#include "base/WhiteSpace.h"

#include <array>
#include <cstdint>

namespace qx {

namespace {

constexpr std::string_view alphabet =
    "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789+/";
constexpr std::uint8_t none = 0xFF;

constexpr std::array<std::uint8_t, 256> digitsByCharacter() {
    std::array<std::uint8_t, 256> digits{};
    digits.fill(none);
    for (std::size_t digit = 0; digit < alphabet.size(); ++digit)
        digits[static_cast<unsigned char>(alphabet[digit])] = static_cast<std::uint8_t>(digit);
    return digits;
}
constexpr auto digitOf = digitsByCharacter();

} // namespace

// Three bytes are four characters of six bits.
std::string encodeBase64(std::string_view bytes) {
    std::string text;
    text.reserve((bytes.size() + 2) / 3 * 4);
    for (std::size_t at = 0; at < bytes.size(); at += 3) {
        const std::string_view group = bytes.substr(at, 3);
        std::uint32_t bits = 0;
        for (std::size_t i = 0; i < 3; ++i)
            bits = bits << 8U | (i < group.size() ? static_cast<unsigned char>(group[i]) : 0U);
        for (std::size_t i = 0; i < 4; ++i)
            text += i <= group.size() ? alphabet[bits >> (18U - 6U * i) & 0x3FU] : '=';
    }
    return text;
}

std::optional<std::string> decodeBase64(std::string_view text) {
    std::string bytes;
    bytes.reserve(text.size() / 4 * 3);
    std::uint32_t bits = 0;
    unsigned count = 0; // of bits that are no whole byte yet
    std::size_t digits = 0;
    std::size_t padding = 0;
    for (const char c : text) {
        if (isWhite(c))
            continue;
        if (c == '=') {
            ++padding;
            continue;
        }
        const std::uint8_t digit = digitOf[static_cast<unsigned char>(c)];
        if (digit == none || padding != 0)
            return std::nullopt;
        ++digits;
        bits = (bits << 6U | digit) & 0xFFFFU;
        count += 6;
        if (count >= 8) {
            count -= 8;
            bytes += static_cast<char>(bits >> count & 0xFFU);
        }
    }
    const bool isWhole = (digits + padding) % 4 == 0 && padding <= 2;
    const bool leavesNothing = (bits & ((1U << count) - 1U)) == 0;
    if (!isWhole || !leavesNothing)
        return std::nullopt;
    return bytes;
}

} // namespace qx
