#pragma once

// Remembers how to take changes back. An action is a call on a target; actions are collected in
// groups, and undo() performs the last group in reverse order. What the targets register meanwhile
// becomes the group that redo() performs, and the other way round.
//
//     const qx::UndoGroup group(manager, "Rename");              // closed with its scope
//     manager.prepareWithInvocationTarget(&person).perform("setName:", person.name());
//     manager.registerUndo(person, [old = person.age](Person& p) { p.setAge(old); });
//
// Targets are not kept alive: with a target its actions end. Arguments are kept alive, so a target
// that is its own argument lives until the action goes; removeAllActions() breaks such rings.
//
// Without an open group a registration opens one by itself (unless setGroupsByEvent(false)); it
// ends with endEventGroup(), undo(), redo(), endUndoGrouping() or the next UndoGroup. A group
// without actions leaves no entry. A manager belongs to one thread at a time. Faults raise
// NSInternalInconsistencyException: a group ended that is not open, a registration outside any
// group when none opens by itself, undo and redo inside nested groups or called by an action.

#include <QXXMLMarshalling/model/Object.h>

#include <cstdint>
#include <functional>
#include <memory>
#include <vector>

namespace qx {

class UndoManager;

// Takes one call down as an undo action; see UndoManager::prepareWithInvocationTarget.
class QX_API UndoRecorder {
public:
    // Raises NSInvalidArgumentException for a null target, and for one that does not answer the
    // operation.
    template <class... Arguments>
    void perform(Selector selector, const Arguments&... arguments) const {
        performWithArguments(selector, {Value(arguments)...});
    }
    void performWithArguments(Selector selector, std::vector<Value> arguments) const;

private:
    friend class UndoManager;
    UndoRecorder(UndoManager& manager, Object* target) noexcept
        : _manager(manager), _target(target) {}

    UndoManager& _manager;
    Object* _target;
};

class QX_API UndoManager final : public Object {
public:
    UndoManager();
    ~UndoManager() override;

    // Groups nest; a group that ends at the outermost level becomes one entry to undo.
    void beginUndoGrouping();
    void endUndoGrouping();
    // How many groups are open; the one that opened by itself counts.
    std::size_t groupingLevel() const noexcept;
    // Whether a registration outside any group opens one; true from the start.
    bool groupsByEvent() const noexcept;
    void setGroupsByEvent(bool groupsByEvent) noexcept;
    // Ends the group that opened by itself; does nothing when there is none.
    void endEventGroup();

    // The target's operation with one argument, or with none where its name holds no colon. Raises
    // NSInvalidArgumentException for a null target, and for one that does not answer the operation;
    // nothing is looked at while registration is disabled.
    void registerUndoWithTarget(Object* target, Selector selector, const Value& object);
    // The call comes with UndoRecorder::perform, which raises the same.
    [[nodiscard]] UndoRecorder prepareWithInvocationTarget(Object* target);
    // Undone by call(target). The callable need not be copyable; what it holds is kept alive.
    template <std::derived_from<Object> T, std::invocable<T&> F>
    void registerUndo(T& target, F call) {
        registerCall(target, [call = std::move(call)](Object& object) mutable {
            std::invoke(call, static_cast<T&>(object));
        });
    }

    // Counted: each disabling needs its enabling; one enabling too many raises.
    void disableUndoRegistration() noexcept;
    void enableUndoRegistration();
    bool isUndoRegistrationEnabled() const noexcept;

    // Ends the group that is open, if there is one, and performs the last group. With nothing to
    // undo nothing happens. Where actions throw, observers of their changes say, the others are
    // performed all the same, and the first exception comes out at the end. But std::bad_alloc
    // stops: what was changed is changed back, and the group can be undone again. Should memory
    // fail for that too, the values in between stay, and both undo() and redo() lead on from them.
    void undo();
    void redo();
    // The same for the last group inside the one that is open, which stays open.
    void undoNestedGroup();
    bool isUndoing() const noexcept;
    bool isRedoing() const noexcept;
    bool canUndo() const noexcept;
    bool canRedo() const noexcept;

    // The mark says what was saved: set where all was saved, it is left by a change that is
    // registered, and reached again by undo() and redo(). At first it stands where the manager
    // begins. Setting it ends the group that opened by itself; what another open group holds counts
    // as changed until it is undone.
    void setSavedMark();
    // The same for a save that takes its time: what is registered after position() is not saved.
    // Asking for it ends the group that opened by itself, too.
    std::uint64_t position();
    void setSavedMark(std::uint64_t position) noexcept;
    bool isAtSavedMark() const noexcept;

    // Forgets all actions, those in open groups too; the groups stay open, but for the one that
    // opened by itself. Registration stays enabled or disabled as it is.
    void removeAllActions();
    // May be called by the target's destructor; one look-up when the target has no actions here.
    void removeAllActionsWithTarget(const Object* target);

    // How many groups are kept, the oldest go first; 0, as from the start, is no limit.
    std::size_t levelsOfUndo() const noexcept;
    void setLevelsOfUndo(std::size_t levels);

    // Names the outermost open group, else the last entry. The name goes along from undo to redo.
    void setActionName(const String& name);
    // The name of what undo() or redo() would perform; null without a name.
    String undoActionName() const;
    String redoActionName() const;

private:
    friend class ChangeTracking;
    friend class UndoGroup;
    friend class UndoRecorder;
    struct State;

    void registerCall(Object& target, detail::UniqueFunction<void(Object&)> call);
    void registerOperation(Object* target, Selector selector, std::vector<Value> arguments);
    std::uint64_t beginGroup(const String& actionName);
    // To be called before a change, so that it can be registered afterwards though memory fails.
    void prepareChange(Object& target);
    void registerChange(Object& target, Selector selector, const Value& before, Key key);
    void endGroup(std::uint64_t identifier) noexcept;

    std::unique_ptr<State> _state;
};

// A group that ends with the scope, however it is left, together with groups left open inside it.
// A group that has ended otherwise meanwhile is left alone. Without a manager nothing happens.
//
// The group that opened by itself ends first: outside any other group, the guard is a step of its
// own. The name is that of the step; inside a step that has one it says nothing.
class QX_API UndoGroup {
public:
    [[nodiscard]] explicit UndoGroup(UndoManager* manager, const String& actionName = nullptr);
    [[nodiscard]] explicit UndoGroup(UndoManager& manager, const String& actionName = nullptr)
        : UndoGroup(&manager, actionName) {}
    [[nodiscard]] explicit UndoGroup(const Ref<UndoManager>& manager,
                                     const String& actionName = nullptr)
        : UndoGroup(manager.get(), actionName) {}
    ~UndoGroup();
    UndoGroup(const UndoGroup&) = delete;
    UndoGroup& operator=(const UndoGroup&) = delete;

private:
    Ref<UndoManager> _manager;
    std::uint64_t _identifier = 0;
};

} // namespace qx
