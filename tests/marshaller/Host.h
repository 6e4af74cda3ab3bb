#pragma once

// Host classes for scenarios that run on records and on host classes alike: each has a property for
// every key that the scenarios use, takes any value, and says as records do that it is written as
// an item of a collection.

#include <QXXMLMarshalling/model/Class.h>

#include <gtest/gtest.h>

#include <array>

namespace host {

constexpr std::array keys{
    "title",        "count",   "flag",  "text",  "note", "lines",           "address",
    "street",       "city",    "owner", "extra", "base", "unboundChildren", "unboundAttributes",
    "__namespaces", "id",      "child", "word",  "flat", "typed",           "located",
    "named",        "wrapped", "all"};

// `wasSet` is called after each setting.
class Host : public qx::Object {
public:
    template <std::size_t Key>
    void set(const qx::Value& value) {
        _values[Key] = value;
        wasSet();
    }
    template <std::size_t Key>
    qx::Value get() const {
        return _values[Key];
    }
    virtual bool isRemovable() const { return false; }

protected:
    virtual void wasSet() {}

private:
    qx::Value _values[keys.size()];
};

template <class Builder, std::size_t... Key>
void describe(Builder& builder, std::index_sequence<Key...>) {
    (builder.template property<&Host::get<Key>, &Host::set<Key>>(keys[Key]), ...);
    builder.template operation<&Host::isRemovable>("isRemovable");
}
template <class Builder>
void describe(Builder&& builder) {
    describe(builder, std::make_index_sequence<keys.size()>());
}

// Describes a class of its own for each name, for the time of a scope.
class Defined {
public:
    Defined() {
        define<0>();
        define<1>();
        define<2>();
        define<3>();
        define<4>();
    }
    ~Defined() {
        for (const char* name : names)
            qx::Class::forget(name);
    }

private:
    static constexpr const char* names[] = {"Order", "Line", "Address", "Owner", "Base"};

    template <int Number>
    static void define() {
        struct Numbered : Host {};
        describe(qx::Class::define<Numbered>(names[Number]));
    }
};

// Runs each row of a table on records, then on host classes.
template <class Table, class Run>
void forRecordsAndHosts(const Table& table, Run run) {
    const auto runAll = [&](const char* kind) {
        for (const auto& row : table) {
            SCOPED_TRACE(row.question + std::string(kind));
            run(row);
        }
    };
    runAll(", on records");
    const Defined defined;
    runAll(", on host classes");
}

} // namespace host
