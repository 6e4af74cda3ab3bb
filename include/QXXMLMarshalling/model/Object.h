#pragma once

// The root class of everything that key-value access, the marshaller and the collections handle.
// An object is counted (Ref.h), knows its class as data (Class.h), reads and writes its properties
// by key, and answers operations by name. One thread uses an object at a time; only the count may
// be touched by several.
//
// Key-value access looks the key up among the properties described for the object's class; a key
// that is none goes to the undefined-key pair, which raises unless the class overrides it:
//   NSUndefinedKeyException     the class has no such key
//   NSInvalidArgumentException  the property does not take the value (null for a scalar, say)

#include <QXXMLMarshalling/base/Export.h>
#include <QXXMLMarshalling/base/Key.h>
#include <QXXMLMarshalling/base/Ref.h>
#include <QXXMLMarshalling/detail/Count.h>
#include <QXXMLMarshalling/detail/UniqueFunction.h>

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <span>
#include <string_view>

namespace qx {

class Class;
class Dictionary;
class Invocation;
class MethodSignature;
class ObservationToken;
class Value;
class WeakAnchor;
template <class Owner, class K>
class KeyedValue;
enum class ChangeKind : std::uint8_t;
struct ValueChange;

// What became of a value that was offered for a key.
enum class SetOutcome : std::uint8_t { set, refused, unknownKey };

class QX_API Object {
public:
    Object() noexcept;
    Object(const Object&) = delete;
    Object& operator=(const Object&) = delete;
    virtual ~Object();

    void retain() const noexcept { detail::increaseCount(_count); }
    // Ends the object with its last count. However deep a graph hangs on it, its release needs no
    // more stack than a bounded number of levels.
    void release() const noexcept {
        if (detail::decreaseCount(_count) == 1)
            destroy();
    }

    // The object's class as described with Class::define; a class that nobody described gets a
    // description of its own with the properties and operations of the nearest base that is
    // described when the object is first asked.
    const Class& isa() const {
        const Class* known = _isa.load(std::memory_order_acquire);
        return known != nullptr ? *known : findClass();
    }

    // The class name and the address, as "<Name: 0x…>".
    virtual String description() const;
    // The description inside a printed collection; `indent` counts levels. The default ignores
    // both.
    virtual String descriptionWithLocale(const Object* locale, std::size_t indent) const;
    // Identity, unless a class compares contents (arrays, dictionaries, data).
    virtual bool isEqual(const Object& other) const;
    // The class name under which a mapping describes this object; by default that of isa().
    virtual String classNameForMarshalling() const;

    // Raises as described above.
    virtual Value valueForKey(Key key) const;
    void setValueForKey(const Value& value, Key key);
    // Sets without raising where the class has no such key or does not take the value. What the
    // class's own setter throws passes through. Observers are told when it is set.
    virtual SetOutcome trySetValueForKey(const Value& value, Key key);
    virtual Value valueForUndefinedKey(Key key) const;
    virtual void setValueForUndefinedKey(const Value& value, Key key);
    // The value under the key, to be read or assigned: object["city"] = "Bath". See KeyedValue.h.
    KeyedValue<Object, Key> operator[](Key key);
    KeyedValue<const Object, Key> operator[](Key key) const;
    // Keys separated by dots, followed from object to object. Null, or the null marker, on the way
    // reads as null and takes nothing that is set; a text or a number on the way raises
    // NSUndefinedKeyException in both directions.
    Value valueForKeyPath(std::string_view path) const;
    void setValueForKeyPath(const Value& value, std::string_view path);

    // Announce a change that is not made through setValueForKey: each will needs its did.
    virtual void willChangeValueForKey(Key key);
    virtual void didChangeValueForKey(Key key);
    // The same for items of the collection under the key; the did is told the same as the will.
    virtual void willChange(ChangeKind kind, std::span<const std::size_t> indexes, Key key);
    virtual void didChange(ChangeKind kind, std::span<const std::size_t> indexes, Key key);

    // Tells the observer of changes at the key path, with old and new value unless other options
    // are given; see Observation.h for these and for what the change holds. Each adding is ended by
    // one removing, the latest first, or with one of the objects; removing what is not there raises
    // NSRangeException, but in the destructor of either, when the observation has ended already and
    // adding does nothing. Without an observer, NSInvalidArgumentException; what the objects on the
    // path raise when they are asked for it comes out, and nothing is added.
    void addObserver(Object* observer, Key keyPath, unsigned options = 3, Selector context = {});
    void removeObserver(Object* observer, Key keyPath);
    void removeObserver(Object* observer, Key keyPath, Selector context);
    // Called for each change; the default raises NSInternalInconsistencyException.
    virtual void observeValueForKeyPath(const String& keyPath, Object* object,
                                        const Dictionary& change, Selector context);
    // Calls the callable, which need not be copyable, for each change until the token ends. Raises
    // like addObserver, and NSInvalidArgumentException for an empty one.
    [[nodiscard]] ObservationToken observe(Key keyPath,
                                           detail::UniqueFunction<void(const ValueChange&)> call,
                                           unsigned options = 3);

    // True when the class describes an operation of that name.
    bool respondsTo(Selector selector) const;
    // Calls the operation; what it returns, null for nothing. An operation that the class does not
    // describe is forwarded (methodSignatureForSelector, forwardInvocation), and where nothing
    // takes it raises NSInvalidArgumentException, as wrong arguments do.
    Value performWithArguments(Selector selector, std::span<const Value> arguments);
    template <class... Arguments>
    Value perform(Selector selector, const Arguments&... arguments);

    // What the operation takes and returns, null where the object does not take it. A class that
    // forwards operations answers for those too and gets each as an invocation; the default
    // forwardInvocation raises NSInvalidArgumentException.
    virtual Ref<MethodSignature> methodSignatureForSelector(Selector selector) const;
    virtual void forwardInvocation(Invocation& invocation);

    // The anchor that weak references share; made on first use.
    Ref<WeakAnchor> weakAnchor() const;

    // How many objects are alive in the process; counted in debug builds, else always 0.
    static std::int64_t liveCount() noexcept;

protected:
    // The library's own class that the object is of, described by then. Host classes leave it
    // alone.
    virtual const Class& describedClass() const;

    // False as long as nobody observes the object, waits for its end or refers to it weakly.
    bool hasObserversOrWeakRefs() const noexcept { return _extras != nullptr; }

    // Whether more than one reference holds the object.
    bool isShared() const noexcept { return _count.load(std::memory_order_acquire) != 1; }

private:
    struct Extras;
    friend class Class;
    friend struct ObjectInternals;

    const Class& findClass() const;
    void destroy() const noexcept;
    Extras& extras() const;

    mutable std::atomic<const Class*> _isa{nullptr};
    mutable Extras* _extras = nullptr; // in an object that waits for its end, perhaps a link
    mutable std::atomic<std::uint32_t> _count{1}; // last: small members of other classes fit behind
};

} // namespace qx

#include <QXXMLMarshalling/model/Value.h>
