#include <QXXMLMarshalling/platform/String.h>

#include "platform/object/Unicode.h"

#include <cstring>
#include <new>

namespace qx {

String::Rep* String::allocate(std::size_t size, std::uint32_t count) {
    void* memory = ::operator new(sizeof(Rep) + size + 1);
    auto* rep = new (memory) Rep{{count}, {0}, size};
    reinterpret_cast<char*>(rep + 1)[size] = '\0';
    return rep;
}

void String::destroy(Rep* rep) noexcept {
    rep->~Rep();
    ::operator delete(rep);
}

String::String(std::string_view text) {
    if (text.empty()) {
        static Rep* const empty = allocate(0, immortalBit);
        _rep = empty;
        return;
    }
    _rep = allocate(text.size(), 1);
    std::memcpy(reinterpret_cast<char*>(_rep + 1), text.data(), text.size());
}

String::String(const char* text)
    : String(text != nullptr ? String(std::string_view(text)) : String()) {}

String String::concat(std::initializer_list<std::string_view> parts) {
    std::size_t size = 0;
    for (const auto part : parts)
        size += part.size();
    if (size == 0)
        return std::string_view();
    Rep* rep = allocate(size, 1);
    char* to = reinterpret_cast<char*>(rep + 1);
    for (const auto part : parts) {
        if (!part.empty())
            std::memcpy(to, part.data(), part.size());
        to += part.size();
    }
    return String(rep);
}

// FNV-1a; 0 is kept free for "not worked out yet".
std::uint32_t String::hashOf(std::string_view text) noexcept {
    std::uint32_t hash = 2166136261U;
    for (const char c : text) {
        hash ^= static_cast<unsigned char>(c);
        hash *= 16777619U;
    }
    return hash != 0 ? hash : 1;
}

std::uint32_t String::hash() const noexcept {
    if (_rep == nullptr)
        return 0;
    std::uint32_t hash = _rep->hash.load(std::memory_order_relaxed);
    if (hash == 0) {
        hash = hashOf(view());
        _rep->hash.store(hash, std::memory_order_relaxed);
    }
    return hash;
}

String String::lowercased() const {
    return isNull() ? String() : String(unicode::lowercased(view()));
}

String String::capitalized() const {
    return isNull() ? String() : String(unicode::capitalized(view()));
}

bool String::equalsIgnoringCase(std::string_view other) const {
    return !isNull() && unicode::equalIgnoringCase(view(), other);
}

} // namespace qx
