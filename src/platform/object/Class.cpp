#include <QXXMLMarshalling/platform/Class.h>

#include <QXXMLMarshalling/platform/Exception.h>

#include "platform/object/Warning.h"

#include <cstdlib>
#include <mutex>
#include <shared_mutex>
#include <unordered_map>

#include <cxxabi.h>

namespace qx {

// Classes by name and by C++ type. Never destroyed: static objects may ask while they end.
struct ClassRegistry {
    static ClassRegistry& shared() {
        static auto* const registry = new ClassRegistry;
        return *registry;
    }

    const Class* named(Key name) {
        const std::shared_lock lock(mutex);
        const auto found = byName.find(name);
        return found != byName.end() ? found->second : nullptr;
    }

    const Class* described(const std::type_info& type) {
        const std::shared_lock lock(mutex);
        const auto found = byType.find(type);
        return found != byType.end() ? found->second : nullptr;
    }

    const Class& publish(Class::Draft draft, bool listed) {
        const Key name = draft.name;
        const std::type_index type(*draft.type);
        // Warnings are given with the lock released: a host's log may ask for classes.
        std::unique_lock lock(mutex);
        if (const auto found = byType.find(type); found != byType.end()) {
            const Class& first = *found->second;
            lock.unlock();
            reportWarning(String::concat(
                {"The class ", name.view(), " is described already, as ", first.name()}));
            return first;
        }
        // Descriptions are immortal: objects keep pointers to them.
        const auto* published = new Class(std::move(draft));
        byType.emplace(type, published);
        const bool isTaken = listed && !byName.emplace(name, published).second;
        lock.unlock();
        if (isTaken)
            reportWarning(String::concat(
                {"The class name ", name.view(), " is taken; it stays with the first class"}));
        return *published;
    }

    bool forget(Key name) {
        const std::unique_lock lock(mutex);
        const auto found = byName.find(name);
        if (found == byName.end())
            return false;
        retired.push_back(found->second);
        byType.erase(*found->second->_type);
        byName.erase(found);
        return true;
    }

    std::shared_mutex mutex;
    std::unordered_map<Key, const Class*> byName;
    std::unordered_map<std::type_index, const Class*> byType;
    std::vector<const Class*> retired; // forgotten, but perhaps still pointed to
};

namespace {

std::string readableName(const std::type_info& type) {
    int status = 0;
    char* demangled = abi::__cxa_demangle(type.name(), nullptr, nullptr, &status);
    std::string name = demangled != nullptr ? demangled : type.name();
    std::free(demangled);
    return name;
}

template <class Item, class Name>
const Item* findIn(const std::vector<Item>& items, Name Item::*name, Name wanted) {
    for (const Item& item : items)
        if (item.*name == wanted)
            return &item;
    return nullptr;
}

const Operation* findOperation(const std::vector<Operation>& operations, Selector selector) {
    return findIn(operations, &Operation::selector, selector);
}

} // namespace

Class::Class(Draft draft)
    : _name(draft.name), _type(draft.type), _superclassType(draft.superclass),
      _create(draft.create), _properties(std::move(draft.properties)),
      _operations(std::move(draft.operations)), _classOperations(std::move(draft.classOperations)) {
    for (const Property& property : _properties)
        property.key.markAsProperty();
}

const Class* Class::named(std::string_view name) {
    const Key key = Key::existing(name);
    return key.isNull() ? nullptr : ClassRegistry::shared().named(key);
}

const Class* Class::described(const std::type_info& type) {
    return ClassRegistry::shared().described(type);
}

bool Class::forget(std::string_view name) {
    const Key key = Key::existing(name);
    return !key.isNull() && ClassRegistry::shared().forget(key);
}

const Class& Class::publish(Draft draft, bool listed) {
    return ClassRegistry::shared().publish(std::move(draft), listed);
}

const Class& Class::ofObject(const Object& object) {
    const std::type_info& type = typeid(object);
    ClassRegistry& registry = ClassRegistry::shared();
    if (const Class* described = registry.described(type))
        return *described;
    const Class& nearest = object.describedClass();
    if (*nearest._type == type)
        return nearest;
    return registry.publish(
        {.name = readableName(type), .type = &type, .superclass = nearest._type}, false);
}

// Found late, since a base may be described after the classes that derive from it.
const Class* Class::superclass() const {
    if (_superclassType == nullptr)
        return nullptr;
    const Class* known = _superclass.load(std::memory_order_acquire);
    if (known != nullptr)
        return known;
    known = ClassRegistry::shared().described(*_superclassType);
    if (known != nullptr) {
        _superclass.store(known, std::memory_order_release);
        return known;
    }
    static const Class* const root = &Object().isa();
    return this == root ? nullptr : root;
}

bool Class::isSubclassOf(const Class& other) const {
    for (const Class* type = this; type != nullptr; type = type->superclass())
        if (type == &other)
            return true;
    return false;
}

// The new object need not look its class up by its type.
Ref<Object> Class::create() const {
    Ref<Object> object = _create != nullptr ? _create() : Ref<Object>();
    if (object) {
        const Object& created = *object;
        if (typeid(created) == *_type)
            created._isa.store(this, std::memory_order_release);
    }
    return object;
}

const Property* Class::property(Key key) const {
    if (!key.namesProperty())
        return nullptr;
    for (const Class* type = this; type != nullptr; type = type->superclass())
        if (const auto* found = findIn(type->_properties, &Property::key, key))
            return found;
    return nullptr;
}

const Operation* Class::operation(Selector selector) const {
    for (const Class* type = this; type != nullptr; type = type->superclass())
        if (const auto* found = findOperation(type->_operations, selector))
            return found;
    return nullptr;
}

const Operation* Class::classOperation(Selector selector) const {
    for (const Class* type = this; type != nullptr; type = type->superclass())
        if (const auto* found = findOperation(type->_classOperations, selector))
            return found;
    return nullptr;
}

Value Class::performWithArguments(Selector selector, std::span<const Value> arguments) const {
    if (const Operation* operation = classOperation(selector))
        return operation->invoke(selector, *this, nullptr, arguments);
    throw Exception(
        Exception::invalidArgument,
        String::concat({"the class object of ", name(), " does not answer ", selector.name()}));
}

bool Class::automaticallyNotifiesObserversForKey(Key key) const {
    static const Selector selector("automaticallyNotifiesObserversForKey:");
    const Operation* operation = classOperation(selector);
    if (operation == nullptr)
        return true;
    const Value argument(key.string());
    return operation->invoke(selector, *this, nullptr, {&argument, 1}).boolValue();
}

namespace describe {

void raiseArgumentCount(Selector selector, const Class& receiver, std::size_t given) {
    throw Exception(
        Exception::invalidArgument,
        String::concat({"the operation ", selector.name(), " of class ", receiver.name(),
                        " does not take ", std::to_string(given), " arguments"}));
}

void raiseArgument(Selector selector, const Class& receiver, const Value& value) {
    throw Exception(
        Exception::invalidArgument,
        String::concat({"the operation ", selector.name(), " of class ", receiver.name(),
                        " does not take the argument ", value.description()}));
}

} // namespace describe
} // namespace qx
