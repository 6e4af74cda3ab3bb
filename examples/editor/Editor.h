#pragma once

// A document that is being edited by commands, one a line:
//
//     show [PATH]            print what the document, or a part of it, holds
//     set PATH VALUE         a number where the old value is one; else text, to the end of the line
//     unset PATH             remove a value
//     new PATH CLASS         put a new object there
//     add PATH CLASS         append a new object to a list
//     remove PATH            take an item out of its list
//     finish PATH            have a task finish itself
//     begin NAME … end       the commands between them are undone together
//     undo, redo
//     edited                 tell whether anything was edited since the document was saved
//     watch PATH             tell of changes of the value at the path, whichever object changed
//     save FILE              what was edited changes in the document's text, and nothing else
//
// Each change that the editor observes is printed, whoever makes it: commands, undo and redo alike.

#include "Paths.h"
#include "Watcher.h"

#include <QXXMLMarshalling/QXXMLDocumentFile.h>

class Editor {
public:
    // Edits what was read from the file: gives its objects an undo manager.
    Editor(qx::Ref<QXXMLMarshaller> marshaller, qx::Ref<QXXMLDocumentFile> file, std::ostream& out);
    // Forgets what could be undone: it keeps objects of the document alive.
    ~Editor();
    Editor(const Editor&) = delete;
    Editor& operator=(const Editor&) = delete;

    // Carries the command out. Throws a std::exception that says what is wrong with it; what it did
    // so far then stays, and can be undone.
    void perform(const std::string& line);

private:
    struct Command;

    void show(const Command& command);
    void set(const Command& command);
    void unset(const Command& command);
    void makeObject(const Command& command);
    void addItem(const Command& command);
    void removeItem(const Command& command);
    void finish(const Command& command);
    void begin(const Command& command);
    void end(const Command& command);
    void undo(const Command& command);
    void redo(const Command& command);
    void watch(const Command& command);
    void tellEdited(const Command& command);
    void save(const Command& command);

    void assign(const Place& place, const qx::Value& value);
    qx::Ref<qx::Object> newObject(const std::string& className);

    qx::Ref<QXXMLMarshaller> _marshaller;
    qx::Ref<QXXMLDocumentFile> _file;
    qx::Ref<qx::Object> _document;
    qx::Ref<qx::UndoManager> _undoManager = qx::make<qx::UndoManager>();
    std::ostream& _out;
    Watcher _watcher;
};
