// Writes a document into the user's override area below the folder given, an own one without: a new
// one, or, as the second argument says, one that is there with an edit, by "update" or as a "file".
// The call itself stands between two calls of getppid(), by which a trace finds it.

#include <QXXMLMarshalling/QXXMLDocumentFile.h>
#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>
#include <QXXMLMarshalling/host/ProcessInfo.h>

#include <cstdlib>
#include <filesystem>
#include <iostream>

#include <unistd.h>

namespace {

using qx::Error;
using qx::Ref;

bool writeNew(Ref<Error>* error) {
    auto root = qx::XMLElement::initWithName("order");
    for (int i = 0; i < 1000; ++i)
        root->addChild(qx::XMLElement::initWithName("item", std::to_string(i)));
    const auto document = qx::XMLDocument::initWithRootElement(root);
    const auto repository = QXXMLFileSystemDataRepository::init();
    ::getppid();
    const auto path = repository->writeDocumentToUserOverrideArea(document, "a.xml", error);
    ::getppid();
    return !path.isNull();
}

bool writeEdit(const std::string& path, bool isFile, Ref<Error>* error) {
    const auto marshaller = QXXMLMarshaller::initWithMappingXML(
        qx::XMLDocument::initWithData(
            "<mapping><class name='Order'><field name='text'><bind-xml node='text'/></field>"
            "</class></mapping>")
            .get());
    const auto file = QXXMLDocumentFile::open(path, marshaller, error);
    if (!file)
        return false;
    file->root()->setValueForKey("the new one", "text");
    ::getppid();
    bool isWritten = false;
    if (isFile) {
        isWritten = file->save(error);
    } else {
        const auto update = QXXMLUpdate::updateFile(*marshaller, file->root(), path);
        isWritten = static_cast<bool>(update);
        *error = update.error();
    }
    ::getppid();
    return isWritten;
}

} // namespace

int main(int argc, char** argv) {
    std::string folder = "/tmp/qx-save-XXXXXX";
    if (argc < 2 && ::mkdtemp(folder.data()) == nullptr)
        return 2;
    if (argc >= 2)
        folder = argv[1];
    // NOLINTNEXTLINE(concurrency-mt-unsafe): no other thread runs
    ::setenv("XDG_DATA_HOME", folder.c_str(), 1);
    qx::ProcessInfo::setProcessName("Client");

    Ref<Error> error;
    const std::string how = argc >= 3 ? argv[2] : "new";
    const bool isWritten = how == "new"
                               ? writeNew(&error)
                               : writeEdit(folder + "/Client/a.xml", how == "file", &error);
    if (!isWritten) {
        std::cout << error->description().view() << '\n';
        return 1;
    }
    if (argc < 2)
        std::filesystem::remove_all(folder);
}
