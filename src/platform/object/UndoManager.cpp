#include <QXXMLMarshalling/platform/UndoManager.h>

#include <QXXMLMarshalling/platform/Class.h>
#include <QXXMLMarshalling/platform/Exception.h>
#include <QXXMLMarshalling/platform/MethodSignature.h>

#include "platform/object/UndoHistory.h"

#include <algorithm>

namespace qx {

namespace {

enum class Doing : std::uint8_t { nothing, undo, redo };

[[noreturn]] void raiseInconsistency(std::string_view reason) {
    throw Exception(Exception::internalInconsistency, reason);
}

} // namespace

struct UndoManager::State {
    UndoHistory history;
    std::vector<std::unique_ptr<UndoItemGroup>> open; // the outermost first
    // Groups below this one were open when an undo began: its actions cannot end them.
    std::size_t floor = 0;
    UndoItemGroup* performed = nullptr;
    Doing doing = Doing::nothing;
    bool groupsByEvent = true;
    bool outermostOpenedByItself = false;
    std::size_t disabled = 0;
    std::size_t levels = 0;
    std::uint64_t lastIdentifier = 0;

    UndoItemGroup& destination() noexcept {
        return doing == Doing::undo ? history.redoStack() : history.undoStack();
    }

    UndoItemGroup& openGroup() {
        auto group = std::make_unique<UndoItemGroup>();
        group->identifier = ++lastIdentifier;
        open.push_back(std::move(group));
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

// Performs the last group of the stack. Whatever is registered meanwhile goes into one group, which
// becomes an entry of the other stack when all has gone well.
void UndoManager::State::performLast(UndoItemGroup& stack, Doing what) {
    if (stack.last == nullptr)
        return;
    if (!stack.last->isGroup)
        raiseInconsistency("the last entry of the open group is an action, not a nested group");

    struct Performance {
        State& state;
        std::unique_ptr<UndoItemGroup> group;
        std::size_t outerFloor = state.floor;
        bool completed = false;

        ~Performance() {
            if (!completed)
                state.history.removeContents(*group);
            while (state.open.size() > state.floor) {
                if (!completed)
                    state.history.removeContents(*state.open.back());
                state.closeGroup();
            }
            state.performed = nullptr;
            state.doing = Doing::nothing;
            state.floor = outerFloor;
        }
    };

    UndoItemGroup& recording = openGroup();
    auto* group = static_cast<UndoItemGroup*>(stack.last);
    stack.unlink(*group);
    group->stays = true;
    recording.actionName = group->actionName;
    performed = group;
    doing = what;
    Performance performance{*this, std::unique_ptr<UndoItemGroup>(group)};
    floor = open.size() - 1;

    while (UndoAction* last = history.takeLastAction(*group)) {
        const std::unique_ptr<UndoAction> action(last);
        if (ObjectInternals::isEnding(*action->target))
            continue;
        const Ref<Object> target(action->target);
        action->performOn(*target);
    }
    performance.completed = true;
}

UndoManager::UndoManager() : _state(std::make_unique<State>()) {}

UndoManager::~UndoManager() {
    for (const auto& group : _state->open)
        _state->history.removeContents(*group);
}

void UndoManager::beginUndoGrouping() { beginGroup(); }

std::uint64_t UndoManager::beginGroup() { return _state->openGroup().identifier; }

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

void UndoManager::registerOperation(Object* target, Selector selector,
                                    std::vector<Value> arguments) {
    if (!isUndoRegistrationEnabled())
        return;
    if (target == nullptr)
        throw Exception(Exception::invalidArgument, "an undo action was registered without target");
    if (ObjectInternals::isEnding(*target))
        return;
    if (!target->respondsTo(selector) && !target->methodSignatureForSelector(selector))
        throw Exception(
            Exception::invalidArgument,
            String::concat({"an undo action was registered for the operation ", selector.name(),
                            ", which class ", target->isa().name(), " does not answer"}));
    const Ref<UndoManager> kept(this);
    auto action = std::make_unique<UndoAction>();
    action->target = target;
    action->selector = selector;
    action->arguments = std::move(arguments);
    _state->add(std::move(action));
}

void UndoManager::registerCall(Object& target, std::function<void(Object&)> call) {
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

bool UndoManager::isUndoRegistrationEnabled() const noexcept { return _state->disabled == 0; }

void UndoManager::undo() {
    const Ref<UndoManager> kept(this);
    _state->closeOutermost("undo");
    _state->performLast(_state->history.undoStack(), Doing::undo);
}

void UndoManager::redo() {
    const Ref<UndoManager> kept(this);
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
    if (state.performed != nullptr)
        removed.takeAll(*state.performed);
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
    if (manager == nullptr)
        return;
    _identifier = manager->beginGroup();
    if (!actionName.isNull())
        manager->setActionName(actionName);
}

UndoGroup::~UndoGroup() {
    if (_manager)
        _manager->endGroup(_identifier);
}

} // namespace qx
