#include <QXXMLMarshalling/model/Class.h>

#include <QXXMLMarshalling/base/Exception.h>

#include "base/Immortal.h"
#include "base/PropertyNames.h"
#include "model/ClassVersion.h"
#include "model/TypeNames.h"
#include "model/Warning.h"

#include <algorithm>
#include <cstdlib>
#include <mutex>
#include <shared_mutex>
#include <typeindex>
#include <unordered_map>

#include <cxxabi.h>

namespace qx {

std::string readableName(const std::type_info& type) {
    int status = 0;
    char* demangled = abi::__cxa_demangle(type.name(), nullptr, nullptr, &status);
    std::string name = demangled != nullptr ? demangled : type.name();
    std::free(demangled);
    return name;
}

namespace {

// Adds the public bases of a class, as far as they are not among the types yet.
void addBases(const std::type_info& type, std::vector<const std::type_info*>& types) {
    const auto add = [&types](const std::type_info* base) {
        if (std::find_if(types.begin(), types.end(),
                         [&](const auto* known) { return *known == *base; }) == types.end())
            types.push_back(base);
    };
    if (const auto* single = dynamic_cast<const abi::__si_class_type_info*>(&type)) {
        add(single->__base_type);
    } else if (const auto* several = dynamic_cast<const abi::__vmi_class_type_info*>(&type)) {
        const abi::__base_class_type_info* bases = several->__base_info;
        for (unsigned i = 0; i < several->__base_count; ++i)
            if (bases[i].__is_public_p())
                add(bases[i].__base_type);
    }
}

} // namespace

constinit std::atomic<std::uint64_t> classChanges = 0;

// Classes by name and by C++ type.
struct ClassRegistry {
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

    // The class described for the type, or what stands in for it already.
    const Class* known(const std::type_info& type) {
        const std::shared_lock lock(mutex);
        if (const auto found = byType.find(type); found != byType.end())
            return found->second;
        const auto found = standIns.find(&type);
        return found != standIns.end() && found->second.typeName == type.name()
                   ? found->second.description
                   : nullptr;
    }

    // The class of the type, else of its nearest base that is described; null when there is none.
    const Class* nearest(const std::type_info& type) {
        const std::shared_lock lock(mutex);
        return nearestLocked(type);
    }

    // A class for a type that nobody described. It is kept by the place of the type's information,
    // which is not looked at again: a plug-in may take it along. The name tells the type from
    // another that comes to lie there.
    const Class& standIn(const std::type_info& type) {
        const std::unique_lock lock(mutex);
        const Class* base = nearestLocked(type);
        retired.reserve(retired.size() + 1);
        auto* made =
            new Class({.name = readableName(type), .type = &type, .superclass = &typeid(Object)});
        retired.push_back(made);
        // A struct cannot be cast to a base that it was not described with.
        if (base != nullptr && !base->isStruct())
            made->_superclass.store(base, std::memory_order_relaxed);
        standIns[&type] = {type.name(), made};
        return *made;
    }

    const Class& publish(detail::ClassDraft draft, bool listed, bool* isTaken) {
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
        classChanges.fetch_add(1, std::memory_order_release);
        if (isTaken != nullptr)
            *isTaken = true;
        standIns.clear(); // it may be the base, or the very class, of what one stands in for
        const bool isNameTaken = listed && !byName.emplace(name, published).second;
        lock.unlock();
        if (isNameTaken)
            reportWarning(String::concat(
                {"The class name ", name.view(), " is taken; it stays with the first class"}));
        return *published;
    }

    std::vector<const Class*> all() {
        const std::shared_lock lock(mutex);
        std::vector<const Class*> classes;
        for (const auto& [type, described] : byType)
            classes.push_back(described);
        return classes;
    }

    bool forget(Key name) {
        const std::unique_lock lock(mutex);
        const auto found = byName.find(name);
        if (found == byName.end())
            return false;
        forgetLocked(*found->second);
        return true;
    }

    void forget(const Class& described) {
        const std::unique_lock lock(mutex);
        const auto found = byType.find(*described._type);
        if (found != byType.end() && found->second == &described)
            forgetLocked(described);
    }

    std::shared_mutex mutex;
    std::unordered_map<Key, const Class*> byName;
    std::unordered_map<std::type_index, const Class*> byType;
    std::vector<const Class*> retired; // not to be found any more, but perhaps still pointed to

private:
    // The name may be another class's.
    void forgetLocked(const Class& described) {
        retired.push_back(&described);
        classChanges.fetch_add(1, std::memory_order_release);
        byType.erase(*described._type);
        if (const auto found = byName.find(described._name);
            found != byName.end() && found->second == &described)
            byName.erase(found);
        standIns.clear();
    }

