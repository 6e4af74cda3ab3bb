#pragma once

// The file-system repository of the tool: it looks into given folders first, and remembers which
// file it could not read, so that the error of an include can name it.

#include <QXXMLMarshalling/QXXMLFileSystemDataRepository.h>

#include <string>
#include <vector>

namespace qxxml {

class ToolRepository final : public QXXMLFileSystemDataRepository {
public:
    void initializeSearchPaths() override;
    // Puts the folders before those that are there already; they keep their order.
    void searchFirst(const std::vector<std::string>& folders);

    qx::Ref<qx::XMLDocument> documentNamed(const qx::String& name, std::uint64_t* size,
                                           qx::Ref<qx::Error>* error) override;
    // The path of the last document that ended in an error; empty when none did.
    const std::string& failedPath() const noexcept { return _failedPath; }

private:
    std::string _failedPath;
};

} // namespace qxxml
