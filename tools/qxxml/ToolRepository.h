#pragma once

// The file-system repository of the tool: it looks into given folders first.

#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>

#include <string>
#include <vector>

namespace qxxml {

class ToolRepository final : public QXXMLFileSystemDataRepository {
public:
    void initializeSearchPaths() override;
    // Puts the folders before those that are there already; they keep their order.
    void searchFirst(const std::vector<std::string>& folders);
};

} // namespace qxxml
