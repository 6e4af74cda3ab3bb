#pragma once

// Maven project files as plain structs.

#include <QXXMLMarshalling/QXUnknownXML.h>

namespace maven {

struct Properties {
    QXUnknownXML unknown; // all of them, each an element
};
struct Dependency {
    std::string groupId, artifactId;
    std::optional<std::string> version, scope;
    QXUnknownXML unknown;
};
struct Management { // of the versions that modules use
    std::vector<Dependency> dependencies;
    QXUnknownXML unknown;
};
struct Model {
    std::vector<std::string> modules;
    std::optional<Properties> properties;
    std::optional<Management> management;
    std::vector<Dependency> dependencies;
    QXUnknownXML unknown;
};
struct Profile : Model {
    std::optional<std::string> id;
};
struct Parent {
    std::string groupId, artifactId;
    std::optional<std::string> version;
    QXUnknownXML unknown;
};
struct Project : Model {
    std::optional<Parent> parent;
    std::string artifactId;
    std::optional<std::string> groupId, version, packaging;
    std::vector<Profile> profiles;
};

void describeClasses();

// A version as it is written, or, where that is "${name}", what the model's property says.
std::string resolved(const Model& model, const std::string& version);

// Gives the version to all dependencies on the artifact that state one, or to the project, if it is
// called so itself. Where they take it from a property, that is changed. False where there are
// none.
bool setVersion(Project& project, const std::string& artifact, const std::string& version);

} // namespace maven
