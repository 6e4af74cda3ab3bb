#pragma once

// Operations of which each allocation fails, one run after the other: once alone, once with all
// that follow. One then ends in std::bad_alloc or does what it does otherwise, and one that ended
// does its work on the same objects when it is called again.

#include "FailingMemory.h"

#include <functional>
#include <iostream>
#include <string>

// An operation of whose allocations one fails, and what it works on: made anew for each run.
struct Trial {
    std::function<void()> operation;
    // What the operation gave and changed.
    std::function<std::string()> outcome;
    // What a failure must leave as it was.
    std::function<std::string()> kept = [] { return std::string(); };
    // Makes up for what a failure may leave changed, before the operation is called again.
    std::function<void()> restore = [] {};
};

inline int faults = 0;

inline void tryEach(const std::string& name, const std::function<Trial()>& make) {
    const auto run = [](const Trial& trial) {
        trial.operation();
        return trial.outcome();
    };
    const std::string expected = run(make());
    failing::eachAllocation([&](long n) {
        const auto compare = [&](const char* when, const std::string& got,
                                 const std::string& wanted) {
            if (got != wanted && ++faults < 20)
                std::cout << name << when << (failing::allFollowing ? ", from" : ", at")
                          << " allocation " << n << ":\n  " << got << "\ninstead of\n  " << wanted
                          << '\n';
        };
        const Trial trial = make();
        const std::string before = trial.kept();
        const failing::Outcome end = failing::run(n, trial.operation);
        if (end == failing::Outcome::failed) {
            compare(" changed something", trial.kept(), before);
            // The first trial ends as it is: what a failure left in it must end with it.
            const Trial again = make();
            failing::run(n, again.operation);
            again.restore();
            compare(" called again", run(again), expected);
        } else {
            compare("", trial.outcome(), expected);
        }
        return end;
    });
}
