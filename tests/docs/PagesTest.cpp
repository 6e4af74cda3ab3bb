// The pages in docs/ say what is so: their samples are cases, run on records and on host classes.

#include "marshaller/Cases.h"
#include "support/ErrorRows.h"

#include <fstream>

namespace {

const bool added = [] {
    for (const char* page : {"mapping-format", "round-trip", "errors"})
        cases::addPage("docs/" + std::string(page) + ".md", {kinds::record, kinds::host});
    return true;
}();

} // namespace

// Below a heading such as "## -204" stand items such as "- `Too many … %@`: …": they are the whole
// of what documents can raise.
TEST(Pages, ListEveryError) {
    std::set<std::string> listed, known;
    std::ifstream page(QX_SOURCE_DIR "/docs/errors.md");
    std::string section;
    for (std::string line; std::getline(page, line);)
        if (line.starts_with("## -"))
            section = line.substr(3);
        else if (line.starts_with("- `") && section != "-2000")
            listed.insert(section + " " + line.substr(3, line.find('`', 3) - 3));
    for (const auto& [code, message] : support::errorRows(support::libraryErrors))
        if (std::stoi(code) < 0 && std::stoi(code) > -1000)
            known.insert(code + " " + message);
    EXPECT_EQ(listed, known);
}
