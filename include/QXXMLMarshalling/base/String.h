#pragma once

// Immutable, shared UTF-8 text, one pointer wide. Copying shares the text. A null string (no text
// at all) is distinct from an empty one; both convert to an empty std::string_view.
// Interned strings (see Key.h) are immortal: copying them touches no count.

#include <QXXMLMarshalling/base/Export.h>
#include <QXXMLMarshalling/detail/Count.h>
#include <QXXMLMarshalling/detail/StringRep.h>

#include <atomic>
#include <compare>
#include <concepts>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <initializer_list>
#include <iosfwd>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <version>
#ifdef __cpp_lib_format
#include <format>
#endif

namespace qx {

class String;

namespace detail {
// What stands beside a String in comparisons and sums: std::string, std::string_view, a C string
// (a null pointer is no text).
template <class T>
concept Text =
    std::convertible_to<const T&, std::string_view> && !std::same_as<T, std::nullptr_t> &&
    !std::same_as<T, String>;
template <Text T>
bool isNullText(const T& text) noexcept {
    if constexpr (std::is_pointer_v<T>)
        return text == nullptr;
    else
        return false;
}
template <Text T>
std::string_view viewOf(const T& text) {
    return isNullText(text) ? std::string_view() : std::string_view(text);
}
} // namespace detail

class QX_API String {
public:
    String() noexcept = default;
    String(std::nullptr_t) noexcept {}
    String(std::string_view text);
    String(const std::string& text) : String(std::string_view(text)) {}
    // A null pointer gives the null string.
    String(const char* text);
    String(const String& other) noexcept : _rep(other._rep) { retain(); }
    String(String&& other) noexcept : _rep(std::exchange(other._rep, nullptr)) {}
    ~String() { release(); }
    String& operator=(String other) noexcept {
        std::swap(_rep, other._rep);
        return *this;
    }

    // All parts, one after the other.
    static String concat(std::initializer_list<std::string_view> parts);

    bool isNull() const noexcept { return _rep == nullptr; }
    // True for the null string too.
    bool isEmpty() const noexcept { return _rep == nullptr || _rep->size == 0; }
    // In bytes; 0 for the null string.
    std::size_t size() const noexcept { return _rep != nullptr ? _rep->size : 0; }
    // Zero-terminated; "" for the null string.
    const char* c_str() const noexcept { return _rep != nullptr ? text(_rep) : ""; }
    std::string_view view() const noexcept { return {c_str(), size()}; }
    operator std::string_view() const noexcept { return view(); }
    std::string str() const { return std::string(view()); }

    // Unicode-aware, independent of the locale. Null stays null.
    String lowercased() const;
    // First letter of each word in upper case, the rest in lower case.
    String capitalized() const;
    bool equalsIgnoringCase(std::string_view other) const;

    std::uint32_t hash() const noexcept;
    static std::uint32_t hashOf(std::string_view text) noexcept;

    // Same text; the null string equals only the null string.
    friend bool operator==(const String& a, const String& b) noexcept {
        if (a._rep == b._rep)
            return true;
        if (a._rep == nullptr || b._rep == nullptr || a._rep->size != b._rep->size)
            return false;
        if (a.isInterned() && b.isInterned())
            return false;
        return a.view() == b.view();
    }
    template <detail::Text T>
    friend bool operator==(const String& a, const T& b) noexcept {
        return a.isNull() ? detail::isNullText(b)
                          : !detail::isNullText(b) && a.view() == detail::viewOf(b);
    }
    friend bool operator==(const String& a, std::nullptr_t) noexcept { return a.isNull(); }
    // By bytes, so by code points; the null string comes before all others.
    friend std::strong_ordering operator<=>(const String& a, const String& b) noexcept {
        return a.compare(b.isNull(), b.view());
    }
    template <detail::Text T>
    friend std::strong_ordering operator<=>(const String& a, const T& b) noexcept {
        return a.compare(detail::isNullText(b), detail::viewOf(b));
    }

