#pragma once

// What a class of a mapping means for reading and writing, worked out once when the mapping is
// resolved: its fields, the class that it extends, how many names and attributes to expect.
// Immutable; the plan of the mapping owns it.

#include "plan/UsualForm.h"

namespace qx::detail {

class ClassPlan {
public:
    const QXXMLClassMapping* mapping = nullptr;
    std::size_t index = 0; // among the classes of the mapping
    Key className;
    Key classNameToInstantiate;
    std::vector<FieldPlan> fields;
    String elementName;  // "map-to", null or empty where documents are given the class name
    String namelessName; // of an element that nothing else names: the class name
    // About how many names are looked up to bind the class's own fields.
    std::size_t bindingCount = 0;
    // How many fields, those of the ancestors too, may be attributes of the class's element.
    std::size_t attributeCount = 0;
    // The class that this one extends; null where it extends none or one that is not mapped.
    const ClassPlan* parent = nullptr;
    bool isOnCycle = false; // of `extends`
    // Whether the class with its ancestors binds no child element to two fields: if the bound count
    // equals the child count, every child was bound.
    bool bindsChildrenOnce = false;

    std::optional<UsualForm> usualForm;

    // Works out attributeCount, bindsChildrenOnce and usualForm, once the fields and the ancestors
    // are there.
    void summarise();
};

// Walks a class and its ancestors, this one first:
//
//     ExtendsWalk walk(plan);
//     do { … walk.current() … } while (walk.next());
//     if (!walk.broken().isNull()) …   // the `extends` that leads nowhere, or back
class ExtendsWalk {
public:
    explicit ExtendsWalk(const ClassPlan& plan) noexcept : _current(&plan) {}
    const ClassPlan& current() const noexcept { return *_current; }
    bool next();
    const String& broken() const noexcept { return _broken; }

private:
    const ClassPlan* _current;
    const ClassPlan* _entry = nullptr; // the first class of a cycle that was met
    String _broken;
};

} // namespace qx::detail
