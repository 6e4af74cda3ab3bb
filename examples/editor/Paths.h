#pragma once

// Places in a document by name: "owner.name", or "tasks.2.days" for a value of the second task.

#include <QXXMLMarshalling/model/Array.h>

#include <string>
#include <vector>

// A value's place: the object that holds it, and its key there.
struct Place {
    qx::Ref<qx::Object> holder;
    qx::Key key;

    qx::Value value() const { return holder->valueForKey(key); }
};

// The value at the path, the root itself for an empty one. Throws std::runtime_error where the path
// leads nowhere.
qx::Value valueAt(const qx::Ref<qx::Object>& root, const std::string& path);
// Throws also when the path ends at an item of a list.
Place placeAt(const qx::Ref<qx::Object>& root, const std::string& path);
// "tasks.2" as "tasks" and the index 1. Throws std::runtime_error when it is none of an item.
std::pair<std::string, std::size_t> listAndIndex(const qx::Ref<qx::Object>& root,
                                                 const std::string& path);
// Where the object stands in the document now: "", "owner", "tasks.2"; "(gone)" if it does not.
std::string pathOf(const qx::Object& object, const qx::Ref<qx::Object>& root);

// The keys of a record's contents, or of the properties of a host object's class; not those under
// which the library keeps the XML that the mapping does not know.
std::vector<qx::Key> keysOf(const qx::Object& object);
// A value on one line: a text in quotes, a number, "a Person", "3 items", "nothing".
std::string shortText(const qx::Value& value);
