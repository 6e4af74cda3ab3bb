#include "qxxml/ToolRepository.h"

namespace qxxml {

// The places of the library's own repository: those of a subclass would hold the bundle of the
// program in place of the library's.
void ToolRepository::initializeSearchPaths() {
    const auto usual = QXXMLFileSystemDataRepository::init();
    setSearchPaths(usual->searchPaths());
    setSearchBundles(usual->searchBundles());
}

void ToolRepository::searchFirst(const std::vector<std::string>& folders) {
    std::size_t position = 0;
    for (const std::string& folder : folders)
        searchPaths()->insert(position++, folder);
}

} // namespace qxxml
