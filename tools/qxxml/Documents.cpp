#include "qxxml/Documents.h"

namespace qxxml {

// The places of the library's own repository: those of a subclass would hold the bundle of the
// program in place of the library's.
void Documents::initializeSearchPaths() {
    const auto usual = QXXMLFileSystemDataRepository::init();
    setSearchPaths(usual->searchPaths());
    setSearchBundles(usual->searchBundles());
}

void Documents::searchFirst(const std::vector<std::string>& folders) {
    std::size_t position = 0;
    for (const std::string& folder : folders)
        searchPaths()->insert(position++, folder);
}

qx::Ref<qx::XMLDocument> Documents::documentNamed(const qx::String& name, std::uint64_t* size,
                                                  qx::Ref<qx::Error>* error) {
    auto document = QXXMLFileSystemDataRepository::documentNamed(name, size, error);
    if (error != nullptr && *error)
        _failedPath = pathForResourceNamed(name).str();
    return document;
}

} // namespace qxxml
