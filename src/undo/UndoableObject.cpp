#include <QXXMLMarshalling/undo/UndoableObject.h>

#include <QXXMLMarshalling/model/Class.h>

namespace qx {

UndoableObject::UndoableObject() : _tracking(*this) {}

UndoableObject::~UndoableObject() { endUndo(); }

void UndoableObject::endUndo() noexcept {
    const Ref<UndoManager> manager = undoManager();
    if (!manager)
        return;
    manager->removeAllActionsWithTarget(this);
    setUndoManager(nullptr);
}

const Class& UndoableObject::classObject() {
    using Self = UndoableObject;
    using detail::instanceOperation;
    static const Class* const described = &detail::publish(
        {.name = "qx::UndoableObject",
         .type = &typeid(Self),
         .superclass = &typeid(Object),
         .operations = {instanceOperation<Self, &Self::restoreValue>("_setValue:forKey:"),
                        instanceOperation<Self, &Self::undoManager>("undoManager"),
                        instanceOperation<Self, &Self::setUndoManager>("setUndoManager:")}},
        false);
    return *described;
}

namespace {

// Described when the library is loaded: classes derived from it look it up by its type.
[[maybe_unused]] const Class& described = UndoableObject::classObject();

} // namespace

const Class& UndoableObject::describedClass() const { return classObject(); }

void UndoableObject::restoreValue(const Value& value, const String& key) {
    _tracking.restoreValue(value, key);
}

void UndoableObject::willChangeValueForKey(Key key) {
    _tracking.willChangeValueForKey(key);
    Object::willChangeValueForKey(key);
}

void UndoableObject::didChangeValueForKey(Key key) {
    try {
        _tracking.didChangeValueForKey(key);
    } catch (...) {
        // Observers hear of the end of every change that they heard the beginning of.
        Object::didChangeValueForKey(key);
        throw;
    }
    Object::didChangeValueForKey(key);
}

void UndoableObject::willChange(ChangeKind kind, std::span<const std::size_t> indexes, Key key) {
    _tracking.willChangeValueForKey(key);
    Object::willChange(kind, indexes, key);
}

} // namespace qx
