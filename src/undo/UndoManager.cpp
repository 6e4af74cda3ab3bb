#include <QXXMLMarshalling/undo/UndoManager.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/MethodSignature.h>

#include "undo/UndoHistory.h"

#include <algorithm>
#include <exception>
#include <new>
#include <utility>

namespace qx {

namespace {

enum class Doing : std::uint8_t { nothing, undo, redo };

// How many changes that are announced at once are sure to be registered, should memory fail.
constexpr std::size_t spareActionCount = 8;
constexpr std::size_t argumentsOfChange = 2;

[[noreturn]] void raiseInconsistency(std::string_view reason) {
    throw Exception(Exception::internalInconsistency, reason);
}

} // namespace

struct UndoManager::State {
    struct Performance;

    UndoHistory history;
    std::vector<std::unique_ptr<UndoItemGroup>> open; // the outermost first
    // Made beforehand: what a change needs to be registered, once it has taken place.
    std::unique_ptr<UndoItemGroup> spareGroup;
    std::vector<std::unique_ptr<UndoAction>> spareActions;
    // Groups below this one were open when an undo began: its actions cannot end them.
    std::size_t floor = 0;
    Performance* performance = nullptr; // the undo or redo that runs
    Doing doing = Doing::nothing;
    bool groupsByEvent = true;
    bool outermostOpenedByItself = false;
    std::size_t disabled = 0;
    std::size_t levels = 0;
    std::uint64_t lastIdentifier = 0;

    UndoItemGroup& destination() noexcept {
        return doing == Doing::undo ? history.redoStack() : history.undoStack();
    }

    // After it one group opens without fail.
    void prepareGroup() {
        if (!spareGroup)
            spareGroup = std::make_unique<UndoItemGroup>();
        if (open.size() == open.capacity())
            open.reserve(2 * open.size() + 1);
    }

    // After it a change of the target is registered without fail.
    void prepareChange(Object& target) {
        prepareGroup();
        spareActions.reserve(spareActionCount);
        while (spareActions.size() < spareActionCount) {
            auto action = std::make_unique<UndoAction>();
            action->arguments.reserve(argumentsOfChange);
            spareActions.push_back(std::move(action));
        }
        history.makeRoomFor(target);
    }

    std::unique_ptr<UndoAction> takeAction() {
        if (spareActions.empty())
            return std::make_unique<UndoAction>();
        std::unique_ptr<UndoAction> action = std::move(spareActions.back());
        spareActions.pop_back();
        return action;
    }

    UndoItemGroup& openGroup() {
        prepareGroup();
        spareGroup->identifier = ++lastIdentifier;
        open.push_back(std::move(spareGroup));
        return *open.back();
    }

    // Ends the innermost group: an entry of the group around it, or of a stack.
    void closeGroup() noexcept {
        std::unique_ptr<UndoItemGroup> group = std::move(open.back());
        open.pop_back();
        if (open.empty())
            outermostOpenedByItself = false;
        if (group->count == 0)
            return;
        group->stays = false;
        if (open.size() > floor) {
            open.back()->append(*group.release());
        } else {
            destination().append(*group.release());
            trim();
        }
    }

    void trim() noexcept {
        for (UndoItemGroup* stack : {&history.undoStack(), &history.redoStack()}) {
            while (levels != 0 && stack->count > levels) {
                UndoItem* oldest = stack->first;
                stack->unlink(*oldest);
                history.destroy(oldest);
            }
        }
    }

    bool openGroupsHoldActions() const noexcept {
        return std::any_of(open.begin(), open.end(),
                           [](const auto& group) { return group->count != 0; });
    }

    // The group that a registration goes to; opens one where that is wanted.
    UndoItemGroup& groupForRegistration() {
        if (!open.empty())
            return *open.back();
        if (!groupsByEvent)
            raiseInconsistency("an undo action was registered outside any group");
        UndoItemGroup& group = openGroup();
        outermostOpenedByItself = true;
        return group;
    }

    void add(std::unique_ptr<UndoAction> action) {
        UndoItemGroup& group = groupForRegistration();
        history.add(action.get(), group);
        static_cast<void>(action.release()); // the history owns it
        if (doing == Doing::nothing)
            history.removeContents(history.redoStack());
    }

