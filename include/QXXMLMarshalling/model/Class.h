#pragma once

// A class by name, as data: its superclass, how to create an instance, its properties and the
// operations that instances and the class itself answer. A host describes each of its classes once,
// before the first object of it is used:
//
//     qx::Class::define<Invoice>("Invoice")
//         .property<&Invoice::number>("number")                     // a data member
//         .property<&Invoice::total, &Invoice::setTotal>("total")   // a pair of accessors
//         .property<&Invoice::age>("age")                           // a getter: read-only
//         .property<double>("net", &Invoice::net, &Invoice::net)    // overloads of one type
//         .operation<&Invoice::setParent>("setParent:");
//     qx::Class::define<CreditNote, Invoice>("CreditNote");         // with its base class
//
// A plain struct, which derives from nothing of the library's, is described in the same way. What
// its members may be stands in ValueTraits.h; their own names are the keys unless others are given:
//
//     qx::Class::define<Point>("Point")
//         .members<&Point::lat, &Point::lon, &Point::time>()
//         .member<&Point::kind>("type")
//         .names({{Kind::peak, "peak"}, {Kind::hut, "hut"}});
//
// Structs are members of others by value, and objects only while they are handled as such
// (Boxed.h): they have no parent and no observers.
//
// The registry of classes is the list of what a document can bring to life: a mapping creates only
// classes that were described. It may be read and written from any thread. A description is
// published whole when its builder ends; a name that is taken stays with the first, and a warning
// is logged. Descriptions live for ever. A plug-in keeps what takes its classes back:
//
//     static const qx::ClassRegistration part =
//         qx::Class::define<Part>("Part").members<&Part::number>().registration();
//
// A class that nobody described is, for its objects, a subclass of the nearest of its C++ bases
// that is; a description that comes later, of the class or of a base, holds for objects that are
// asked for their class from then on.

#include <QXXMLMarshalling/detail/ClassDescription.h>
#include <QXXMLMarshalling/model/Boxed.h>

#include <array>
#include <atomic>
#include <initializer_list>

namespace qx {

namespace detail {
struct StructInternals;
} // namespace detail

template <class T>
class ClassBuilder;

// Takes a class back when it ends: a static object of a plug-in does so when that is unloaded.
// Objects of the class must be gone by then. Documents give records in their place afterwards.
class QX_API ClassRegistration {
public:
    ClassRegistration() noexcept = default;
    ClassRegistration(ClassRegistration&& other) noexcept
        : _described(std::exchange(other._described, nullptr)) {}
    ClassRegistration& operator=(ClassRegistration other) noexcept {
        std::swap(_described, other._described);
        return *this;
    }
    ~ClassRegistration();

private:
    template <class T>
    friend class ClassBuilder;
    explicit ClassRegistration(const Class* described) noexcept : _described(described) {}

    const Class* _described = nullptr;
};

class QX_API Class {
public:
    // The class described under the name; null when there is none.
    static const Class* named(std::string_view name);
    // The class described for the C++ type; null when there is none.
    static const Class* described(const std::type_info& type);
    // The classes that were described for the C++ type, which need not be described itself, and for
    // those that derive from it, by name.
    static std::vector<const Class*> derivedFrom(const std::type_info& type);
    // Begins the description of T, whose base class is Base (Object when not given).
    template <class T, class Base = Object>
    static ClassBuilder<T> define(std::string_view name);
    // Takes the name and the C++ type back; objects of the class must be gone. A reading that is
    // under way makes no more of them. False when unknown.
    static bool forget(std::string_view name);

    String name() const noexcept { return _name.string(); }
    Key key() const noexcept { return _name; }
    // Null for Object itself.
    const Class* superclass() const;
    bool isSubclassOf(const Class& other) const;

    // A new instance, of a plain struct in a box (Boxed.h); null where the class cannot be created
    // without arguments.
    Ref<Object> create() const;
    // Whether it describes a plain struct, and of which type.
    bool isStruct() const noexcept { return _structType != nullptr; }
    const std::type_info& type() const noexcept { return *_type; }

    // Whether setting a value by key, in an object of this very class that nobody observes, is no
    // more than setting the property: its C++ class overrides nothing of key-value setting.
    bool setsByProperty() const noexcept { return _setsByProperty; }
    // The property of that name, inherited ones included; null when there is none.
    const Property* property(Key key) const;
    // The class's own properties in the order of their description, not the inherited ones.
    const std::vector<Property>& ownProperties() const noexcept { return _properties; }

    // The operation of instances, or of the class object, inherited ones included; null when none.
    const Operation* operation(Selector selector) const;
    const Operation* classOperation(Selector selector) const;
    // Calls an operation of the class object; the receiver's class is passed on to operations that
    // ask for it. Raises NSInvalidArgumentException when there is none of that name.
    Value performWithArguments(Selector selector, std::span<const Value> arguments) const;
    template <class... Arguments>
    Value perform(Selector selector, const Arguments&... arguments) const {
        const std::array<Value, sizeof...(Arguments)> values{Value(arguments)...};
        return performWithArguments(selector, values);
    }

    // Whether setValueForKey tells observers of the property by itself: the answer of the class
    // operation "automaticallyNotifiesObserversForKey:", else true.
    bool automaticallyNotifiesObserversForKey(Key key) const;

