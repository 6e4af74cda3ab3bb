#pragma once

// Memory that fails when a test says so: it replaces operator new, what the C parser allocates with
// and, where that can be done, realloc, and belongs in one source of a program.
//
//     failing::eachAllocation([](long n) {
//         return failing::run(n, [] { … }); // the n-th allocation fails in there
//     });

#include <cstddef>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <new>

#include <dlfcn.h>
#include <libxml/parser.h>

namespace failing {

constexpr long never = -1;
inline long countdown = never; // allocations until one fails
inline bool allFollowing = false;
inline long failures = 0;

inline bool failsNow() noexcept {
    if (countdown > 0)
        --countdown;
    else if (countdown == 0) {
        ++failures;
        countdown = allFollowing ? 0 : never;
        return true;
    }
    return false;
}

inline void* allocate(std::size_t size,
                      std::size_t alignment = alignof(std::max_align_t)) noexcept {
    return failsNow() ? nullptr
                      : std::aligned_alloc(alignment, (size + alignment) / alignment * alignment);
}

// Not inlined, where the compiler would miss its counterpart.
[[gnu::noinline]] inline void release(void* memory) noexcept { std::free(memory); }

inline void* orBadAlloc(void* memory) {
    if (memory == nullptr)
        throw std::bad_alloc();
    return memory;
}

enum class Outcome {
    failed,      // it ended in std::bad_alloc
    managed,     // it went on without the memory
    undisturbed, // it needs fewer allocations
};

// Runs the step, of whose allocations the n-th fails, from 0 on.
inline Outcome run(long n, const std::function<void()>& step) {
    failures = 0;
    countdown = n;
    Outcome outcome = Outcome::failed;
    try {
        step();
        outcome = failures > 0 ? Outcome::managed : Outcome::undisturbed;
    } catch (const std::bad_alloc&) {
    }
    countdown = never;
    return outcome;
}

// Calls the function for each n until it is undisturbed: once with single failures, and once where
// all allocations behind the failing one fail as well.
inline void eachAllocation(const std::function<Outcome(long)>& attempt) {
    for (const bool all : {false, true}) {
        allFollowing = all;
        for (long n = 0; attempt(n) != Outcome::undisturbed;)
            ++n;
    }
}

// To be called before anything is parsed.
inline void replaceParserMemory() {
    const auto reallocate = [](void* block, std::size_t size) {
#ifdef __clang__
        if (failsNow())
            return static_cast<void*>(nullptr);
#endif
        return std::realloc(block, size);
    };
    const auto duplicate = [](const char* text) {
        void* const copy = allocate(std::strlen(text) + 1);
        return copy != nullptr ? std::strcpy(static_cast<char*>(copy), text) : nullptr;
    };
    const auto take = [](std::size_t size) { return allocate(size); };
    if (::xmlMemSetup(std::free, take, reallocate, duplicate) != 0)
        std::abort();
}

} // namespace failing

// The memory of texts. What Clang links into a program of its own for the sanitizers stays there.
#ifndef __clang__
extern "C" void* realloc(void* memory, std::size_t size) {
    using Realloc = void* (*)(void*, std::size_t);
    static const auto next = reinterpret_cast<Realloc>(::dlsym(RTLD_NEXT, "realloc"));
    return failing::failsNow() ? nullptr : next(memory, size);
}
#endif

void* operator new(std::size_t size) { return failing::orBadAlloc(failing::allocate(size)); }
void* operator new[](std::size_t size) { return failing::orBadAlloc(failing::allocate(size)); }
void* operator new(std::size_t size, std::align_val_t alignment) {
    return failing::orBadAlloc(failing::allocate(size, static_cast<std::size_t>(alignment)));
}
void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
    return failing::allocate(size);
}
void operator delete(void* memory) noexcept { failing::release(memory); }
void operator delete[](void* memory) noexcept { failing::release(memory); }
void operator delete(void* memory, std::size_t) noexcept { failing::release(memory); }
void operator delete[](void* memory, std::size_t) noexcept { failing::release(memory); }
void operator delete(void* memory, std::align_val_t) noexcept { failing::release(memory); }
void operator delete(void* memory, std::size_t, std::align_val_t) noexcept {
    failing::release(memory);
}
