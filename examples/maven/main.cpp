// Lists the modules and dependencies of a Maven project. With an artifact and a version more, sets
// the version of the artifact there, and leaves the rest of the file as it is.
//
//     example_maven POM [ARTIFACT VERSION]

#include "Project.h"

#include <QXXMLMarshalling/QXXMLUpdate.h>

#include <iostream>

namespace {

void tell(const maven::Model& model) {
    for (const std::string& module : model.modules)
        std::cout << "    module " << module << '\n';
    for (const maven::Dependency& dependency : model.dependencies)
        std::cout << "    needs " << dependency.artifactId << ' '
                  << maven::resolved(model, dependency.version.value_or("of some version"))
                  << " to " << dependency.scope.value_or("compile") << '\n';
}

int fail(std::string_view reason) {
    std::cerr << "maven: " << reason << '\n';
    return 1;
}

} // namespace

int main(int count, char** arguments) {
    if (count != 2 && count != 4) {
        std::cerr << "usage: example_maven POM [ARTIFACT VERSION]\n";
        return 2;
    }
    maven::describeClasses();
    qx::Ref<qx::Error> error;
    const auto marshaller =
        QXXMLMarshaller::initWithMappingFile(QX_EXAMPLE_DIR "/mapping.xml", &error);
    if (!marshaller)
        return fail(error->report());
    // Most of a project is unknown here, which is as it should be.
    marshaller->setReportHandler([](const QXXMLReport&) {});
    auto project = marshaller->readFile<maven::Project>(arguments[1]);
    if (!project)
        return fail(project.error()->report());
    if (count == 2) {
        std::cout << project->artifactId << '\n';
        tell(*project);
        for (const maven::Profile& profile : project->profiles) {
            std::cout << "with the profile " << profile.id.value_or("default") << '\n';
            tell(profile);
        }
        return 0;
    }
    if (!maven::setVersion(*project, arguments[2], arguments[3]))
        return fail("no version of " + std::string(arguments[2]) + " stands there");
    const auto update = QXXMLUpdate::updateFile(*marshaller, *project, arguments[1]);
    if (!update)
        return fail(update.error()->report());
    for (const auto& edit : update->edits())
        std::cout << "line " << edit.line << ": " << edit.keyPath.view() << '\n';
    return 0;
}
