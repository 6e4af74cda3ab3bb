#include "undo/UndoPerformance.h"

#include <new>

namespace qx {

UndoManager::State::Performance::Performance(State& state, UndoItemGroup& stack, Doing what)
    : _state(state), _stack(stack), _outerFloor(state.floor) {
    _state.prepareGroup();
    _group.reset(static_cast<UndoItemGroup*>(_stack.last));
    _stack.unlink(*_group);
    _group->stays = true;
    _state.openGroup().actionName = _group->actionName;
    _state.floor = _state.open.size() - 1;
    _state.performance = this;
    _state.doing = what;
}

// Performs the group's actions, each moved to `to` then. What they throw first is kept. False when
// memory failed: the rest is left.
bool UndoManager::State::Performance::perform(UndoItemGroup& from, UndoItemGroup& to,
                                              std::exception_ptr& thrown) noexcept {
    while ((_running = UndoHistory::takeLastAction(from)) != nullptr) {
        bool memoryLasts = true;
        try {
            if (!ObjectInternals::isEnding(*_running->target)) {
                const Ref<Object> target(_running->target);
                _running->performOn(*target);
            }
        } catch (const std::bad_alloc&) {
            thrown = std::current_exception();
            memoryLasts = false;
        } catch (...) {
            if (!thrown)
                thrown = std::current_exception();
        }
        UndoAction* const action = std::exchange(_running, nullptr);
        if (action->target != nullptr)
            to.append(*action);
        else
            delete action;
        if (!memoryLasts)
            return false;
    }
    return true;
}

void UndoManager::State::Performance::run() {
    std::exception_ptr thrown;
    if (perform(*_group, _performed, thrown))
        finish();
    else
        takeBack();
    // Ends arguments of the host, when nothing here is in use any more.
    _state.history.removeContents(_performed);
    if (thrown)
        std::rethrow_exception(thrown);
}

// A group inside an open one is no entry: redoing it leads to where nothing was before.
void UndoManager::State::Performance::finish() noexcept {
    UndoHistory& history = _state.history;
    const bool isEntry = &_stack == &history.undoStack() || &_stack == &history.redoStack();
    const std::uint64_t before = _state.position;
    if (!isEntry)
        _state.position = ++_state.lastPosition;
    end();
    _state.position = isEntry ? _group->leadsTo : before;
}

void UndoManager::State::Performance::closeGroupsAbove(std::size_t level) noexcept {
    while (_state.open.size() > level)
        _state.closeGroup();
}

void UndoManager::State::Performance::end() noexcept {
    closeGroupsAbove(_state.floor);
    _state.performance = nullptr;
    _state.doing = Doing::nothing;
    _state.floor = _outerFloor;
}

// Where memory does not even suffice for that, the recording is kept too: both groups then set
// values that some objects have already, and nothing is lost.
void UndoManager::State::Performance::takeBack() noexcept {
    closeGroupsAbove(_state.floor + 1);
    _isTakingBack = true;
    std::exception_ptr ignored;
    bool memoryLasts = true;
    while (!perform(recording(), _takenBack, ignored))
        memoryLasts = false;
    closeGroupsAbove(_state.floor + 1);
    if (!memoryLasts)
        recording().takeAllReversed(_takenBack);
    _group->takeAllReversed(_performed);
    _performed.takeAll(_takenBack);
    end();
    _group->stays = false;
    if (_group->count != 0)
        _stack.append(*_group.release());
}

void UndoManager::State::Performance::removeActions(UndoItemGroup& removed) noexcept {
    for (UndoItemGroup* group : {_group.get(), &_performed, &_takenBack})
        removed.takeAll(*group);
    if (_running != nullptr && _running->target != nullptr)
        _state.history.forgetPerformed(*_running);
}

void UndoManager::State::performLast(UndoItemGroup& stack, Doing what) {
    if (stack.last == nullptr)
        return;
    if (!stack.last->isGroup)
        raiseInconsistency("the last entry of the open group is an action, not a nested group");
    Performance(*this, stack, what).run();
}

} // namespace qx
