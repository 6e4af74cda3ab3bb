#include "support/Cases.h"

#include "support/Page.h"

#include <gtest/gtest.h>

#include <cctype>
#include <filesystem>
#include <iterator>
#include <sstream>
#include <stdexcept>

namespace support {

namespace {

struct Case {
    std::string page;
    std::vector<std::pair<Block, Expectation>> expectations;
};

class CaseTest : public testing::Test {
public:
    CaseTest(const Case& what, const std::function<void(const Expectation&)>& check)
        : _case(what), _check(check) {}

    void TestBody() override {
        for (const auto& [block, expectation] : _case.expectations) {
            const testing::ScopedTrace place(_case.page.c_str(), static_cast<int>(block.line),
                                             block.section);
            _check(expectation);
        }
    }

private:
    const Case _case;
    const std::function<void(const Expectation&)> _check;
};

// "A text's end" is ATextsEnd.
std::string inOneWord(const std::string& text) {
    std::string word;
    bool begins = true;
    for (const char c : text) {
        if (std::isalnum(static_cast<unsigned char>(c)) != 0) {
            word += static_cast<char>(begins ? std::toupper(c) : c);
            begins = false;
        } else if (c != '\'') {
            begins = true;
        }
    }
    return word;
}

} // namespace

bool addCases(const std::string& page, const Words& given, const Words& compared,
              std::function<void(const Expectation&)> check) {
    std::vector<Case> cases;
    std::map<std::string, std::string> texts;
    for (const Block& block : blocksOf(QX_SOURCE_DIR "/" + page)) {
        std::istringstream words(block.heading);
        std::string language, kind;
        words >> language >> kind;
        if (kind.empty() || (language != "xml" && language != "text"))
            continue;
        if (given.contains(kind)) {
            texts[kind] = block.text;
            continue;
        }
        if (!compared.contains(kind))
            throw std::invalid_argument(page + ":" + std::to_string(block.line) + ": " + kind);
        if (cases.empty() || cases.back().expectations.back().first.section != block.section)
            cases.push_back({page, {}});
        cases.back().expectations.emplace_back(
            block, Expectation{kind, block.text,
                               Words(std::istream_iterator<std::string>(words), {}), texts});
    }
    if (cases.empty())
        throw std::invalid_argument(page + " holds no case");
    const std::string suite = inOneWord(std::filesystem::path(page).stem());
    for (const Case& each : cases) {
        const Block& first = each.expectations.front().first;
        testing::RegisterTest(suite.c_str(), inOneWord(first.section).c_str(), nullptr, nullptr,
                              page.c_str(), static_cast<int>(first.line),
                              [=]() -> testing::Test* { return new CaseTest(each, check); });
    }
    return true;
}

std::string withoutLayout(const std::string& text) {
    std::string result;
    bool quoted = false;
    for (const char c : text) {
        quoted ^= c == '"';
        if (quoted || (c != ' ' && c != '\n'))
            result += c;
    }
    return result;
}

} // namespace support
