#pragma once

// A callable that is kept, and called, by one owner: it can be moved only, and so can what it
// holds.
//
//     | callable, or a pointer to it 16 | operations 8 |
//
// A callable of two pointers' size that moves without throwing lies inside, any other on the heap.
// An empty std::function, a null function pointer and nullptr make an empty one.

#include <concepts>
#include <cstddef>
#include <functional>
#include <new>
#include <type_traits>
#include <utility>

namespace qx::detail {

template <class F>
bool isEmptyCallable(const F& call) {
    if constexpr (std::is_pointer_v<F> || std::is_member_pointer_v<F>)
        return call == nullptr;
    else if constexpr (
        requires { call == nullptr; } && !requires { +call; }) // no lambda
        return call == nullptr;
    else
        return false;
}

template <class Signature>
class UniqueFunction;

template <class R, class... Arguments>
class UniqueFunction<R(Arguments...)> {
public:
    UniqueFunction() noexcept = default;
    UniqueFunction(std::nullptr_t) noexcept {}
    template <class F>
    requires(!std::same_as<std::decay_t<F>, UniqueFunction> &&
             std::is_invocable_r_v<R, std::decay_t<F>&, Arguments...>) UniqueFunction(F&& call) {
        using Held = std::decay_t<F>;
        if (isEmptyCallable<Held>(call))
            return;
        if constexpr (fitsInside<Held>)
            new (_room) Held(std::forward<F>(call));
        else
            new (_room) Held*(new Held(std::forward<F>(call)));
        _operations = &operationsOf<Held>;
    }
    UniqueFunction(UniqueFunction&& other) noexcept { take(other); }
    UniqueFunction& operator=(UniqueFunction&& other) noexcept {
        if (this != &other) {
            UniqueFunction before(std::move(*this)); // ends last: it may lead back here
            take(other);
        }
        return *this;
    }
    ~UniqueFunction() {
        if (_operations != nullptr)
            _operations->end(_room);
    }

    explicit operator bool() const noexcept { return _operations != nullptr; }
    // Must not be empty.
    R operator()(Arguments... arguments) {
        return _operations->call(_room, std::forward<Arguments>(arguments)...);
    }

private:
    struct Operations {
        R (*call)(void* room, Arguments&&... arguments);
        void (*moveTo)(void* from, void* to) noexcept; // leaves nothing at `from`
        void (*end)(void* room) noexcept;
    };

    static constexpr std::size_t size = 2 * sizeof(void*);
    template <class F>
    static constexpr bool
        fitsInside = sizeof(F) <= size &&
                     alignof(F) <= alignof(void*) && std::is_nothrow_move_constructible_v<F>;

    template <class F>
    static F& heldIn(void* room) noexcept {
        if constexpr (fitsInside<F>)
            return *std::launder(static_cast<F*>(room));
        else
            return **std::launder(static_cast<F**>(room));
    }
    template <class F>
    static R call(void* room, Arguments&&... arguments) {
        return static_cast<R>(std::invoke(heldIn<F>(room), std::forward<Arguments>(arguments)...));
    }
    template <class F>
    static void moveTo(void* from, void* to) noexcept {
        if constexpr (fitsInside<F>) {
            new (to) F(std::move(heldIn<F>(from)));
            heldIn<F>(from).~F();
        } else {
            new (to) F*(&heldIn<F>(from));
        }
    }
    template <class F>
    static void end(void* room) noexcept {
        if constexpr (fitsInside<F>)
            heldIn<F>(room).~F();
        else
            delete &heldIn<F>(room);
    }
    template <class F>
    static constexpr Operations operationsOf{&call<F>, &moveTo<F>, &end<F>};

    // This one must be empty.
    void take(UniqueFunction& other) noexcept {
        if (other._operations == nullptr)
            return;
        other._operations->moveTo(other._room, _room);
        _operations = std::exchange(other._operations, nullptr);
    }

    alignas(void*) std::byte _room[size];
    const Operations* _operations = nullptr;
};

} // namespace qx::detail
