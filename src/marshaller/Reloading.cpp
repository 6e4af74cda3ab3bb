#include "marshaller/Reloading.h"

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/ChangeScope.h>

#include <algorithm>
#include <optional>

namespace qx::detail {

// The scope of an object ends, and that of the object around it goes on.
struct Reloading::Restore {
    explicit Restore(Reloading& of) : reloading(of), outer(of._scope) {}
    ~Restore() { reloading._scope = std::move(outer); }
    Restore(const Restore&) = delete;
    Restore& operator=(const Restore&) = delete;

    Reloading& reloading;
    Scope outer;
};

Reloading::~Reloading() {
    while (!_groups.empty())
        _groups.pop_back();
}

bool Reloading::isOfSameClass(const Object& held, const Object& fresh) {
    const Class& type = held.isa();
    const String name = held.classNameForMarshalling();
    if (name == fresh.classNameForMarshalling())
        return type.isSubclassOf(fresh.isa());
    return &type == &fresh.isa() && name == type.name();
}

bool Reloading::run(const ClassPlan& plan, Object& held, Object& fresh, Ref<Error>* error) {
    if (StructObject* const whole = structIn(Value(&held)))
        _taken.insert(whole->as(whole->type()));
    takeOver(plan, held, fresh);
    if (!_problem)
        return true;
    if (error != nullptr)
        *error = std::move(_problem);
    return false;
}

namespace {

Ref<UndoManager> managerOf(Object& object) {
    static const Selector undoManager("undoManager");
    const Operation* const ask = object.isa().operation(undoManager);
    return ask != nullptr && ask->takes({}) ? ObjectAccess::send(object, *ask).as<UndoManager>()
                                            : nullptr;
}

// An object without such a key has no value for it.
std::optional<Value> valueOf(const Object& object, Key key) {
    try {
        return ObjectAccess::get(object, key).value();
    } catch (const UndefinedKeyException& exception) {
        if (!exception.concerns(&object, key))
            throw;
        return std::nullopt;
    }
}

} // namespace

void Reloading::enter(Object& held) {
    _scope.object = &held;
    _scope.declared = nullptr;
    Ref<UndoManager> own = held.isa().isStruct() ? nullptr : managerOf(held);
    _scope.registersItself = own.get() != nullptr;
    if (!own)
        return;
    const auto isOpen = [&](const auto& group) { return group.first == own; };
    if (std::none_of(_groups.begin(), _groups.end(), isOpen))
        _groups.emplace_back(own, std::make_unique<UndoGroup>(own));
    _scope.manager = std::move(own);
}

void Reloading::takeOver(const ClassPlan& plan, Object& held, Object& fresh) {
    const Restore restore(*this);
    if (!held.isa().isStruct()) {
        _taken.insert(&held);
        _alive.emplace_back(&held);
    }
    enter(held);
    takeName(plan, held, fresh);
    // What a key held is moved away: a second field of that key finds nothing any more.
    std::unordered_set<Key> keys;
    ExtendsWalk walk(plan);
    do {
        for (const FieldPlan& field : walk.current().fields)
            if (!_problem && keys.insert(field.key).second)
                takeField(field, held, fresh);
    } while (walk.next());
    for (const KeptXML what : {KeptXML::children, KeptXML::attributes, KeptXML::namespaces})
        if (!_problem)
            takeKept(what, held, fresh);
}

void Reloading::takeName(const ClassPlan& plan, Object& held, const Object& fresh) {
    if (held.isa().isStruct() || held.classNameForMarshalling() == fresh.classNameForMarshalling())
        return;
    if (const Operation* set = _access.hooksOf(held).setClassNameForMarshalling)
        ObjectAccess::send(held, *set, plan.className.string());
}

void Reloading::takeField(const FieldPlan& field, Object& held, Object& fresh) {
    const std::optional<Value> after = valueOf(fresh, field.key);
    const std::optional<Value> before = valueOf(held, field.key);
    if (!after || !before)
        return;
    const Key key = field.key;
    const Property* const property = key.namesProperty() ? fresh.isa().property(key) : nullptr;
    if (property != nullptr && property->set == nullptr)
        return;
    _scope.declared = field.typeClass;
    _scope.keepsBoxes = property == nullptr;
    const bool isMember = property != nullptr && property->takeOver != nullptr;
    if (isMember && !isUnchanged(*before, *after)) {
        takeMember(*property, held, fresh);
        return;
    }
    const Value merged = merge(*before, *after);
    if (_problem || merged.isSameAs(*before))
        return;
    registerUndo(held, key);
    ObjectAccess::set(held, key, Value(merged), &_problem);
}

void Reloading::takeMember(const Property& property, Object& held, Object& fresh) {
    const Class& type = held.isa();
    registerUndo(held, property.key);
    std::optional<ChangeScope> announced;
    if (!type.isStruct() && type.automaticallyNotifiesObserversForKey(property.key))
        announced.emplace(held, property.key);
    property.takeOver(property, held, fresh, *this);
}

void Reloading::takeKept(KeptXML what, Object& held, Object& fresh) {
    const Value after = _access.getKept(fresh, what);
    const Value before = _access.getKept(held, what);
    if (after.isNull() && before.isNull())
        return;
    registerUndo(held, ObjectAccess::keyOf(what));
    _access.setKept(held, what, after, &_problem);
}

namespace {

// The manager outlives its actions.
void setUndoably(Object& object, UndoManager& manager, Key key, const Value& value);

void registerValue(Object& object, UndoManager& manager, Key key) {
    manager.registerUndo(object, [&manager, key, value = object.valueForKey(key)](Object& target) {
        setUndoably(target, manager, key, value);
    });
}

void setUndoably(Object& object, UndoManager& manager, Key key, const Value& value) {
    registerValue(object, manager, key);
    object.setValueForKey(value, key);
}

} // namespace

void Reloading::registerUndo(Object& held, Key key) {
    if (_scope.manager && !_scope.registersItself && !held.isa().isStruct())
        registerValue(held, *_scope.manager, key);
}

Value Reloading::merge(const Value& held, const Value& fresh) {
    Object* const object = fresh.object();
    if (_problem)
        return held;
    if (object == nullptr)
        return held.kind() == fresh.kind() && held.isEqual(fresh) ? held : fresh;
    if (const auto array = fresh.as<Array>())
        return mergeArrays(held, *array);
    Object* const former = held.object();
    if (StructObject* const read = structIn(fresh)) {
        StructObject* const place = structIn(held);
        const bool mayStay = place != nullptr && _scope.keepsBoxes;
        return mayStay && mergeStructs(*place, *read, true) ? held : fresh;
    }
    if (const ClassPlan* plan = former != nullptr ? planToKeep(*former, *object) : nullptr) {
        takeOver(*plan, *former, *object);
        return held;
    }
    _access.adopt(*object, *_scope.object, &_problem);
    return fresh;
}

// A list in which nothing but the insides of its items changed stays the same list.
Value Reloading::mergeArrays(const Value& held, const Array& fresh) {
    std::vector<Value> former;
    if (const auto array = held.as<Array>())
        former.assign(array->begin(), array->end());
    bool isSame = former.size() == fresh.count();
    auto merged = make<Array>();
    merged->reserve(fresh.count());
    for (std::size_t i = 0; i < fresh.count(); ++i) {
        const Value item = merge(i < former.size() ? former[i] : Value(), fresh.at(i));
        isSame = isSame && item.isSameAs(former[i]);
        merged->add(item);
    }
    return isSame ? held : Value(merged);
}

bool Reloading::mergeStructs(StructObject& held, StructObject& fresh, bool isShared) {
    if (_problem)
        return true;
    const ClassPlan* const plan = _scope.manager ? nullptr : planToKeep(held, fresh);
    if (plan == nullptr || (isShared && !_taken.insert(held.as(held.type())).second))
        return false;
    takeOver(*plan, held, fresh);
    return true;
}

// Null where the object cannot stay: it is of another class, or of none that the mapping has, or
// has taken over another one's values already.
const ClassPlan* Reloading::planToKeep(const Object& held, const Object& fresh) const {
    if (!isOfSameClass(held, fresh) || _taken.contains(&held))
        return nullptr;
    const String name = fresh.classNameForMarshalling();
    const ClassPlan* const declared = _scope.declared;
    if (declared != nullptr && (declared->className.string() == name ||
                                declared->classNameToInstantiate.string() == fresh.isa().name()))
        return declared;
    return _plan.classNamed(name);
}

bool Reloading::isUnchanged(const Value& held, const Value& fresh) const {
    if (held.kind() != fresh.kind())
        return false;
    if (!held.isObject())
        return held.isEqual(fresh);
    const auto former = held.as<Array>();
    const auto read = fresh.as<Array>();
    if (former && read)
        return former->count() == read->count() &&
               std::equal(former->begin(), former->end(), read->begin(),
                          [&](const Value& a, const Value& b) { return isUnchanged(a, b); });
    if (structIn(held) != nullptr || structIn(fresh) != nullptr)
        return false;
    return held.isEqual(fresh) || planToKeep(*held.object(), *fresh.object()) != nullptr;
}

} // namespace qx::detail
