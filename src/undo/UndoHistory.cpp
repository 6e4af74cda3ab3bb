#include "undo/UndoHistory.h"

namespace qx {

void UndoAction::performOn(Object& object) {
    if (call)
        call(object);
    else
        object.performWithArguments(selector, arguments);
}

void UndoItemGroup::append(UndoItem& item) noexcept {
    item.parent = this;
    item.previous = last;
    item.next = nullptr;
    (last != nullptr ? last->next : first) = &item;
    last = &item;
    ++count;
}

void UndoItemGroup::unlink(UndoItem& item) noexcept {
    (item.previous != nullptr ? item.previous->next : first) = item.next;
    (item.next != nullptr ? item.next->previous : last) = item.previous;
    item.parent = nullptr;
    item.previous = item.next = nullptr;
    --count;
}

void UndoItemGroup::takeAll(UndoItemGroup& other) noexcept {
    while (UndoItem* item = other.first) {
        other.unlink(*item);
        append(*item);
    }
}

void UndoItemGroup::takeAllReversed(UndoItemGroup& other) noexcept {
    while (UndoItem* item = other.last) {
        other.unlink(*item);
        append(*item);
    }
}

UndoHistory::~UndoHistory() {
    removeContents(_undoStack);
    removeContents(_redoStack);
    // Room may have been made for targets that got no action.
    for (const auto& [target, first] : _firstOfTarget)
        ObjectInternals::removeEndListener(*target, *this);
}

void UndoHistory::makeRoomFor(Object& target) {
    const auto [entry, isNew] = _firstOfTarget.try_emplace(&target, nullptr);
    if (!isNew)
        return;
    try {
        ObjectInternals::addEndListener(target, *this);
    } catch (...) {
        _firstOfTarget.erase(entry);
        throw;
    }
}

void UndoHistory::add(UndoAction* action, UndoItemGroup& group) {
    makeRoomFor(*action->target);
    UndoAction*& first = _firstOfTarget.find(action->target)->second;
    action->nextOfTarget = first;
    if (first != nullptr)
        first->previousOfTarget = action;
    first = action;
    group.append(*action);
}

void UndoHistory::unlinkFromTarget(UndoAction& action) noexcept {
    if (action.nextOfTarget != nullptr)
        action.nextOfTarget->previousOfTarget = action.previousOfTarget;
    if (action.previousOfTarget != nullptr) {
        action.previousOfTarget->nextOfTarget = action.nextOfTarget;
    } else if (action.nextOfTarget != nullptr) {
        _firstOfTarget.find(action.target)->second = action.nextOfTarget;
    } else {
        _firstOfTarget.erase(action.target);
        ObjectInternals::removeEndListener(*action.target, *this);
    }
    action.previousOfTarget = action.nextOfTarget = nullptr;
}

void UndoHistory::forgetTarget(const Object* target) noexcept {
    const auto found = _firstOfTarget.find(const_cast<Object*>(target));
    if (found == _firstOfTarget.end())
        return;
    if (found->second == nullptr) {
        ObjectInternals::removeEndListener(*found->first, *this);
        _firstOfTarget.erase(found);
        return;
    }
    UndoItemGroup forgotten;
    UndoAction* following = nullptr;
    for (UndoAction* action = found->second; action != nullptr; action = following) {
        following = action->nextOfTarget;
        if (action->parent == nullptr) {
            forgetPerformed(*action);
            continue;
        }
        // A group that this empties leaves no entry, nor do those around it.
        UndoItem* item = action;
        UndoItemGroup* parent = item->parent;
        parent->unlink(*item);
        while (parent->count == 0 && !parent->stays) {
            item = parent;
            parent = item->parent;
            parent->unlink(*item);
            forgotten.append(*item);
        }
        forgotten.append(*action);
    }
    removeContents(forgotten);
}

void UndoHistory::forgetPerformed(UndoAction& action) noexcept {
    unlinkFromTarget(action);
    action.target = nullptr;
}

void UndoHistory::destroy(UndoItem* item) noexcept {
    UndoItemGroup ending;
    ending.append(*item);
    removeContents(ending);
}

// What an action holds may hold the last reference to the manager: once the first of them goes,
// nothing of the history is touched.
void UndoHistory::removeContents(UndoItemGroup& group) noexcept {
    UndoItemGroup ending;
    UndoItemGroup actions;
    ending.takeAll(group);
    while (UndoItem* item = ending.first) {
        ending.unlink(*item);
        if (item->isGroup) {
            auto* nested = static_cast<UndoItemGroup*>(item);
            ending.takeAll(*nested);
            delete nested;
        } else {
            unlinkFromTarget(static_cast<UndoAction&>(*item));
            actions.append(*item);
        }
    }
    while (UndoItem* item = actions.first) {
        actions.unlink(*item);
        delete static_cast<UndoAction*>(item);
    }
}

UndoAction* UndoHistory::takeLastAction(UndoItemGroup& group) noexcept {
    while (UndoItem* item = group.last) {
        group.unlink(*item);
        if (!item->isGroup)
            return static_cast<UndoAction*>(item);
        auto* nested = static_cast<UndoItemGroup*>(item);
        group.takeAll(*nested);
        delete nested;
    }
    return nullptr;
}

} // namespace qx
