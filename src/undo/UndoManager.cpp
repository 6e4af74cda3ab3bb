#include <QXXMLMarshalling/undo/UndoManager.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/MethodSignature.h>

#include "undo/UndoPerformance.h"

#include <utility>

namespace qx {

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
    if (state.doing == State::Doing::nothing && step.actionName.isNull())
        step.actionName = actionName;
    return identifier;
}

void UndoManager::endUndoGrouping() {
    const Ref<UndoManager> kept(this);
    const std::size_t least = _state->doing == State::Doing::nothing ? 0 : _state->floor + 1;
    if (_state->open.size() <= least)
        State::raiseInconsistency("no undo group is open to be ended");
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
        State::raiseInconsistency("groups are open inside the undo group that opened by itself");
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
    action->arguments.reserve(State::argumentsOfChange);
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
        State::raiseInconsistency("undo registration is not disabled");
    --_state->disabled;
}

bool UndoManager::isUndoRegistrationEnabled() const noexcept {
    const State::Performance* performance = _state->performance;
    return _state->disabled == 0 && (performance == nullptr || !performance->isTakingBack());
}

void UndoManager::undo() {
    const Ref<UndoManager> kept(this);
    _state->prepareGroup();
    _state->closeOutermost("undo");
    _state->performLast(_state->history.undoStack(), State::Doing::undo);
}

void UndoManager::redo() {
    const Ref<UndoManager> kept(this);
    _state->prepareGroup();
    _state->closeOutermost("redo");
    _state->performLast(_state->history.redoStack(), State::Doing::redo);
}

void UndoManager::undoNestedGroup() {
    const Ref<UndoManager> kept(this);
    if (_state->doing != State::Doing::nothing)
        State::raiseInconsistency("undoNestedGroup was called by an undo action");
    _state->performLast(_state->open.empty() ? _state->history.undoStack() : *_state->open.back(),
                        State::Doing::undo);
}

bool UndoManager::isUndoing() const noexcept { return _state->doing == State::Doing::undo; }

bool UndoManager::isRedoing() const noexcept { return _state->doing == State::Doing::redo; }

bool UndoManager::canUndo() const noexcept {
    return _state->history.undoStack().count != 0 || _state->openGroupsHoldActions();
}

bool UndoManager::canRedo() const noexcept { return _state->history.redoStack().count != 0; }

std::uint64_t UndoManager::position() {
    const Ref<UndoManager> kept(this);
    if (_state->outermostOpenedByItself && _state->open.size() == 1)
        _state->closeGroup();
    return _state->position;
}

void UndoManager::setSavedMark() {
    const Ref<UndoManager> kept(this);
    setSavedMark(position());
}

void UndoManager::setSavedMark(std::uint64_t position) noexcept {
    _state->savedPosition = position;
}

bool UndoManager::isAtSavedMark() const noexcept {
    return _state->position == _state->savedPosition && !_state->openGroupsHoldActions();
}

void UndoManager::removeAllActions() {
    const Ref<UndoManager> kept(this);
    State& state = *_state;
    UndoItemGroup removed;
    for (UndoItemGroup* stack : {&state.history.undoStack(), &state.history.redoStack()})
        removed.takeAll(*stack);
    for (const auto& group : state.open)
        removed.takeAll(*group);
    if (state.performance != nullptr)
        state.performance->removeActions(removed);
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
