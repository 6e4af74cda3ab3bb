#pragma once

// The classes and fields that fit what was counted, for the writers of mappings and of C++.
//
//     an element name with attributes, children, or as a root      a class
//     one with text only                                           a field's text
//     one with nothing but several elements of one name            the location of a collection
//     one with text beside its elements, or processing instructions  nothing: kept as unknown XML
//
// A class whose children come in turns (<a/><b/><a/>) gets one untyped collection for all of them,
// which keeps their order; so all of their names are classes. Such an element that holds one which
// is kept as unknown XML is kept so itself: its order would be lost otherwise.

#include "qxxml/infer/Statistics.h"

namespace qxxml {

enum class InferredType { text, integer, boolean, object };
enum class InferredKind { attribute, element, text, collection, mixedCollection };

struct InferredField {
    std::string key{};     // an identifier, the only one of its class
    std::string xmlName{}; // of the attribute, the element or the items
    InferredKind kind = InferredKind::attribute;
    InferredType type = InferredType::text;
    bool isRequired = false;
    bool isWholeNumber = false;             // all texts are, even where no type says so
    std::string location{};                 // of a collection
    std::string className{};                // of an object, or of the items
    std::vector<std::string> itemClasses{}; // of a mixed collection
    std::size_t count = 0;                  // values
    std::size_t holders = 0;                // elements that hold them
};

struct InferredClass {
    std::string name; // an identifier, the only one of its mapping
    std::string xmlName;
    std::string nsURI;
    std::string nsPrefix;
    std::size_t count = 0;
    std::vector<InferredField> fields;
    std::vector<std::string> remarks; // on what no field can have
    bool keepsXML = false;            // namespaces are declared, or something is left to no field
};

// Classes in the order in which the documents have their elements. With `keepsOrder`, elements
// whose children stand in different orders are treated like those whose children come in turns.
std::vector<InferredClass> infer(const Statistics& statistics, bool keepsOrder);

} // namespace qxxml
