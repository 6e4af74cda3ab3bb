// The samples in C++ of the pages in docs/ are compiled and run: a block headed "cpp NAME" stands
// between "// sample: NAME" and "// end of sample" in the file of the page's name in docs/samples/.

#include <gtest/gtest.h>

#include <algorithm>
#include <filesystem>
#include <fstream>
#include <map>

namespace {

using Samples = std::map<std::string, std::string>;

// The line without so many blanks at its beginning.
std::string outdented(const std::string& line, std::size_t blanks) {
    return line.substr(std::min(blanks, line.find_first_not_of(' ')));
}

// Adds the texts that stand between lines which begin with `head` and a name, and the line `tail`;
// they are outdented as far as the head is indented.
void addSamples(Samples& samples, const std::filesystem::path& path, const std::string& head,
                const std::string& tail) {
    std::ifstream file(path);
    std::string* sample = nullptr;
    std::size_t indent = 0;
    for (std::string line; std::getline(file, line);) {
        const std::size_t blanks = std::min(line.find_first_not_of(' '), line.size());
        if (sample != nullptr && line.substr(blanks) == tail) {
            sample = nullptr;
        } else if (sample != nullptr) {
            *sample += line.empty() ? "\n" : outdented(line, indent) + "\n";
        } else if (line.compare(blanks, head.size(), head) == 0) {
            indent = blanks;
            sample = &samples[path.stem().string() + " " + line.substr(blanks + head.size())];
            EXPECT_TRUE(sample->empty()) << path << ": " << line << " stands twice";
        }
    }
}

Samples samplesIn(const char* folder, const std::string& ending, const std::string& head,
                  const std::string& tail) {
    Samples samples;
    for (const auto& entry : std::filesystem::directory_iterator(folder))
        if (entry.path().filename().string().ends_with(ending))
            addSamples(samples, entry.path(), head, tail);
    return samples;
}

} // namespace

TEST(Samples, OfThePagesAreTheCompiledOnes) {
    const Samples shown = samplesIn(QX_SOURCE_DIR "/docs", ".md", "```cpp ", "```");
    const Samples compiled =
        samplesIn(QX_SOURCE_DIR "/docs/samples", ".cpp", "// sample: ", "// end of sample");
    EXPECT_GE(shown.size(), 10U);
    EXPECT_EQ(shown, compiled);
}
