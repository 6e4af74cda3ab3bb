#include <QXXMLMarshalling/model/Object.h>

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/ChangeScope.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Format.h>
#include <QXXMLMarshalling/model/Invocation.h>

#include "model/ObjectExtras.h"

namespace qx {

namespace {

#ifndef NDEBUG
std::atomic<std::int64_t> liveObjects{0};
#endif

// Objects that end while this many others are ending above them on the stack wait for their turn.
constexpr unsigned deepestRelease = 64;

// A count that no reference made and dropped by a destructor brings back to zero, and that of an
// ending object which waits and whose place for extras holds the next one that waits.
constexpr std::uint32_t endingCount = 0x40000000U;
constexpr std::uint32_t waitingCount = 2 * endingCount;

struct Ending {
    unsigned depth = 0;
    Object* waiting = nullptr; // the latest; the others are linked to it
};
// In the library's initial block of thread memory: it is looked at for every object that ends.
[[gnu::tls_model("initial-exec")]] thread_local Ending ending;

String addressOf(const Object& object) {
    const Value address(reinterpret_cast<std::uintptr_t>(&object));
    return format("0x%012lx", {&address, 1});
}

} // namespace

Object::Object() noexcept {
#ifndef NDEBUG
    liveObjects.fetch_add(1, std::memory_order_relaxed);
#endif
}

Object::~Object() {
    // Told already unless this object was never counted, or gained listeners while it ended.
    if (_extras != nullptr) {
        _count.store(endingCount, std::memory_order_relaxed);
        if (_extras->anchor)
            _extras->anchor->clear();
        ObjectInternals::tellEndListeners(*this);
        delete _extras;
    }
#ifndef NDEBUG
    liveObjects.fetch_sub(1, std::memory_order_relaxed);
#endif
}

std::int64_t Object::liveCount() noexcept {
#ifndef NDEBUG
    return liveObjects.load(std::memory_order_relaxed);
#else
    return 0;
#endif
}

// A long chain of objects would end by recursion, one frame a link. Past a fixed depth they queue
// up instead. While an object waits it is whole, and others may still read it.
void Object::destroy() const noexcept {
    auto* self = const_cast<Object*>(this);
    _count.store(endingCount, std::memory_order_relaxed);
    if (_extras != nullptr && _extras->anchor)
        _extras->anchor->clear();
    if (ending.depth >= deepestRelease) {
        ObjectInternals::linkWaiting(*self, ending.waiting);
        ending.waiting = self;
        return;
    }
    const auto finish = [](Object& object) {
        ++ending.depth;
        if (object._extras != nullptr)
            ObjectInternals::tellEndListeners(object);
        delete &object;
        --ending.depth;
    };
    finish(*self);
    while (ending.depth == 0 && ending.waiting != nullptr) {
        Object* next = ending.waiting;
        ending.waiting = ObjectInternals::unlinkWaiting(*next);
        finish(*next);
    }
}

bool ObjectInternals::isEnding(const Object& object) noexcept {
    return object._count.load(std::memory_order_relaxed) >= endingCount / 2;
}

bool ObjectInternals::hasLinkForExtras(const Object& object) noexcept {
    return object._count.load(std::memory_order_relaxed) >= waitingCount - endingCount / 2;
}

void ObjectInternals::linkWaiting(Object& object, Object* next) noexcept {
    if (object._extras != nullptr) {
        object._extras->nextWaiting = next;
        return;
    }
    object._extras = reinterpret_cast<Object::Extras*>(next);
    object._count.fetch_add(waitingCount - endingCount, std::memory_order_relaxed);
}

Object* ObjectInternals::unlinkWaiting(Object& object) noexcept {
    if (!hasLinkForExtras(object))
        return object._extras->nextWaiting;
    object._count.fetch_sub(waitingCount - endingCount, std::memory_order_relaxed);
    return reinterpret_cast<Object*>(std::exchange(object._extras, nullptr));
}

Object::Extras& Object::extras() const {
    auto* existing = ObjectInternals::existingExtras(*this);
    if (existing != nullptr)
        return *existing;
    auto* made = new Extras;
    if (ObjectInternals::hasLinkForExtras(*this))
        made->nextWaiting = ObjectInternals::unlinkWaiting(const_cast<Object&>(*this));
    _extras = made;
    return *made;
}

// Of an object that ends there is nothing to refer to any more.
Ref<WeakAnchor> Object::weakAnchor() const {
    Ref<WeakAnchor>& anchor = extras().anchor;
    if (!anchor)
        anchor = make<WeakAnchor>(ObjectInternals::isEnding(*this) ? nullptr
                                                                   : const_cast<Object*>(this));
    return anchor;
}

const Class& Object::findClass() const {
    const Class& found = Class::ofObject(*this);
    _isa.store(&found, std::memory_order_release);
    return found;
}

namespace {

bool isEqualTo(const Object& object, const Value& other) {
    return other.object() != nullptr && object.isEqual(*other.object());
}

void setValueForKeyOf(Object& object, const Value& value, const String& key) {
    object.setValueForKey(value, key);
}

Value valueForKeyPathOf(const Object& object, const String& path) {
    return object.valueForKeyPath(path);
}

} // namespace

// What every object answers, so that one which forwards operations does not take these for others.
const Class& Object::describedClass() const {
    using describe::instanceOperation;
    static const Class* const described = &Class::publish(
        {.name = "qx::Object",
         .type = &typeid(Object),
         .superclass = nullptr,
         .operations =
             {instanceOperation<Object, &Object::description>("description"),
              instanceOperation<Object, &isEqualTo>("isEqual:"),
              instanceOperation<Object, &Object::classNameForMarshalling>(
                  "classNameForMarshalling"),
              instanceOperation<Object, &Object::valueForKey>("valueForKey:"),
              instanceOperation<Object, &setValueForKeyOf>("setValue:forKey:"),
              instanceOperation<Object, &Object::valueForUndefinedKey>("valueForUndefinedKey:"),
              instanceOperation<Object, &valueForKeyPathOf>("valueForKeyPath:"),
              instanceOperation<Object, &Object::willChangeValueForKey>("willChangeValueForKey:"),
              instanceOperation<Object, &Object::didChangeValueForKey>("didChangeValueForKey:")}},
        false);
    return *described;
}

String Object::description() const {
    return String::concat({"<", isa().name(), ": ", addressOf(*this), ">"});
}

String Object::descriptionWithLocale(const Object*, std::size_t) const { return description(); }

bool Object::isEqual(const Object& other) const { return this == &other; }

String Object::classNameForMarshalling() const { return isa().name(); }

Value Object::valueForKey(Key key) const {
    const Property* property = isa().property(key);
    return property != nullptr ? property->get(*property, *this) : valueForUndefinedKey(key);
}

void Object::setValueForKey(const Value& value, Key key) {
    switch (trySetValueForKey(value, key)) {
    case SetOutcome::set:
        return;
    case SetOutcome::refused:
        throw Exception(Exception::invalidArgument,
                        String::concat({"class ", isa().name(), " does not take the value ",
                                        value.description(), " for its key ", key.view()}));
    case SetOutcome::unknownKey:
        Object::setValueForUndefinedKey(value, key);
    }
}

SetOutcome Object::trySetValueForKey(const Value& value, Key key) {
    // Whoever is told before the change may let the last reference go.
    const Ref<Object> kept(hasCompany() ? this : nullptr);
    const Class& type = isa();
    const Property* property = type.property(key);
    if (property == nullptr) {
        try {
            setValueForUndefinedKey(value, key);
        } catch (const UndefinedKeyException& exception) {
            if (!exception.concerns(this, key))
                throw;
            return SetOutcome::unknownKey;
        }
        return SetOutcome::set;
    }
    if (property->set == nullptr)
        return SetOutcome::refused;
    if (!type.automaticallyNotifiesObserversForKey(key))
        return property->set(*property, *this, value) ? SetOutcome::set : SetOutcome::refused;
    const ChangeScope scope(*this, key);
    return property->set(*property, *this, value) ? SetOutcome::set : SetOutcome::refused;
}

Value Object::valueForUndefinedKey(Key key) const {
    throw UndefinedKeyException(
        this, key,
        String::concat({"class ", isa().name(), " has no key ", key.view(), " to read"}));
}

void Object::setValueForUndefinedKey(const Value& value, Key key) {
    throw UndefinedKeyException(this, key,
                                String::concat({"class ", isa().name(), " has no key ", key.view(),
                                                " to set to ", value.description()}));
}

namespace {

// A text or a number is no object whose keys a path could follow.
[[noreturn]] void raiseNoObject(const Value& value, Key rest, const char* purpose) {
    throw UndefinedKeyException(nullptr, rest,
                                String::concat({"class ", value.classNameForMarshalling(),
                                                " has no key ", rest.view(), purpose}));
}

} // namespace

Value Object::valueForKeyPath(std::string_view path) const {
    std::size_t dot = path.find('.');
    Value value = valueForKey(path.substr(0, dot));
    while (dot != std::string_view::npos) {
        if (value.isNullOrMarker())
            return {};
        path.remove_prefix(dot + 1);
        if (value.object() == nullptr)
            raiseNoObject(value, path, " to read");
        dot = path.find('.');
        value = value.object()->valueForKey(path.substr(0, dot));
    }
    return value;
}

void Object::setValueForKeyPath(const Value& value, std::string_view path) {
    const std::size_t dot = path.rfind('.');
    if (dot == std::string_view::npos)
        return setValueForKey(value, path);
    const Value holder = valueForKeyPath(path.substr(0, dot));
    if (holder.isNullOrMarker())
        return;
    if (holder.object() == nullptr)
        raiseNoObject(holder, path.substr(dot + 1), " to set");
    holder.object()->setValueForKey(value, path.substr(dot + 1));
}

bool Object::respondsTo(Selector selector) const { return isa().operation(selector) != nullptr; }

namespace {

[[noreturn]] void raiseUnanswered(const Class& type, Selector selector) {
    throw Exception(Exception::invalidArgument,
                    String::concat({"class ", type.name(), " does not answer the operation ",
                                    selector.name()}));
}

} // namespace

Value Object::performWithArguments(Selector selector, std::span<const Value> arguments) {
    const Class& type = isa();
    if (const Operation* operation = type.operation(selector))
        return operation->invoke(selector, type, this, arguments);
    Ref<MethodSignature> signature = methodSignatureForSelector(selector);
    if (!signature)
        raiseUnanswered(type, selector);
    // Counted, since whoever takes the call may keep it for later.
    const auto invocation = make<Invocation>(std::move(signature), this, selector, arguments);
    forwardInvocation(*invocation);
    const bool returnsValue = invocation->methodSignature().methodReturnLength() != 0;
    return returnsValue ? invocation->returnValue() : Value();
}

Ref<MethodSignature> Object::methodSignatureForSelector(Selector selector) const {
    const Operation* operation = isa().operation(selector);
    if (operation == nullptr)
        return nullptr;
    return make<MethodSignature>(selector.argumentCount(), operation->returnsValue);
}

void Object::forwardInvocation(Invocation& invocation) {
    raiseUnanswered(isa(), invocation.selector());
}

} // namespace qx
