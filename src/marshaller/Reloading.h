#pragma once

// An object that is there takes over what a newly read one of its class holds, so that it equals
// it: the fields that the mapping has for the class, and what is kept of unknown XML. Objects that
// it holds stay where the new one has one of the same class in that place, and take over in their
// turn; each only once, wherever it is held.
//
// Changes go through key-value access, or are announced like it, so that observers hear of what
// differs. They are one group of the object's undo manager. For objects inside that have none of
// their own, the actions are registered here; plain structs inside are replaced, so that the old
// ones can come back.

#include <QXXMLMarshalling/detail/TakeOver.h>
#include <QXXMLMarshalling/undo/UndoManager.h>

#include "marshaller/ObjectAccess.h"
#include "plan/MappingPlan.h"

#include <unordered_set>

namespace qx::detail {

class Reloading final : private TakeOver {
public:
    explicit Reloading(const MappingPlan& plan) : _plan(plan) {}
    ~Reloading();

    // Whether the object is of the class of the new one, under the same name for marshalling. One
    // that was not told a name yet may get any.
    static bool isOfSameClass(const Object& held, const Object& fresh);
    // `plan` is that of the class. False with
    //   -222  "Unable to set value: %@ for key: %@ in class: %@"
    // where the object, or one in it, refuses what the new one took.
    bool run(const ClassPlan& plan, Object& held, Object& fresh, Ref<Error>* error);

private:
    // The object that takes over, and what holds for its fields.
    struct Scope {
        Object* object = nullptr;
        Ref<UndoManager> manager;            // its own, or that of an object around it
        bool registersItself = false;        // the manager is its own
        const ClassPlan* declared = nullptr; // the class that the current field declares
        // Whether structs may stay in their boxes: they are no property's, whose setter is to know.
        bool keepsBoxes = false;
    };
    struct Restore;

    Value merge(const Value& held, const Value& fresh) override;
    bool mergeStructs(StructObject& held, StructObject& fresh, bool isShared) override;
    using TakeOver::mergeStructs;

    Value mergeArrays(const Value& held, const Array& fresh);
    void takeOver(const ClassPlan& plan, Object& held, Object& fresh);
    void enter(Object& held);
    void takeName(const ClassPlan& plan, Object& held, const Object& fresh);
    void takeField(const FieldPlan& field, Object& held, Object& fresh);
    void takeKept(KeptXML what, Object& held, Object& fresh);
    // Of a member that holds something else than the new one's.
    void takeMember(const Property& property, Object& held, Object& fresh);
    // Where the object does not do so itself.
    void registerUndo(Object& held, Key key);
    const ClassPlan* planToKeep(const Object& held, const Object& fresh) const;
    bool isUnchanged(const Value& held, const Value& fresh) const;

    const MappingPlan& _plan;
    ObjectAccess _access;
    Scope _scope;
    Ref<Error> _problem;                    // the first: nothing is taken over after it
    std::unordered_set<const void*> _taken; // objects, and structs that are shared
    std::vector<Value> _alive;              // those objects
    std::vector<std::pair<Ref<UndoManager>, std::unique_ptr<UndoGroup>>> _groups;
};

} // namespace qx::detail
