#pragma once

// What an undo manager keeps beside its history: the groups that are open, what is made beforehand
// so that a change is registered without fail, and the undo or redo that runs.

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/undo/UndoManager.h>

#include "undo/UndoHistory.h"

#include <algorithm>
#include <cstdint>
#include <memory>
#include <utility>
#include <vector>

namespace qx {

struct UndoManager::State {
    class Performance;
    enum class Doing : std::uint8_t { nothing, undo, redo };

    // How many changes that are announced at once are sure to be registered, should memory fail.
    static constexpr std::size_t spareActionCount = 8;
    static constexpr std::size_t argumentsOfChange = 2;

    [[noreturn]] static void raiseInconsistency(std::string_view reason) {
        throw Exception(Exception::internalInconsistency, reason);
    }

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
    // Where among all that was done the objects are: a number that each new entry takes anew, and
    // that undo and redo come back to.
    std::uint64_t position = 0;
    std::uint64_t savedPosition = 0;
    std::uint64_t lastPosition = 0;

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
            group->leadsTo = position;
            if (doing == Doing::nothing)
                position = ++lastPosition;
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

    // Undoes or redoes the last group of the stack; nothing where it is empty.
    void performLast(UndoItemGroup& stack, Doing what);
};

} // namespace qx
