#pragma once

// What a value is made of: two words, which are always written together. Values are moved on right
// after they are made, and reading both words at once would wait for shorter writes before it.
//
//     number, object, text   | kind | form |    size    | content, 8 bytes |
//     text of up to 14 bytes | kind | form | the bytes                     |

#include <array>
#include <bit>
#include <cstdint>
#include <cstring>
#include <string_view>

namespace qx {

class Object;

enum class ValueKind : std::uint8_t { null, boolean, integer, real, string, object };

namespace detail {

struct StringRep;

class ValueCell {
public:
    // Of a string or an object: a count is held of what the content points to; the bytes are
    // somebody else's, `size` of them; the bytes lie in the cell. Then the form also says how many
    // they are: it is `inside` and their number.
    enum class Form : std::uint8_t { counted, lent, inside };
    static constexpr std::size_t mostInside = 14;

    ValueCell() noexcept = default; // null
    explicit ValueCell(bool value) noexcept : ValueCell(ValueKind::boolean, value ? 1 : 0) {}
    explicit ValueCell(std::int64_t value) noexcept
        : ValueCell(ValueKind::integer, static_cast<std::uint64_t>(value)) {}
    explicit ValueCell(double value) noexcept
        : ValueCell(ValueKind::real, std::bit_cast<std::uint64_t>(value)) {}
    // These take over a count; a null pointer gives null.
    explicit ValueCell(const Object* object) noexcept
        : ValueCell(object != nullptr ? ValueKind::object : ValueKind::null, bitsOf(object)) {}
    explicit ValueCell(StringRep* text) noexcept
        : ValueCell(text != nullptr ? ValueKind::string : ValueKind::null, bitsOf(text)) {}
    static ValueCell lent(std::string_view text) noexcept {
        return {ValueKind::string, bitsOf(text.data()), Form::lent,
                static_cast<std::uint32_t>(text.size())};
    }
    // A text of at most that many bytes.
    static ValueCell inside(std::string_view text) noexcept {
        const auto form = static_cast<std::size_t>(Form::inside) + text.size();
        if constexpr (std::endian::native != std::endian::little) {
            ValueCell cell(ValueKind::string, 0, static_cast<Form>(form));
            if (!text.empty())
                std::memcpy(reinterpret_cast<char*>(&cell) + bytesBegin, text.data(), text.size());
            return cell;
        }
        const bool isLong = text.size() > 8;
        const std::uint64_t first = isLong ? read<std::uint64_t>(text.data()) : upToEight(text);
        const std::uint64_t rest =
            isLong ? read<std::uint64_t>(text.data() + text.size() - 8) >> 8 * (16 - text.size())
                   : 0;
        ValueCell cell;
        cell._words =
            Words{static_cast<std::uint64_t>(ValueKind::string) | form << 8U | first << 16U,
                  first >> 48U | rest << 16U};
        return cell;
    }

    ValueKind kind() const noexcept { return static_cast<ValueKind>(byte(0)); }
    Form form() const noexcept { return static_cast<Form>(byte(1)); }
    bool boolean() const noexcept { return _words[1] != 0; }
    std::int64_t integer() const noexcept { return static_cast<std::int64_t>(_words[1]); }
    double real() const noexcept { return std::bit_cast<double>(content()); }
    Object* object() const noexcept { return pointer<Object>(); }
    StringRep* text() const noexcept { return pointer<StringRep>(); } // of a counted one
    // Of a text that is not counted. That of one inside is good as long as the cell stays.
    std::string_view view() const noexcept {
        if (form() == Form::lent)
            return {pointer<const char>(), static_cast<std::uint32_t>(_words[0] >> sizeShift)};
        return {bytes() + bytesBegin,
                std::size_t{byte(1)} - static_cast<std::size_t>(Form::inside)};
    }

private:
    using Words = std::uint64_t __attribute__((vector_size(16), aligned(8)));
    static constexpr std::size_t bytesBegin = 2;
    static constexpr bool isLittle = std::endian::native == std::endian::little;
    static constexpr unsigned sizeShift = isLittle ? 32 : 0;

    ValueCell(ValueKind kind, std::uint64_t content, Form form = Form::counted,
              std::uint32_t size = 0) noexcept
        : _words{std::uint64_t{static_cast<std::uint8_t>(kind)} << (isLittle ? 0U : 56U) |
                     std::uint64_t{static_cast<std::uint8_t>(form)} << (isLittle ? 8U : 48U) |
                     std::uint64_t{size} << sizeShift,
                 content} {}

    static std::uint64_t bitsOf(const void* pointer) noexcept {
        return reinterpret_cast<std::uintptr_t>(pointer);
    }
    template <class T>
    static T read(const char* at) noexcept {
        T word;
        std::memcpy(&word, at, sizeof(word));
        return word;
    }
    // The bytes as a word, the first one lowest.
    static std::uint64_t upToEight(std::string_view text) noexcept {
        const char* const at = text.data();
        const std::size_t size = text.size();
        if (size >= 4)
            return read<std::uint32_t>(at) | std::uint64_t{read<std::uint32_t>(at + size - 4)}
                                                 << 8 * (size - 4);
        if (size == 0)
            return 0;
        const auto part = [&](std::size_t i) {
            return std::uint64_t{static_cast<unsigned char>(at[i])} << 8 * i;
        };
        return part(0) | part(size / 2) | part(size - 1);
    }

    const char* bytes() const noexcept { return reinterpret_cast<const char*>(&_words); }
    std::uint8_t byte(std::size_t i) const noexcept {
        return static_cast<std::uint8_t>(bytes()[i]);
    }
    std::uint64_t content() const noexcept { return _words[1]; }
    template <class T>
    T* pointer() const noexcept {
        return reinterpret_cast<T*>(static_cast<std::uintptr_t>(_words[1]));
    }

    Words _words{};
};
static_assert(sizeof(ValueCell) == 16);

} // namespace detail
} // namespace qx
