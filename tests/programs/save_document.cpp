// Writes a document into the user's override area below the folder given, an own one without. The
// call itself stands between two calls of getppid(), by which a trace finds it.

#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>
#include <QXXMLMarshalling/host/ProcessInfo.h>

#include <cstdlib>
#include <filesystem>
#include <iostream>

#include <unistd.h>

int main(int argc, char** argv) {
    std::string folder = "/tmp/qx-save-XXXXXX";
    if (argc < 2 && ::mkdtemp(folder.data()) == nullptr)
        return 2;
    if (argc >= 2)
        folder = argv[1];
    // NOLINTNEXTLINE(concurrency-mt-unsafe): no other thread runs
    ::setenv("XDG_DATA_HOME", folder.c_str(), 1);
    qx::ProcessInfo::setProcessName("Client");

    auto root = qx::XMLElement::initWithName("order");
    for (int i = 0; i < 1000; ++i)
        root->addChild(qx::XMLElement::initWithName("item", std::to_string(i)));
    const auto document = qx::XMLDocument::initWithRootElement(root);
    const auto repository = QXXMLFileSystemDataRepository::init();

    qx::Ref<qx::Error> error;
    ::getppid();
    const qx::String path = repository->writeDocumentToUserOverrideArea(document, "a.xml", &error);
    ::getppid();
    if (path.isNull()) {
        std::cout << error->description().view() << '\n';
        return 1;
    }
    if (argc < 2)
        std::filesystem::remove_all(folder);
}
