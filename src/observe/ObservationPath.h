#pragma once

// The values that one observed key path is made of: those on the path, and those that a value among
// them depends on, each once, however many ways lead to it and whatever rings they form.

#include <QXXMLMarshalling/model/Value.h>

#include <vector>

namespace qx {

struct ObservedValue {
    Ref<Object> object;
    Key key;
    bool endsPath = false; // the end of the observed path itself, not of one that it depends on
    bool leadsOn = false;  // paths lead on from it, to the object that it is
    Value value{};         // read when a path leads on
};

// Raises what the objects raise when they are asked, and NSInternalInconsistencyException beyond
// 1,000,000 values: getters that make new objects would be followed for ever.
std::vector<ObservedValue> valuesOnPath(Object& root, Key keyPath);

// The value under the key path; null where a key can't be read.
Value valueOnPath(const Object& object, std::string_view keyPath);

// The object that a path leads on to from the value; null for none and for one that is ending.
Object* objectLedTo(const Value& value) noexcept;

} // namespace qx
