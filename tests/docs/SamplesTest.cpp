// The samples in C++ of the pages in docs/ are compiled and run: a block headed "cpp NAME" stands
// between "// sample: NAME" and "// end of sample" in the file of the page's name in docs/samples/.
// A name with a dot is that of a whole file, which tests/checks/tutorial.sh compiles.

#include "support/Page.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <map>

namespace {

// By "PAGE NAME", the blocks of a folder's files whose heading begins so.
std::map<std::string, std::string> samplesIn(const char* folder, const char* ending,
                                             const std::string& beginning,
                                             const std::string& opening,
                                             const std::string& closing) {
    std::map<std::string, std::string> samples;
    for (const auto& file : std::filesystem::directory_iterator(folder))
        if (file.path().extension() == ending)
            for (const auto& block : support::blocksOf(file.path(), opening, closing))
                if (block.heading.starts_with(beginning) &&
                    block.heading.find('.') == std::string::npos) {
                    const auto name = block.heading.substr(beginning.size());
                    auto& sample = samples[file.path().stem().string() + " " + name];
                    EXPECT_EQ(sample, "") << file.path() << ": " << name << " stands twice";
                    sample = block.text;
                }
    return samples;
}

} // namespace

TEST(Samples, OfThePagesAreTheCompiledOnes) {
    const auto shown = samplesIn(QX_SOURCE_DIR "/docs", ".md", "cpp ", "```", "```");
    EXPECT_GE(shown.size(), 10U);
    EXPECT_EQ(shown, samplesIn(QX_SOURCE_DIR "/docs/samples", ".cpp", "",
                               "// sample: ", "// end of sample"));
}
