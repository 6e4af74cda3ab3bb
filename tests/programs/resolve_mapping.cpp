// Prints the classes of a mapping that is found by name, with their fields, in the order in which
// they were resolved, and then where each of the names given is found.
//
// usage: resolve_mapping NAME...

#include <QXXMLMarshalling/QXXMLDataRepositoryManager.h>
#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>
#include <QXXMLMarshalling/QXXMLMarshallingMapping.h>

#include <iostream>

int main(int argc, char** argv) {
    const auto manager = QXXMLDataRepositoryManager::defaultManager();
    const auto files = manager->persistentRepository().as<QXXMLFileSystemDataRepository>();
    if (argc < 2) // nothing asked: as a test on its own it is about the repositories alone
        return files && files->searchPaths()->count() == 2 ? 0 : 1;

    qx::Ref<qx::Error> error;
    const auto document = manager->documentNamed(argv[1], nullptr, &error);
    const auto mapping = QXXMLMarshallingMapping::initWithDocument(document.get(), &error);
    if (!mapping) {
        std::cout << error->description().view() << '\n';
        return 1;
    }
    for (const auto& type : mapping->mapping()->classMappings()) {
        std::cout << type->className().view() << ':';
        for (const auto& field : type->fields())
            std::cout << ' ' << field->name().view();
        std::cout << '\n';
    }
    std::cout << '\n';
    for (int i = 1; i < argc; ++i) {
        const qx::String path = files->pathForResourceNamed(argv[i]);
        std::cout << argv[i] << " -> " << (path.isNull() ? "nowhere" : path.c_str()) << '\n';
    }
}