    // A new text of both, never null: a null one adds nothing. `concat` joins many at once.
    friend String operator+(const String& a, const String& b) {
        return concat({a.view(), b.view()});
    }
    template <detail::Text T>
    friend String operator+(const String& a, const T& b) {
        return concat({a.view(), detail::viewOf(b)});
    }
    template <detail::Text T>
    friend String operator+(const T& a, const String& b) {
        return concat({detail::viewOf(a), b.view()});
    }

    // The text, nothing for the null string; the stream's width counts. std::format prints it like
    // a std::string_view, where the standard library has it.
    friend std::ostream& operator<<(std::ostream& out, const String& text) {
        return text.print(out);
    }

    // True when both are the very same text in memory.
    bool isSameAs(const String& other) const noexcept { return _rep == other._rep; }
    bool isInterned() const noexcept {
        return _rep != nullptr && (_rep->count.load(std::memory_order_relaxed) & internedBit) != 0;
    }

    // For classes that hold a text without a String: as Ref's of the same names. `shared` adds a
    // count.
    [[nodiscard]] detail::StringRep* detach() && noexcept { return std::exchange(_rep, nullptr); }
    static String adopt(detail::StringRep* rep) noexcept { return String(rep); }
    static String shared(detail::StringRep* rep) noexcept {
        String text(rep);
        text.retain();
        return text;
    }

private:
    friend class Key;
    friend class Selector;
    friend struct NameTable;
    friend String textInBlock(std::string_view text);
    friend class TextBuffer;

    using Rep = detail::StringRep;
    static constexpr std::uint32_t immortalBit = 0x80000000U;
    static constexpr std::uint32_t internedBit = 0x40000000U;
    static constexpr std::uint32_t propertyBit = 0x20000000U; // see Key::namesProperty

    explicit String(Rep* rep) noexcept : _rep(rep) {}
    std::strong_ordering compare(bool otherIsNull, std::string_view other) const noexcept {
        if (isNull() || otherIsNull)
            return otherIsNull <=> isNull();
        return view() <=> other;
    }
    std::ostream& print(std::ostream& out) const;
    static const char* text(const Rep* rep) noexcept { return rep->view().data(); }
    // A text of that many bytes, which the caller fills in, with a count of one.
    static Rep* newRep(void* memory, std::size_t size, bool isInBlock) noexcept;
    static Rep* allocate(std::size_t size, std::uint32_t count);
    static void destroy(Rep* rep) noexcept;
    // A text that nobody shares, with room for that many bytes; null makes a new one.
    static Rep* resized(Rep* rep, std::size_t size);

    void retain() const noexcept {
        if (_rep != nullptr && (_rep->count.load(std::memory_order_relaxed) & immortalBit) == 0)
            detail::increaseCount(_rep->count);
    }
    void release() const noexcept {
        if (_rep == nullptr || (_rep->count.load(std::memory_order_relaxed) & immortalBit) != 0)
            return;
        if (detail::decreaseCount(_rep->count) == 1)
            destroy(_rep);
    }

    Rep* _rep = nullptr;
};

} // namespace qx

// Equal texts have equal hashes, in one process; they differ from process to process.
template <>
struct std::hash<qx::String> {
    std::size_t operator()(const qx::String& text) const noexcept { return text.hash(); }
};

// Algorithms of std::ranges compare strings with other texts as views: each converts to the other,
// so the language names no common type.
template <qx::detail::Text T, template <class> class Q, template <class> class QT>
struct std::basic_common_reference<qx::String, T, Q, QT> {
    using type = std::string_view;
};
template <qx::detail::Text T, template <class> class QT, template <class> class Q>
struct std::basic_common_reference<T, qx::String, QT, Q> {
    using type = std::string_view;
};

#ifdef __cpp_lib_format
template <>
struct std::formatter<qx::String> : std::formatter<std::string_view> {
    template <class Context>
    auto format(const qx::String& text, Context& context) const {
        return std::formatter<std::string_view>::format(text.view(), context);
    }
};
#endif