    void closeOutermost(std::string_view operation) {
        if (doing != Doing::nothing)
            raiseInconsistency(String::concat({operation, " was called by an undo action"}));
        if (open.size() > 1)
            raiseInconsistency(String::concat({operation, " was called inside a nested group"}));
        if (open.size() == 1)
            closeGroup();
    }

    void performLast(UndoItemGroup& stack, Doing what);
};

// One undo or redo: performs the last group of a stack. Whatever is registered meanwhile goes into
// one group, which becomes an entry of the other stack. Actions that were performed are kept until
// all is over: should memory fail, what was recorded is performed to take their effect back, and
// they return to where they were.
struct UndoManager::State::Performance {
    Performance(State& itsState, UndoItemGroup& itsStack, Doing what)
        : state(itsState), stack(itsStack), outerFloor(itsState.floor) {
        state.prepareGroup();
        group.reset(static_cast<UndoItemGroup*>(stack.last));
        stack.unlink(*group);
        group->stays = true;
        state.openGroup().actionName = group->actionName;
        state.floor = state.open.size() - 1;
        state.performance = this;
        state.doing = what;
    }

    UndoItemGroup& recording() noexcept { return *state.open[state.floor]; }

    // Performs the group's actions, each moved to `to` then. What they throw first is kept. False
    // when memory failed: the rest is left.
    bool perform(UndoItemGroup& from, UndoItemGroup& to, std::exception_ptr& thrown) noexcept {
        while ((running = UndoHistory::takeLastAction(from)) != nullptr) {
            bool memoryLasts = true;
            try {
                if (!ObjectInternals::isEnding(*running->target)) {
                    const Ref<Object> target(running->target);
                    running->performOn(*target);
                }
            } catch (const std::bad_alloc&) {
                thrown = std::current_exception();
                memoryLasts = false;
            } catch (...) {
                if (!thrown)
                    thrown = std::current_exception();
            }
            UndoAction* const action = std::exchange(running, nullptr);
            if (action->target != nullptr)
                to.append(*action);
            else
                delete action;
            if (!memoryLasts)
                return false;
        }
        return true;
    }

    void run() {
        std::exception_ptr thrown;
        if (perform(*group, performed, thrown))
            end();
        else
            takeBack();
        // Ends arguments of the host, when nothing here is in use any more.
        state.history.removeContents(performed);
        if (thrown)
            std::rethrow_exception(thrown);
    }

    void closeGroupsAbove(std::size_t level) noexcept {
        while (state.open.size() > level)
            state.closeGroup();
    }

    void end() noexcept {
        closeGroupsAbove(state.floor);
        state.performance = nullptr;
        state.doing = Doing::nothing;
        state.floor = outerFloor;
    }

    // Where memory does not even suffice for that, the recording is kept too: both groups then set
    // values that some objects have already, and nothing is lost.
    void takeBack() noexcept {
        closeGroupsAbove(state.floor + 1);
        isTakingBack = true;
        std::exception_ptr ignored;
        bool memoryLasts = true;
        while (!perform(recording(), takenBack, ignored))
            memoryLasts = false;
        closeGroupsAbove(state.floor + 1);
        if (!memoryLasts)
            recording().takeAllReversed(takenBack);
        group->takeAllReversed(performed);
        performed.takeAll(takenBack);
        end();
        group->stays = false;
        if (group->count != 0)
            stack.append(*group.release());
    }

