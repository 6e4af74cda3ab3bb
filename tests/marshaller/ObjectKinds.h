#pragma once

// Classes for cases that run on every kind of object: for each class of a mapping one of its name,
// with a property for every field, whatever its value.

#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/xml/XMLElement.h>

#include <gtest/gtest.h>

#include <array>
#include <set>
#include <string>
#include <vector>

namespace kinds {

enum Kind : std::size_t { record, host, plain };

inline constexpr std::array names{"records", "hosts", "structs"};

using Keys = std::vector<std::string>;

// Values by number. A host class says as records do that it is written as an item of a collection,
// and `wasSet` is called after each setting.
template <class Base>
class Slots : public Base {
public:
    template <std::size_t Slot>
    void set(const qx::Value& value) {
        _values[Slot] = value;
        if constexpr (requires { this->wasSet(); })
            this->wasSet();
    }
    template <std::size_t Slot>
    qx::Value get() const {
        return _values[Slot];
    }

    static constexpr std::size_t count = 16;

private:
    std::array<qx::Value, count> _values;
};

struct PlainBase {};
struct HostBase : qx::Object {
    virtual bool isRemovable() const { return false; }

protected:
    virtual void wasSet() {}
};
using Host = Slots<HostBase>;

// The keys of what a marshaller keeps on an object of a host's.
inline const Keys kept = {"unboundChildren", "unboundAttributes", "__namespaces"};

template <class Base, class Builder>
void describe(Builder&& builder, const Keys& keys) {
    ASSERT_LE(keys.size(), Slots<Base>::count);
    const auto describeSlots = [&]<std::size_t... Slot>(std::index_sequence<Slot...>) {
        const auto describeSlot = [&]<std::size_t Number>() {
            if (Number < keys.size())
                builder.template property<&Slots<Base>::template get<Number>,
                                          &Slots<Base>::template set<Number>>(keys[Number]);
        };
        (describeSlot.template operator()<Slot>(), ...);
    };
    describeSlots(std::make_index_sequence<Slots<Base>::count>());
    if constexpr (requires { &Base::isRemovable; })
        builder.template operation<&Base::isRemovable>("isRemovable");
}

// Describes the classes of a mapping for the time of a scope. Records need none.
class Defined {
public:
    Defined(Kind kind, const qx::XMLElement& mapping) {
        if (kind == Kind::record)
            return;
        std::set<std::string> fields;
        for (const qx::XMLElement* type : mapping.elementsForName("class")) {
            _classes.insert(type->attributeValue("name").str());
            for (const qx::XMLElement* field : type->elementsForName("field"))
                fields.insert(field->attributeValue("name").str());
        }
        Keys keys(fields.begin(), fields.end());
        if (kind == Kind::plain)
            define<PlainBase>(keys, std::make_index_sequence<8>());
        if (kind == Kind::plain)
            return;
        keys.insert(keys.end(), kept.begin(), kept.end());
        define<HostBase>(keys, std::make_index_sequence<8>());
    }
    Defined(const Defined&) = delete;
    Defined& operator=(const Defined&) = delete;
    ~Defined() {
        for (const std::string& name : _classes)
            qx::Class::forget(name);
    }

private:
    template <class Base, std::size_t Number>
    struct Numbered : Slots<Base> {};

    template <class Base, std::size_t... Number>
    void define(const Keys& keys, std::index_sequence<Number...>) {
        ASSERT_LE(_classes.size(), sizeof...(Number));
        auto name = _classes.begin();
        const auto defineNext = [&]<class Type>() {
            if (name != _classes.end())
                describe<Base>(qx::Class::define<Type>(*name++), keys);
        };
        (defineNext.template operator()<Numbered<Base, Number>>(), ...);
    }

    std::set<std::string> _classes;
};

} // namespace kinds
