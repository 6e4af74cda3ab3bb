#pragma once

// Immutable, shared UTF-8 text, one pointer wide. Copying shares the text. A null string (no text
// at all) is distinct from an empty one; both convert to an empty std::string_view.
// Interned strings (see Key.h) are immortal: copying them touches no count.

#include <QXXMLMarshalling/base/Export.h>
#include <QXXMLMarshalling/detail/Count.h>
#include <QXXMLMarshalling/detail/StringRep.h>

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <string>
#include <string_view>
#include <utility>

namespace qx {

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
    friend bool operator==(const String& a, std::string_view b) noexcept {
        return a._rep != nullptr && a.view() == b;
    }
    friend bool operator==(const String& a, const char* b) noexcept {
        return b == nullptr ? a.isNull() : a == std::string_view(b);
    }
    friend bool operator==(const String& a, std::nullptr_t) noexcept { return a.isNull(); }

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
