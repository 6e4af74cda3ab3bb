#pragma once

// Host classes for scenarios that run on records and on host classes alike: each has a property for
// every key that the scenarios use, takes any value, and says as records do that it is written as
// an item of a collection.

#include <QXXMLMarshalling/model/Class.h>

namespace host {

template <int Number>
class Host : public qx::Object {
public:
    qx::Value title, number, count, flag, text, note, lang;
    qx::Value lines, line, address, street, city, owner, extra, base;
    qx::Value unboundChildren, unboundAttributes, namespaces;
    bool isRemovable() const { return false; }
};

template <int Number>
void defineHost(const char* name) {
    using H = Host<Number>;
    qx::Class::define<H>(name)
        .template property<&H::title>("title")
        .template property<&H::number>("number")
        .template property<&H::count>("count")
        .template property<&H::flag>("flag")
        .template property<&H::text>("text")
        .template property<&H::note>("note")
        .template property<&H::lang>("lang")
        .template property<&H::lines>("lines")
        .template property<&H::line>("line")
        .template property<&H::address>("address")
        .template property<&H::street>("street")
        .template property<&H::city>("city")
        .template property<&H::owner>("owner")
        .template property<&H::extra>("extra")
        .template property<&H::base>("base")
        .template property<&H::unboundChildren>("unboundChildren")
        .template property<&H::unboundAttributes>("unboundAttributes")
        .template property<&H::namespaces>("__namespaces")
        .template operation<&H::isRemovable>("isRemovable");
}

constexpr const char* names[] = {"Order", "Line", "Address", "Owner", "Base"};

// Describes the classes for the time of a scope.
class Defined {
public:
    Defined() {
        defineHost<0>(names[0]);
        defineHost<1>(names[1]);
        defineHost<2>(names[2]);
        defineHost<3>(names[3]);
        defineHost<4>(names[4]);
    }
    ~Defined() {
        for (const char* name : names)
            qx::Class::forget(name);
    }
    Defined(const Defined&) = delete;
    Defined& operator=(const Defined&) = delete;
};

} // namespace host
