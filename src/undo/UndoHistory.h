#pragma once

// The memory of an undo manager: a tree of groups and actions. The two stacks are groups whose
// children are the entries; the children of an entry are actions and nested groups. Every list is
// linked, and so are the actions of one target, so that forgetting a target costs what it has here.
//
// Ending an action may run a host's destructors, which may come back in here: items are unlinked
// first and destroyed last. An action that is being performed is in no group, but still among those
// of its target, whose room here so lasts; its performer destroys it.

#include <QXXMLMarshalling/model/Value.h>

#include "model/ObjectExtras.h"

#include <unordered_map>
#include <vector>

namespace qx {

struct UndoItemGroup;

struct UndoItem {
    explicit UndoItem(bool group) noexcept : isGroup(group) {}

    UndoItem* previous = nullptr;
    UndoItem* next = nullptr;
    UndoItemGroup* parent = nullptr;
    const bool isGroup;
};

struct UndoAction : UndoItem {
    UndoAction() noexcept : UndoItem(false) {}
    void performOn(Object& object);

    Object* target = nullptr;
    UndoAction* previousOfTarget = nullptr;
    UndoAction* nextOfTarget = nullptr;
    Selector selector;
    std::vector<Value> arguments;
    detail::UniqueFunction<void(Object&)> call; // instead of the selector, where it is set
};

struct UndoItemGroup : UndoItem {
    UndoItemGroup() noexcept : UndoItem(true) {}

    UndoItem* first = nullptr;
    UndoItem* last = nullptr;
    std::size_t count = 0;
    // Stays when it is empty: a stack, a group that is open or performed.
    bool stays = true;
    std::uint64_t identifier = 0;
    std::uint64_t leadsTo = 0; // of an entry: the position that performing it ends at
    String actionName;

    void append(UndoItem& item) noexcept;
    void unlink(UndoItem& item) noexcept;
    // Moves the other's items to the end.
    void takeAll(UndoItemGroup& other) noexcept;
    // The same, the other's last item first.
    void takeAllReversed(UndoItemGroup& other) noexcept;
};

class UndoHistory final : private EndListener {
public:
    UndoHistory() noexcept = default;
    ~UndoHistory();
    UndoHistory(const UndoHistory&) = delete;
    UndoHistory& operator=(const UndoHistory&) = delete;

    UndoItemGroup& undoStack() noexcept { return _undoStack; }
    UndoItemGroup& redoStack() noexcept { return _redoStack; }

    // Adds the action to the group and to those of its target. Cannot fail after makeRoomFor.
    void add(UndoAction* action, UndoItemGroup& group);
    // The room lasts until the target's last action goes.
    void makeRoomFor(Object& target);
    void forgetTarget(const Object* target) noexcept;
    // Takes an action that is being performed from its target.
    void forgetPerformed(UndoAction& action) noexcept;
    // Destroys the item; it must be unlinked.
    void destroy(UndoItem* item) noexcept;
    void removeContents(UndoItemGroup& group) noexcept;
    // Takes the last action out, those of nested groups one by one; null when there is none left.
    // It belongs to the caller; its target is null once it was forgotten meanwhile.
    static UndoAction* takeLastAction(UndoItemGroup& group) noexcept;

private:
    void objectEnds(Object& object) noexcept override { forgetTarget(&object); }
    void unlinkFromTarget(UndoAction& action) noexcept;

    UndoItemGroup _undoStack;
    UndoItemGroup _redoStack;
    std::unordered_map<Object*, UndoAction*> _firstOfTarget; // null: only room
};

} // namespace qx
