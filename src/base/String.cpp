#include <QXXMLMarshalling/base/String.h>

#include "base/MemoryBlocks.h"
#include "base/TextBlocks.h"
#include "base/Unicode.h"

#include <cstdlib>
#include <cstring>
#include <new>
#include <ostream>

#include <sys/auxv.h>

namespace qx {

inline String::Rep* String::newRep(void* memory, std::size_t size, bool isInBlock) noexcept {
    auto* const rep = new (memory) Rep{{1}, {0}, isInBlock, size & (SIZE_MAX >> 1)};
    reinterpret_cast<char*>(rep + 1)[size] = '\0';
    return rep;
}

// Memory that the C library can resize in place.
String::Rep* String::resized(Rep* rep, std::size_t size) {
    if (size > (SIZE_MAX >> 1) - sizeof(Rep) - 1)
        throw std::bad_alloc();
    void* const memory = std::realloc(static_cast<void*>(rep), sizeof(Rep) + size + 1);
    if (memory == nullptr)
        throw std::bad_alloc();
    return newRep(memory, size, false);
}

String::Rep* String::allocate(std::size_t size, std::uint32_t count) {
    Rep* const rep = resized(nullptr, size);
    rep->count.store(count, std::memory_order_relaxed);
    return rep;
}

void String::destroy(Rep* rep) noexcept {
    const bool isInBlock = rep->isInBlock != 0;
    rep->~Rep();
    if (isInBlock)
        MemoryBlocks::release(rep);
    else
        std::free(rep);
}

String textInBlock(std::string_view text) {
    constexpr std::size_t longest = 256;
    if (text.empty() || text.size() > longest)
        return text;
    void* const memory = MemoryBlocks::ofTexts().allocate(sizeof(String::Rep) + text.size() + 1);
    auto* const rep = String::newRep(memory, text.size(), true);
    std::memcpy(reinterpret_cast<char*>(rep + 1), text.data(), text.size());
    return String(rep);
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

std::ostream& String::print(std::ostream& out) const { return out << view(); }

namespace {

// Differs from process to process, so that no document can be written whose names all meet in one
// place of a table. The kernel hands each process these bytes: they are there before any static
// object is made.
std::uint64_t hashSeed() noexcept {
    std::uint64_t seed = 0;
    // NOLINTNEXTLINE(performance-no-int-to-ptr): this is how the kernel gives the address
    if (const auto* random = reinterpret_cast<const char*>(getauxval(AT_RANDOM)))
        std::memcpy(&seed, random, sizeof(seed));
    return seed;
}

} // namespace

// FNV-1a; 0 is kept free for "not worked out yet".
std::uint32_t String::hashOf(std::string_view text) noexcept {
    static const std::uint64_t seed = hashSeed();
    std::uint64_t hash = seed ^ 0xcbf29ce484222325U;
    for (const char c : text) {
        hash ^= static_cast<unsigned char>(c);
        hash *= 0x100000001b3U;
    }
    hash ^= hash >> 32;
    hash *= 0x9e3779b97f4a7c15U;
    const auto folded = static_cast<std::uint32_t>(hash >> 32);
    return folded != 0 ? folded : 1;
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
