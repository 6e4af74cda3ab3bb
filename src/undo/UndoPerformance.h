#pragma once

#include "undo/UndoManagerState.h"

#include <exception>

namespace qx {

// One undo or redo: performs the last group of a stack. Whatever is registered meanwhile goes into
// one group, which becomes an entry of the other stack. Actions that were performed are kept until
// all is over: should memory fail, what was recorded is performed to take their effect back, and
// they return to where they were.
class UndoManager::State::Performance {
public:
    Performance(State& state, UndoItemGroup& stack, Doing what);

    // Throws what the actions threw first.
    void run();
    // Nothing is registered then.
    bool isTakingBack() const noexcept { return _isTakingBack; }
    // Moves the actions that it holds to the group; the one that runs is not kept.
    void removeActions(UndoItemGroup& removed) noexcept;

private:
    UndoItemGroup& recording() noexcept { return *_state.open[_state.floor]; }
    bool perform(UndoItemGroup& from, UndoItemGroup& to, std::exception_ptr& thrown) noexcept;
    void closeGroupsAbove(std::size_t level) noexcept;
    void takeBack() noexcept;
    void finish() noexcept;
    void end() noexcept;

    State& _state;
    UndoItemGroup& _stack;
    std::size_t _outerFloor;
    std::unique_ptr<UndoItemGroup> _group;
    UndoAction* _running = nullptr;
    bool _isTakingBack = false;
    UndoItemGroup _performed;
    UndoItemGroup _takenBack;
};

} // namespace qx
