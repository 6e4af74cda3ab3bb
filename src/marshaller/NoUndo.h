#pragma once

#include <QXXMLMarshalling/undo/UndoManager.h>

namespace qx::detail {

// While it lives, the undo manager registers nothing: what the reading of a new object does is no
// change of one that is there.
class NoUndo {
public:
    explicit NoUndo(Ref<UndoManager> manager) : _manager(std::move(manager)) {
        _manager->disableUndoRegistration();
    }
    ~NoUndo() { _manager->enableUndoRegistration(); }
    NoUndo(const NoUndo&) = delete;
    NoUndo& operator=(const NoUndo&) = delete;

private:
    const Ref<UndoManager> _manager;
};

} // namespace qx::detail