    struct StandIn {
        std::string typeName;
        const Class* description = nullptr;
    };

    // Breadth first, so that of several bases the nearest is found.
    const Class* nearestLocked(const std::type_info& type) const {
        std::vector<const std::type_info*> types{&type};
        for (std::size_t i = 0; i < types.size(); ++i) {
            if (const auto found = byType.find(*types[i]); found != byType.end())
                return found->second;
            addBases(*types[i], types);
        }
        return nullptr;
    }

    std::unordered_map<const std::type_info*, StandIn> standIns;
};

namespace {

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

Class::Class(detail::ClassDraft draft)
    : _name(draft.name), _type(draft.type), _superclassType(draft.superclass),
      _structType(draft.structType), _create(draft.create), _setsByProperty(draft.setsByProperty),
      _properties(std::move(draft.properties)), _operations(std::move(draft.operations)),
      _classOperations(std::move(draft.classOperations)) {
    for (const Property& property : _properties)
        detail::markAsProperty(property.key);
}

const Class* Class::named(std::string_view name) {
    const Key key = Key::existing(name);
    return key.isNull() ? nullptr : immortal<ClassRegistry>().named(key);
}

const Class* Class::described(const std::type_info& type) {
    return immortal<ClassRegistry>().described(type);
}

ClassRegistration::~ClassRegistration() {
    if (_described != nullptr)
        immortal<ClassRegistry>().forget(*_described);
}

std::vector<const Class*> Class::derivedFrom(const std::type_info& type) {
    std::vector<const Class*> classes = immortal<ClassRegistry>().all();
    std::erase_if(classes, [&](const Class* described) {
        const Class* link = described;
        while (link != nullptr && *link->_type != type &&
               (link->_superclassType == nullptr || *link->_superclassType != type))
            link = link->superclass();
        return link == nullptr;
    });
    std::ranges::sort(classes, {}, [](const Class* described) { return described->key().view(); });
    return classes;
}

bool Class::forget(std::string_view name) {
    const Key key = Key::existing(name);
    return !key.isNull() && immortal<ClassRegistry>().forget(key);
}

const Class& Class::ofObject(const Object& object) {
    const auto* held = dynamic_cast<const detail::StructObject*>(&object);
    const std::type_info& type = held != nullptr ? held->type() : typeid(object);
    ClassRegistry& registry = immortal<ClassRegistry>();
    if (const Class* known = registry.known(type))
        return *known;
    // Describes the library's class among the bases, unless that was done.
    const Class& own = object.describedClass();
    return *own._type == type ? own : registry.standIn(type);
}

// Found late, since a base may be described after the classes that derive from it; until then the
// nearest of its own bases does.
const Class* Class::superclass() const {
    if (_superclassType == nullptr)
        return nullptr;
    const Class* known = _superclass.load(std::memory_order_acquire);
    if (known != nullptr)
        return known;
    known = immortal<ClassRegistry>().nearest(*_superclassType);
    const bool isItself = known != nullptr && *known->_type == *_superclassType;
    if (isItself)
        _superclass.store(known, std::memory_order_release);
    // A struct can be cast to the base it was described with, not to that one's own.
    if (known != nullptr && (isItself || !isStruct()))
        return known;
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
        if (isStruct() || typeid(created) == *_type)
            created._isa.store(this, std::memory_order_release);
    }
    return object;
}

void Class::assignTo(const detail::StructObject& object) const noexcept {
    const Object& held = object;
    held._isa.store(this, std::memory_order_release);
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

namespace detail {

const Class& publish(ClassDraft draft, bool listed, bool* isTaken) {
    return immortal<ClassRegistry>().publish(std::move(draft), listed, isTaken);
}

void raiseArgumentCount(Selector selector, const Class& receiver, std::size_t given) {
    throw Exception(
        Exception::invalidArgument,
        String::concat({"the operation ", selector.name(), " of class ", receiver.name(),
                        " does not take ", std::to_string(given), " arguments"}));
}

void raiseNoInstance(Selector selector, const Class& receiver) {
    throw Exception(
        Exception::invalidArgument,
        String::concat({"the struct of class ", receiver.name(),
                        " that is to answer the operation ", selector.name(), " was moved away"}));
}

void raiseArgument(Selector selector, const Class& receiver, const Value& value) {
    throw Exception(
        Exception::invalidArgument,
        String::concat({"the operation ", selector.name(), " of class ", receiver.name(),
                        " does not take the argument ", value.description()}));
}

} // namespace detail
} // namespace qx
