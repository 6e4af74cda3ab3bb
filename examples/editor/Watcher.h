#pragma once

// Prints every change of a document's objects while it lives, one a line, with old and new value.
// Objects are told apart by where they stand in the document when they change.

#include <QXXMLMarshalling/model/Value.h>
#include <QXXMLMarshalling/observe/Observation.h>

#include <iosfwd>
#include <map>
#include <string>

class Watcher {
public:
    Watcher(qx::Ref<qx::Object> root, std::ostream& out);

    // Everything that the value holds, with the keys that it has now.
    void watch(const qx::Value& value);
    // A key that a record may not have yet.
    void watchKey(const qx::Ref<qx::Object>& object, qx::Key key);
    // A path from the root, told apart from the objects along it: "owner.name" also changes with
    // the owner.
    void watchPath(const std::string& path);

private:
    struct Watched {
        qx::Ref<qx::Object> object; // kept, so that no other comes to stand at its address
        std::map<const void*, qx::ObservationToken> keys;
    };

    qx::Ref<qx::Object> _root;
    std::ostream& _out;
    std::map<const qx::Object*, Watched> _objects;
    std::map<std::string, qx::ObservationToken> _paths;
};
