#pragma once

// The kinds of binding: how a field gets its value out of an element, and how the value is written
// into one. Each kind is a file of its own; FieldBinding.cpp chooses among them.
//
// A kind is given the reading or writing that goes on, what is known of the field, and the caller's
// slot for errors. It sets the value through takeValue, counts the names that it consumed
// (Target::bound) and asks the reading's budget for what it goes over.

#include "marshaller/FieldValue.h"
#include "marshaller/Marshalling.h"
#include "marshaller/Unmarshalling.h"

namespace qx::detail {

struct FieldBinding {
    // True when a value was set; false without an error when there was nothing to bind.
    bool (*read)(Unmarshalling& reading, const FieldPlan& field,
                 const Unmarshalling::Target& target, Ref<Error>* error);
    // Writes the value, which is no array; a null one only of a field that is no container.
    bool (*write)(Marshalling& writing, const FieldPlan& field, const WrittenElement& element,
                  const Value& value, Ref<Error>* error);
};

extern const FieldBinding attributeBinding; // attribute.cpp
extern const FieldBinding textBinding;      // text.cpp
extern const FieldBinding elementBinding;   // element.cpp
extern const FieldBinding flattenedBinding; // flattened.cpp
extern const FieldBinding automaticBinding; // automatic.cpp

// That of a field taken as an element's: flattened where it has no container.
const FieldBinding& bindingAsElement(const FieldPlan& field) noexcept;

// collection.cpp. The values of a collection are an array; a field without "collection" may hold an
// array, too, and is written like one.
bool readCollection(Unmarshalling& reading, const FieldPlan& field,
                    const Unmarshalling::Target& target, Ref<Error>* error);
// A collection whose items are of the class that "type" names.
bool readCollectionByType(Unmarshalling& reading, const FieldPlan& field,
                          const Unmarshalling::Target& target, Ref<Error>* error);
// The text of an item, converted; null with -221, or with -224 where that is too much.
Value itemText(Unmarshalling& reading, const FieldPlan& field, Object& owner,
               Unmarshalling::Number node, Ref<Error>* error);
bool writeCollection(Marshalling& writing, const FieldPlan& field, const WrittenElement& element,
                     const Array& array, Ref<Error>* error);

// element.cpp, for what stands in a child element and what is flattened alike.
//
// Gives the object the value; a null one is missing because of the problem, or where a child of
// that name should have been.
bool setElementValue(Unmarshalling& reading, const FieldPlan& field,
                     const Unmarshalling::Target& target, Value value, Ref<Error> problem,
                     const String& name, Ref<Error>* error);
// True but for a plain struct, which is written by its class only. False with
//   -211  "No mapping definition for class: %@"
bool hasText(const Value& value, Ref<Error>* error);
// The class that "type" names, else that of the value, null where it has none. False as above, or
// with
//   -207  "No mapping for class: %@"   (the declared one)
bool findClassToWrite(const Marshalling& writing, const FieldPlan& field, const Value& value,
                      const ClassPlan*& plan, Ref<Error>* error);

} // namespace qx::detail
