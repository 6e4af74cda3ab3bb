#pragma once

// What a resolved mapping means for marshalling and unmarshalling, worked out once: node kinds,
// names and their fall-backs, class look-ups, the chain of `extends`. A plan is immutable and lives
// as long as its mapping; everything in it is found without a look-up by name, but for the elements
// of a document and the class names of objects.

#include <QXXMLMarshalling/QXXMLDocumentMapping.h>

#include <memory>
#include <unordered_map>

class ClassPlan;

struct StringHash {
    std::size_t operator()(const qx::String& text) const noexcept { return text.hash(); }
};
template <class T>
using StringMap = std::unordered_map<qx::String, T, StringHash>;

// What a field's "type" makes of text.
enum class ValueType : std::uint8_t { none, boolean, integer, other };

// How a field's "collection" is gathered.
enum class CollectionKind : std::uint8_t { none, array, unknown };

// One place where a field's value may stand.
struct BindingPlan {
    qx::String bindTo;   // as written, null or empty where absent
    qx::String name;     // bindTo, or the field's name where that is empty
    qx::String location; // the wrapper element, null or empty for none
    // The class mapped to an element called `bindTo`, or `name`; null when there is none.
    const ClassPlan* classOfBindTo = nullptr;
    const ClassPlan* classOfName = nullptr;
};

struct FieldPlan {
    const QXXMLFieldMapping* mapping = nullptr;
    qx::Key key; // the property
    QXXMLNodeType nodeType = QXXMLNodeTypeAttribute;
    CollectionKind collection = CollectionKind::none;
    ValueType valueType = ValueType::none;
    bool isRequired = false;
    bool isContainer = true;
    // The class that "type" names; null when it names none.
    const ClassPlan* typeClass = nullptr;
    // The primary binding first; empty without one.
    std::vector<BindingPlan> bindings;

    // Those of the primary binding; null without one.
    qx::String bindTo;
    qx::String location;
    qx::String xmlName; // bindTo, or the field's name where that is empty

    bool hasType() const { return !mapping->type().isEmpty(); }
    bool hasSimpleType() const {
        return valueType == ValueType::boolean || valueType == ValueType::integer;
    }
};

class ClassPlan {
public:
    const QXXMLClassMapping* mapping = nullptr;
    std::size_t index = 0; // among the plan's classes
    qx::Key className;
    qx::Key classNameToInstantiate;
    qx::String elementName; // "map-to", or the class name as written
    std::vector<FieldPlan> fields;
    // About how many names are looked up to bind the class's own fields.
    std::size_t bindingCount = 0;
    // How many fields, those of the ancestors too, may be attributes of the class's element.
    std::size_t attributeCount = 0;
    // The class that this one extends; null where it extends none or one that is not mapped.
    const ClassPlan* parent = nullptr;
    bool isOnCycle = false; // of `extends`
    // Whether the class with its ancestors binds no child element to two fields: as many children
    // bound as there are then means that all are.
    bool bindsChildrenOnce = false;
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
    const qx::String& broken() const noexcept { return _broken; }

private:
    const ClassPlan* _current;
    const ClassPlan* _entry = nullptr; // the first class of a cycle that was met
    qx::String _broken;
};

class MappingPlan {
public:
    explicit MappingPlan(const QXXMLDocumentMapping& document);
    MappingPlan(const MappingPlan&) = delete;
    MappingPlan& operator=(const MappingPlan&) = delete;

    // Null where no class has that name, no class maps to that element.
    const ClassPlan* classNamed(const qx::String& className) const {
        return find(_byClassName, className);
    }
    const ClassPlan* classForElement(const qx::String& elementName) const {
        return find(_byElementName, elementName);
    }
    // The plan of a class or a field that stands in the mapping; null for any other, a copy too.
    const ClassPlan* classOf(const QXXMLClassMapping& mapping) const;
    const FieldPlan* fieldOf(const QXXMLFieldMapping& mapping) const;

    std::size_t classCount() const noexcept { return _classes.size(); }

    // The plan of a class or a field that stands in no mapping, as one of this mapping.
    std::unique_ptr<ClassPlan> planFor(const QXXMLClassMapping& mapping) const;
    FieldPlan planFor(const QXXMLFieldMapping& mapping) const;
    // What a field says by itself: all but the classes that it names.
    static FieldPlan simplePlanFor(const QXXMLFieldMapping& mapping);

    // The name under which documents give an element of the class.
    static qx::String elementNameOf(const QXXMLClassMapping& mapping);

private:
    static const ClassPlan* find(const StringMap<const ClassPlan*>& plans, const qx::String& name) {
        const auto found = plans.find(name);
        return found != plans.end() ? found->second : nullptr;
    }
    void fill(ClassPlan& plan) const;
    void markCycles();
    static void summarise(ClassPlan& plan);

    std::vector<std::unique_ptr<ClassPlan>> _classes;
    StringMap<const ClassPlan*> _byClassName;
    StringMap<const ClassPlan*> _byElementName;
    std::unordered_map<const QXXMLFieldMapping*, const FieldPlan*> _fields;
};
