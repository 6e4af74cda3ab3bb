#pragma once

// Steps that are undone and redone (support/ObjectSteps.h for those with objects):
//
//     undo, redo, undo-nested, begin, end, end-event, enable, disable, forget-all, event-groups-off
//     levels NUMBER, name NAME
//     scope [NAME]                     an UndoGroup, which "leave" ends
//     step NAME.KEY VALUE [NAME]       a scope with that change alone
//     later COMMAND                    the command as an undo action
//     register NAME|null MESSAGE VALUE the message as an undo action
//     can                              says what can be done: undo, redo or nothing
//     save                             sets the saved mark, which "saved" says whether it is at
//     level, names                     say how many groups are open, the names to undo and redo

#include "support/ObjectSteps.h"

#include <QXXMLMarshalling/undo/UndoManager.h>

class UndoSteps : public support::ObjectSteps {
public:
    UndoSteps() {
        using qx::UndoManager;
        objects["manager"] = manager;
        know("undo", [this](auto&) { manager->undo(); });
        know("redo", [this](auto&) { manager->redo(); });
        know("undo-nested", [this](auto&) { manager->undoNestedGroup(); });
        know("begin", [this](auto&) { manager->beginUndoGrouping(); });
        know("end", [this](auto&) { manager->endUndoGrouping(); });
        know("end-event", [this](auto&) { manager->endEventGroup(); });
        know("event-groups-off", [this](auto&) { manager->setGroupsByEvent(false); });
        know("enable", [this](auto&) { manager->enableUndoRegistration(); });
        know("disable", [this](auto&) { manager->disableUndoRegistration(); });
        know("forget-all", [this](auto&) { manager->removeAllActions(); });
        know("levels", [this](auto& words) { manager->setLevelsOfUndo(std::stoul(words.at(0))); });
        know("name", [this](auto& words) { manager->setActionName(words.at(0)); });
        know("scope", [this](auto& words) {
            groups.push_back(std::make_unique<qx::UndoGroup>(manager, nameIn(words, 0)));
        });
        know("leave", [this](auto&) { groups.pop_back(); });
        know("step", [this](auto& words) {
            const qx::UndoGroup group(manager, nameIn(words, 2));
            set(words.at(0), value(words.at(1)));
        });
        know("later", [this](auto& words) {
            manager->registerUndo(*manager, [this, words](UndoManager&) { call(words.at(0), {}); });
        });
        know("register", [this](const Arguments& words) {
            const auto target = value(words.at(0)).as<qx::Object>();
            manager->registerUndoWithTarget(target.get(), words.at(1).c_str(), value(words.at(2)));
        });
        know("can", [this](auto&) {
            const std::string redo = manager->canRedo() ? "redo" : "nothing";
            say(!manager->canUndo() ? redo : manager->canRedo() ? "undo redo" : "undo");
        });
        know("save", [this](auto&) { manager->setSavedMark(); });
        know("saved", [this](auto&) { say(manager->isAtSavedMark() ? "yes" : "no"); });
        know("level", [this](auto&) { say(std::to_string(manager->groupingLevel())); });
        know("names", [this](auto&) {
            for (const qx::Value name : {manager->undoActionName(), manager->redoActionName()})
                say(name.description().str());
        });
    }
    ~UndoSteps() { manager->removeAllActions(); }

protected:
    qx::Ref<qx::UndoManager> manager = qx::make<qx::UndoManager>();

private:
    static qx::String nameIn(const Arguments& words, std::size_t i) {
        return i < words.size() ? qx::String(words[i]) : qx::String();
    }

    std::vector<std::unique_ptr<qx::UndoGroup>> groups;
};
