#pragma once

// Host code that steps in while the library is calling it.

#include <functional>
#include <utility>

namespace support {

// Does `act` at the call of the host that `countdown` names, counted from 0.
struct Meddling {
    static inline std::function<void()> act;
    static inline int countdown = -1;
    static void call() {
        if (countdown-- == 0)
            act();
    }
    // Whether there were as many calls in the course of it.
    template <class Course>
    static bool during(int call, std::function<void()> what, Course course) {
        act = std::move(what);
        countdown = call;
        course();
        return std::exchange(countdown, -1) < 0;
    }
};

} // namespace support
