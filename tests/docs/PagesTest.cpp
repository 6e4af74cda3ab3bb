// The pages in docs/ say what is so: their samples are cases, run on records and on host classes.

#include "marshaller/Cases.h"
#include "support/ErrorRows.h"

#include <fstream>

namespace {

const bool added = [] {
    for (const char* page : {"mapping-format", "round-trip"})
        cases::addPage("docs/" + std::string(page) + ".md", {kinds::record, kinds::host});
    return true;
}();

} // namespace

// Rows such as "| -204 | `Too many … %@` | …": the table is the whole of what documents can raise.
TEST(Pages, ListEveryError) {
    std::set<std::string> listed, known;
    std::ifstream page(QX_SOURCE_DIR "/docs/mapping-format.md");
    for (std::string line; std::getline(page, line);)
        if (line.rfind("| -", 0) == 0) {
            const auto start = line.find('`') + 1;
            listed.insert(line.substr(2, line.find(' ', 2) - 1) +
                          line.substr(start, line.find('`', start) - start));
        }
    for (const auto& [code, message] : support::errorRows(support::libraryErrors))
        if (std::stoi(code) < 0 && std::stoi(code) > -1000)
            known.insert(code + " " + message);
    EXPECT_EQ(listed, known);
}
