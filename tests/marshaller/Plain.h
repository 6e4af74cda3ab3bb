#pragma once

// Plain structs for the scenarios of Host.h: the third kind that they run on.

#include "Host.h"

#include <algorithm>
#include <string>

namespace plain {

// A property for every key but those of unknown XML.
struct Plain {
    template <std::size_t Key>
    void set(const qx::Value& value) {
        values[Key] = value;
    }
    template <std::size_t Key>
    qx::Value get() const {
        return values[Key];
    }
    qx::Value values[host::keys.size()];
};

class Defined {
public:
    Defined() { define(std::make_index_sequence<5>()); }
    ~Defined() {
        for (const char* name : names)
            qx::Class::forget(name);
    }

private:
    static constexpr const char* names[] = {"Order", "Line", "Address", "Owner", "Base"};

    template <std::size_t Number>
    struct Numbered : Plain {};
    template <std::size_t... Number>
    static void define(std::index_sequence<Number...>) {
        (describe<Number>(std::make_index_sequence<host::keys.size()>()), ...);
    }
    template <std::size_t Number, std::size_t... Key>
    static void describe(std::index_sequence<Key...>) {
        auto builder = qx::Class::define<Numbered<Number>>(names[Number]);
        (addUnlessKept<Key>(builder), ...);
    }
    template <std::size_t Key, class Builder>
    static void addUnlessKept(Builder& builder) {
        constexpr std::string_view key = host::keys[Key];
        if constexpr (!key.starts_with("unbound") && !key.starts_with("__"))
            builder.template property<&Plain::get<Key>, &Plain::set<Key>>(key);
    }
};

// The object as it is shown, without what only objects with a place for it keep.
inline std::string withoutKept(std::string shown) {
    for (const char* key : {"__namespaces: ", "unboundAttributes: ", "unboundChildren: "}) {
        for (auto at = shown.find(key); at != std::string::npos; at = shown.find(key)) {
            std::size_t end = at;
            int open = 0;
            do {
                open += shown[end] == '[' || shown[end] == '{' ? 1 : 0;
                open -= shown[end] == ']' || shown[end] == '}' ? 1 : 0;
                ++end;
            } while (open > 0 || (shown[end - 1] != ']' && shown[end - 1] != '}'));
            const bool isFirst = shown[at - 1] == '{';
            const std::size_t comma = shown.compare(end, 2, ", ") == 0 ? 2 : 0;
            shown.erase(isFirst ? at : at - 2, end - at + (isFirst ? comma : 2));
        }
    }
    return shown;
}

// Runs each row on records, on host classes and on structs; of these, run(row, true) is called.
template <class Table, class Run>
void forAllKinds(const Table& table, Run run) {
    host::forRecordsAndHosts(table, [&](const auto& row) { run(row, false); });
    const Defined defined;
    for (const auto& row : table) {
        SCOPED_TRACE(row.question + std::string(", on structs"));
        run(row, true);
    }
}

} // namespace plain