    Class(const Class&) = delete;
    Class& operator=(const Class&) = delete;

private:
    friend class Object;
    friend struct ClassRegistry;
    friend struct detail::StructInternals;

    explicit Class(detail::ClassDraft draft);
    // The class of the object's dynamic type; a stand-in when nobody described it.
    static const Class& ofObject(const Object& object);
    // Makes an object that holds a struct of the class know it at once.
    void assignTo(const detail::StructObject& object) const noexcept;

    Key _name;
    const std::type_info* _type;
    const std::type_info* _superclassType;
    const detail::StructType* _structType; // how structs of the class are moved; null for objects
    mutable std::atomic<const Class*> _superclass{nullptr};
    Ref<Object> (*_create)();
    bool _setsByProperty;
    std::vector<Property> _properties;
    std::vector<Operation> _operations;
    std::vector<Operation> _classOperations;
};

// Collects the description of T and publishes it when it ends, at the end of the statement.
template <class T>
class ClassBuilder {
public:
    explicit ClassBuilder(detail::ClassDraft draft) : _draft(std::move(draft)) {}
    ClassBuilder(const ClassBuilder&) = delete;
    ClassBuilder& operator=(const ClassBuilder&) = delete;
    ~ClassBuilder() {
        if (_draft.type != nullptr)
            detail::publish(std::move(_draft));
    }

    // Publishes the description now, until the registration ends; nothing may be added any more.
    // A description that is not taken, since the type has one, leaves an empty registration.
    [[nodiscard]] ClassRegistration registration() {
        bool isTaken = false;
        const Class* const described = &detail::publish(std::exchange(_draft, {}), true, &isTaken);
        return ClassRegistration(isTaken ? described : nullptr);
    }

    // Data members, under their own names.
    template <auto... Members>
    ClassBuilder& members() {
        (member<Members>(detail::memberName<Members>()), ...);
        return *this;
    }
    // A data member under a key of its own.
    template <auto Member>
    ClassBuilder& member(std::string_view key) {
        static_assert(std::is_member_object_pointer_v<decltype(Member)>, "no data member");
        return property<Member>(key);
    }
    // The names of an enumeration, as EnumNames (ValueTraits.h) gives them, for every class that
    // has members of it; of two such lists the later one holds. They are of one enumeration, else
    // it raises NSInvalidArgumentException.
    ClassBuilder& names(std::initializer_list<detail::NamedNumber> names) {
        detail::nameNumbers(names);
        return *this;
    }

    // A data member, or a getter without arguments (read-only).
    template <auto Member>
    ClassBuilder& property(std::string_view name) {
        if constexpr (detail::HasKeys<T, Member>)
            detail::addParts<T, Member>(_draft.properties);
        else
            _draft.properties.push_back(detail::memberProperty<T, Member>(name));
        return *this;
    }
    // A pair of accessors.
    template <auto Getter, auto Setter>
    ClassBuilder& property(std::string_view name) {
        _draft.properties.push_back(detail::accessorProperty<T, Getter, Setter>(name));
        return *this;
    }
    // Overloaded accessors of the value type V.
    template <class V>
    ClassBuilder& property(std::string_view name, V (T::*getter)() const, void (T::*setter)(V)) {
        _draft.properties.push_back(detail::boundProperty<T, V, V>(name, getter, setter));
        return *this;
    }
    template <class V>
    ClassBuilder& property(std::string_view name, V (T::*getter)() const,
                           void (T::*setter)(const V&)) {
        _draft.properties.push_back(detail::boundProperty<T, V, const V&>(name, getter, setter));
        return *this;
    }
    // A member function, or a free function that takes a T& first; one argument for each colon.
    template <auto Function>
    ClassBuilder& operation(std::string_view name) {
        _draft.operations.push_back(detail::instanceOperation<T, Function>(name));
        return *this;
    }
    // A static or free function; it may take a `const qx::Class&` first, the receiver's class.
    template <auto Function>
    ClassBuilder& classOperation(std::string_view name) {
        _draft.classOperations.push_back(detail::classOperation<Function>(name));
        return *this;
    }

private:
    detail::ClassDraft _draft;
};

template <class T, class Base>
ClassBuilder<T> Class::define(std::string_view name) {
    detail::ClassDraft draft;
    draft.name = name;
    draft.type = &typeid(T);
    draft.superclass = &typeid(Base);
    if constexpr (std::derived_from<T, Object>) {
        static_assert(std::derived_from<T, Base>);
        draft.setsByProperty = detail::setsByProperty<T>();
        if constexpr (std::is_default_constructible_v<T>)
            draft.create = []() -> Ref<Object> { return make<T>(); };
    } else {
        static_assert(std::is_class_v<T>);
        if constexpr (std::same_as<Base, Object>) {
            draft.structType = &detail::structTypeOf<T, void>;
        } else {
            static_assert(std::derived_from<T, Base> && !std::derived_from<Base, Object>);
            draft.structType = &detail::structTypeOf<T, Base>;
        }
        if constexpr (std::is_default_constructible_v<T> && std::move_constructible<T>)
            draft.create = []() -> Ref<Object> { return make<Boxed<T>>(); };
    }
    return ClassBuilder<T>(std::move(draft));
}

} // namespace qx
