#pragma once

// A task of a project: the class that this program has in C++. Deriving from qx::UndoableObject is
// all that it does to be undone as records are.

#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/undo/UndoableObject.h>

class Task : public qx::UndoableObject {
public:
    // Follows the other three.
    std::string summary() const;
    // Changes several values at once, in plain C++.
    void finish();
    // Part of the project, and to be written with it.
    bool isRemovable() const { return false; }

    std::string title;
    int days = 0;
    bool done = false;
    // XML of the task's element that the mapping does not know.
    qx::Value unboundChildren, unboundAttributes, namespaces;
};

// Describes the class.
void registerTask();
