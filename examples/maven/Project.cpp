#include "Project.h"

#include <QXXMLMarshalling/xml/XMLNode.h>

namespace maven {

namespace {

// The element of the property that a version "${name}" refers to; null where the version is none
// such, or the model itself has no property of the name.
qx::Ref<qx::XMLNode> propertyBehind(const Model& model, const std::string& version) {
    if (!version.starts_with("${") || !version.ends_with('}') || !model.properties)
        return nullptr;
    const auto& kept = model.properties->unknown.children();
    const auto elements =
        kept ? kept->get(version.substr(2, version.size() - 3)).as<qx::Array>() : nullptr;
    return elements ? elements->at(0).as<qx::XMLNode>() : nullptr;
}

bool setVersion(Model& model, const Project& project, const std::string& artifact,
                const std::string& version) {
    bool found = false;
    const auto setIn = [&](std::vector<Dependency>& dependencies) {
        for (Dependency& dependency : dependencies) {
            if (dependency.artifactId != artifact || !dependency.version)
                continue;
            found = true;
            if (const auto property = propertyBehind(model, *dependency.version))
                property->setStringValue(version);
            else if (const auto inherited = propertyBehind(project, *dependency.version))
                inherited->setStringValue(version);
            else
                dependency.version = version;
        }
    };
    setIn(model.dependencies);
    if (model.management)
        setIn(model.management->dependencies);
    return found;
}

} // namespace

void describeClasses() {
    qx::Class::define<Properties>("Properties").members<&Properties::unknown>();
    qx::Class::define<Dependency>("Dependency")
        .members<&Dependency::groupId, &Dependency::artifactId, &Dependency::version,
                 &Dependency::scope, &Dependency::unknown>();
    qx::Class::define<Management>("Management")
        .members<&Management::dependencies, &Management::unknown>();
    qx::Class::define<Model>("Model")
        .members<&Model::modules, &Model::properties, &Model::management, &Model::dependencies,
                 &Model::unknown>();
    qx::Class::define<Profile, Model>("Profile").members<&Profile::id>();
    qx::Class::define<Parent>("Parent")
        .members<&Parent::groupId, &Parent::artifactId, &Parent::version, &Parent::unknown>();
    qx::Class::define<Project, Model>("Project")
        .members<&Project::parent, &Project::artifactId, &Project::groupId, &Project::version,
                 &Project::packaging, &Project::profiles>();
}

std::string resolved(const Model& model, const std::string& version) {
    const auto property = propertyBehind(model, version);
    return property ? property->stringValue().str() : version;
}

bool setVersion(Project& project, const std::string& artifact, const std::string& version) {
    bool found = project.artifactId == artifact;
    if (found)
        project.version = version;
    found |= setVersion(project, project, artifact, version);
    for (Profile& profile : project.profiles)
        found |= setVersion(profile, project, artifact, version);
    return found;
}

} // namespace maven
