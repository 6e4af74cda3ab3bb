#pragma once

// What a field of a mapping means for reading and writing, worked out once when the mapping is
// resolved: its kind of binding, names and their fall-backs, the classes behind them. Immutable;
// the plan of the mapping owns it.

#include <QXXMLMarshalling/QXXMLClassMapping.h>

#include <vector>

namespace qx::detail {

class ClassPlan;

// The kinds of binding of a single value. Each is a file in marshaller/ and a row of the table in
// marshaller/FieldBinding.cpp, in this order.
enum class BindingKind : std::uint8_t {
    attribute,
    text,
    element,
    flattened, // an object without an element of its own
    automatic  // an attribute or an element, as the document or the value has it
};

// How a field's "collection" is gathered.
enum class CollectionKind : std::uint8_t { none, array, unknown };

// What a field's "type" makes of text: `other` is the name of a class.
enum class ValueType : std::uint8_t { none, boolean, integer, string, other };

// One place where a field's value may stand. The names are interned.
struct BindingPlan {
    String bindTo;   // as written, null or empty where absent
    String name;     // bindTo, or the field's name where that is empty
    String location; // the wrapper element, null or empty for none
    // The class mapped to an element called `bindTo`, or `name`; null when there is none.
    const ClassPlan* classOfBindTo = nullptr;
    const ClassPlan* classOfName = nullptr;
};

struct FieldPlan {
    // What a field says by itself: all but the classes that it names.
    static FieldPlan withoutClasses(const QXXMLFieldMapping& mapping);

    const QXXMLFieldMapping* mapping = nullptr;
    Key key; // the property
    BindingKind kind = BindingKind::attribute;
    CollectionKind collection = CollectionKind::none;
    ValueType valueType = ValueType::none;
    bool isRequired = false;
    bool isContainer = true;
    // The class that "type" names; null when it names none.
    const ClassPlan* typeClass = nullptr;
    // In the order in which they are tried. The first, of the "bind-xml", is where the field is
    // written; empty without one.
    std::vector<BindingPlan> bindings;

    // Where the field is written: null texts without a binding, but for the name.
    const String& bindTo() const { return primaryBinding().bindTo; }
    const String& location() const { return primaryBinding().location; }
    const String& xmlName() const {
        return bindings.empty() ? mapping->name() : bindings.front().name;
    }

    bool isCollection() const { return collection != CollectionKind::none; }
    // Whether it is known what each item of the collection is: an object of a class, or a text.
    bool hasItemType() const { return typeClass != nullptr || hasSimpleType(); }
    bool hasType() const { return valueType != ValueType::none; }
    // Values are texts, as they are or converted.
    bool hasSimpleType() const { return hasType() && valueType != ValueType::other; }

private:
    static const BindingPlan noBinding;

    const BindingPlan& primaryBinding() const {
        return bindings.empty() ? noBinding : bindings.front();
    }
};

} // namespace qx::detail
