#pragma once

// The two classes of the MIME database that have something to do: all others stay records. Once
// they are described, documents under mapping.xml bring them to life.

#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/ValueTraits.h>

// What a class needs so that its objects can be written: the keys under which the marshaller keeps
// XML that the mapping does not know, and the word that an item of a collection is to be written.
class DatabaseObject : public qx::Object {
public:
    bool isRemovable() const { return false; }

    qx::Value unboundChildren, unboundAttributes, namespaces;
};

// A pattern for the names of a type's files.
class Glob : public DatabaseObject {
public:
    bool matches(const std::string& fileName) const;

    std::string pattern;
    int weight = 50; // which of several patterns that match a name decides: the highest
    bool isCaseSensitive = false;
};

class MimeType : public DatabaseObject {
public:
    // The weight of the heaviest pattern that matches the name; none where no pattern does.
    std::optional<int> weightFor(const std::string& fileName) const;

    std::string name; // "image/png"
    std::vector<qx::Ref<Glob>> globs;
    // Arrays of records; null where the type has none.
    qx::Value comments, acronyms, expandedAcronyms, icons, genericIcons;
    qx::Value magic, treeMagic, rootElements, aliases, superclasses;
};

// Describes the classes.
void registerMimeTypes();
