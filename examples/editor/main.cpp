// Opens a project and carries out the commands of a script, which Editor.h lists; "-" reads them
// from the standard input.
//
//     example_editor PROJECT SCRIPT
//
// A command that fails is told, and the next one is carried out; the exit status then is 1.

#include "Editor.h"
#include "Task.h"

#include <QXXMLMarshalling/host/Log.h>
#include <QXXMLMarshalling/model/Error.h>
#include <QXXMLMarshalling/model/Format.h>

#include <fstream>
#include <iostream>

// The library warns of what the mapping does not know.
void QXLogWarning(std::string_view format, std::span<const qx::Value> arguments) {
    std::cout << "note: " << qx::format(format, arguments).view() << '\n';
}

namespace {

int fail(const qx::Ref<qx::Error>& error) {
    std::cerr << "editor: "
              << (error ? error->description().view() : "the document holds no project") << '\n';
    return 1;
}

// False when a command failed.
bool run(Editor& editor, std::istream& script) {
    bool allWell = true;
    for (std::string line; std::getline(script, line);) {
        std::cout << (line.empty() ? "" : line.front() == '#' ? "" : "> ") << line << '\n';
        if (line.empty() || line.front() == '#')
            continue;
        try {
            editor.perform(line);
        } catch (const std::exception& exception) {
            std::cout << "    cannot do that: " << exception.what() << '\n';
            allWell = false;
        }
    }
    return allWell;
}

} // namespace

int main(int argc, char** argv) {
    if (argc != 3) {
        std::cerr << "usage: example_editor PROJECT SCRIPT\n";
        return 2;
    }
    registerTask();

    qx::Ref<qx::Error> error;
    const auto marshaller =
        QXXMLMarshaller::initWithMappingFile(QX_EXAMPLE_DIR "/mapping.xml", &error);
    if (!marshaller)
        return fail(error);
    const auto project = QXXMLDocumentFile::open(argv[1], marshaller, &error);
    if (!project)
        return fail(error);

    const bool fromInput = std::string_view(argv[2]) == "-";
    std::ifstream file;
    if (!fromInput) {
        file.open(argv[2]);
        if (!file) {
            std::cerr << "editor: cannot read " << argv[2] << '\n';
            return 1;
        }
    }
    Editor editor(marshaller, project, std::cout);
    return run(editor, fromInput ? std::cin : file) ? 0 : 1;
}