    State& state;
    UndoItemGroup& stack;
    std::size_t outerFloor;
    std::unique_ptr<UndoItemGroup> group;
    UndoAction* running = nullptr;
    bool isTakingBack = false; // nothing is registered then
    UndoItemGroup performed;
    UndoItemGroup takenBack;
};

void UndoManager::State::performLast(UndoItemGroup& stack, Doing what) {
    if (stack.last == nullptr)
        return;
    if (!stack.last->isGroup)
        raiseInconsistency("the last entry of the open group is an action, not a nested group");
    Performance(*this, stack, what).run();
}

UndoManager::UndoManager() : _state(std::make_unique<State>()) {}

UndoManager::~UndoManager() {
    for (const auto& group : _state->open)
        _state->history.removeContents(*group);
}

void UndoManager::beginUndoGrouping() { _state->openGroup(); }

// What was registered outside any group is a step of its own, not the beginning of this one.
std::uint64_t UndoManager::beginGroup(const String& actionName) {
    State& state = *_state;
    state.prepareGroup();
    if (state.outermostOpenedByItself && state.open.size() == 1)
        state.closeGroup();
    const std::uint64_t identifier = state.openGroup().identifier;
    UndoItemGroup& step = *state.open.front();
    if (state.doing == Doing::nothing && step.actionName.isNull())
        step.actionName = actionName;
    return identifier;
}

void UndoManager::endUndoGrouping() {
    const Ref<UndoManager> kept(this);
    const std::size_t least = _state->doing == Doing::nothing ? 0 : _state->floor + 1;
    if (_state->open.size() <= least)
        raiseInconsistency("no undo group is open to be ended");
    _state->closeGroup();
}

void UndoManager::endGroup(std::uint64_t identifier) noexcept {
    const auto& open = _state->open;
    std::size_t index = open.size();
    while (index > _state->floor && open[index - 1]->identifier != identifier)
        --index;
    if (index == _state->floor)
        return;
    while (open.size() >= index)
        _state->closeGroup();
}

std::size_t UndoManager::groupingLevel() const noexcept { return _state->open.size(); }

bool UndoManager::groupsByEvent() const noexcept { return _state->groupsByEvent; }

void UndoManager::setGroupsByEvent(bool groupsByEvent) noexcept {
    _state->groupsByEvent = groupsByEvent;
}

void UndoManager::endEventGroup() {
    if (!_state->outermostOpenedByItself)
        return;
    if (_state->open.size() > 1)
        raiseInconsistency("groups are open inside the undo group that opened by itself");
    endUndoGrouping();
}

void UndoManager::registerUndoWithTarget(Object* target, Selector selector, const Value& object) {
    std::vector<Value> arguments;
    if (selector.argumentCount() != 0)
        arguments.push_back(object);
    registerOperation(target, selector, std::move(arguments));
}

UndoRecorder UndoManager::prepareWithInvocationTarget(Object* target) { return {*this, target}; }

void UndoRecorder::performWithArguments(Selector selector, std::vector<Value> arguments) const {
    _manager.registerOperation(_target, selector, std::move(arguments));
}

namespace {

void checkAnswers(const Object& target, Selector selector) {
    if (!target.respondsTo(selector) && !target.methodSignatureForSelector(selector))
        throw Exception(
            Exception::invalidArgument,
            String::concat({"an undo action was registered for the operation ", selector.name(),
                            ", which class ", target.isa().name(), " does not answer"}));
}

} // namespace

void UndoManager::registerOperation(Object* target, Selector selector,
                                    std::vector<Value> arguments) {
    if (!isUndoRegistrationEnabled())
        return;
    if (target == nullptr)
        throw Exception(Exception::invalidArgument, "an undo action was registered without target");
    if (ObjectInternals::isEnding(*target))
        return;
    checkAnswers(*target, selector);
    const Ref<UndoManager> kept(this);
    auto action = std::make_unique<UndoAction>();
    action->target = target;
    action->selector = selector;
    action->arguments = std::move(arguments);
    _state->add(std::move(action));
}

void UndoManager::prepareChange(Object& target) {
    if (isUndoRegistrationEnabled() && !ObjectInternals::isEnding(target))
        _state->prepareChange(target);
}

void UndoManager::registerChange(Object& target, Selector selector, const Value& before, Key key) {
    if (!isUndoRegistrationEnabled() || ObjectInternals::isEnding(target))
        return;
    checkAnswers(target, selector);
    const Ref<UndoManager> kept(this);
    std::unique_ptr<UndoAction> action = _state->takeAction();
    action->target = &target;
    action->selector = selector;
    action->arguments.reserve(argumentsOfChange);
    action->arguments.push_back(before);
    action->arguments.emplace_back(key.string());
    _state->add(std::move(action));
}

void UndoManager::registerCall(Object& target, detail::UniqueFunction<void(Object&)> call) {
    if (!isUndoRegistrationEnabled() || ObjectInternals::isEnding(target))
        return;
    const Ref<UndoManager> kept(this);
    auto action = std::make_unique<UndoAction>();
    action->target = &target;
    action->call = std::move(call);
    _state->add(std::move(action));
}

void UndoManager::disableUndoRegistration() noexcept { ++_state->disabled; }

void UndoManager::enableUndoRegistration() {
    if (_state->disabled == 0)
        raiseInconsistency("undo registration is not disabled");
    --_state->disabled;
}

bool UndoManager::isUndoRegistrationEnabled() const noexcept {
    const State::Performance* performance = _state->performance;
    return _state->disabled == 0 && (performance == nullptr || !performance->isTakingBack);
}

void UndoManager::undo() {
    const Ref<UndoManager> kept(this);
    _state->prepareGroup();
    _state->closeOutermost("undo");
    _state->performLast(_state->history.undoStack(), Doing::undo);
}

void UndoManager::redo() {
    const Ref<UndoManager> kept(this);
    _state->prepareGroup();
    _state->closeOutermost("redo");
    _state->performLast(_state->history.redoStack(), Doing::redo);
}

void UndoManager::undoNestedGroup() {
    const Ref<UndoManager> kept(this);
    if (_state->doing != Doing::nothing)
        raiseInconsistency("undoNestedGroup was called by an undo action");
    _state->performLast(_state->open.empty() ? _state->history.undoStack() : *_state->open.back(),
                        Doing::undo);
}

bool UndoManager::isUndoing() const noexcept { return _state->doing == Doing::undo; }

bool UndoManager::isRedoing() const noexcept { return _state->doing == Doing::redo; }

bool UndoManager::canUndo() const noexcept {
    return _state->history.undoStack().count != 0 || _state->openGroupsHoldActions();
}

bool UndoManager::canRedo() const noexcept { return _state->history.redoStack().count != 0; }

void UndoManager::removeAllActions() {
    const Ref<UndoManager> kept(this);
    State& state = *_state;
    UndoItemGroup removed;
    for (UndoItemGroup* stack : {&state.history.undoStack(), &state.history.redoStack()})
        removed.takeAll(*stack);
    for (const auto& group : state.open)
        removed.takeAll(*group);
    if (State::Performance* performance = state.performance) {
        for (UndoItemGroup* group :
             {performance->group.get(), &performance->performed, &performance->takenBack})
            removed.takeAll(*group);
        if (UndoAction* running = performance->running; running && running->target)
            state.history.forgetPerformed(*running);
    }
    if (state.outermostOpenedByItself && state.open.size() == 1)
        state.closeGroup();
    state.history.removeContents(removed);
}

void UndoManager::removeAllActionsWithTarget(const Object* target) {
    const Ref<UndoManager> kept(this);
    _state->history.forgetTarget(target);
}

std::size_t UndoManager::levelsOfUndo() const noexcept { return _state->levels; }

void UndoManager::setLevelsOfUndo(std::size_t levels) {
    const Ref<UndoManager> kept(this);
    _state->levels = levels;
    _state->trim();
}

void UndoManager::setActionName(const String& name) {
    State& state = *_state;
    if (state.open.size() > state.floor)
        state.open[state.floor]->actionName = name;
    else if (UndoItem* last = state.history.undoStack().last)
        static_cast<UndoItemGroup*>(last)->actionName = name;
}

String UndoManager::undoActionName() const {
    const State& state = *_state;
    if (state.openGroupsHoldActions())
        return state.open.front()->actionName;
    const UndoItem* last = _state->history.undoStack().last;
    return last != nullptr ? static_cast<const UndoItemGroup*>(last)->actionName : String();
}

String UndoManager::redoActionName() const {
    const UndoItem* last = _state->history.redoStack().last;
    return last != nullptr ? static_cast<const UndoItemGroup*>(last)->actionName : String();
}

UndoGroup::UndoGroup(UndoManager* manager, const String& actionName) : _manager(manager) {
    if (manager != nullptr)
        _identifier = manager->beginGroup(actionName);
}

UndoGroup::~UndoGroup() {
    if (_manager)
        _manager->endGroup(_identifier);
}

} // namespace qx
