// The suggestion beside an unknown name.

#include "base/NearestName.h"

#include <gtest/gtest.h>

#include <ctime>
#include <vector>

namespace {

using qx::nearestName;

TEST(NearestName, IsWhatTheWriterMeantOrNothing) {
    const std::vector<std::string_view> known = {
        "price", "prices",  "quantity",      "id",        "feed",  "boolean",
        "int",   "integer", "auto-complete", "po:number", "größe", "order"};
    const std::pair<const char*, const char*> cases[] = {
        {"pirce", "price"},            // neighbours swapped
        {"prce", "price"},             // a character less
        {"pricess", "prices"},         // the nearer of two
        {"PRICE", "price"},            // case comes before edits
        {"atom:feed", "feed"},         // another prefix
        {"a:number", "po:number"},     //
        {"number", "po:number"},       // or none
        {"bool", "boolean"},           // the beginning
        {"complete", "auto-complete"}, // the end
        {"integr", "integer"},         //
        {"autoComplete", "auto-complete"},
        {"qunatiyt", "quantity"}, // two swaps
        {"grösse", ""},           // two edits are too many for so few letters
        {"größ", "größe"},
        {"GRÖßE", "größe"},
        {"ic", ""}, // nothing is left of so short a name
        {"ix", ""},
        {"ID", "id"},
        {"ord", "order"},
        {"double", ""},
        {"price", "prices"}, // itself is no suggestion
        {"", ""},
        {":", ""},
    };
    for (const auto& [wanted, expected] : cases)
        EXPECT_EQ(nearestName(wanted, known), expected) << wanted;
}

TEST(NearestName, IsFoundInBoundedTimeWhateverTheNamesAre) {
    const std::string endless(1'000'000, 'a');
    const std::string wide = std::string(60, 'a');
    std::vector<std::string> many;
    for (int i = 0; i < 200'000; ++i)
        many.push_back(wide.substr(0, 54) + std::to_string(i));
    const std::vector longer(100, endless.substr(1));
    const std::clock_t start = std::clock(); // of this process: the machine may have more to do
    EXPECT_EQ(nearestName(endless, longer), "");
    EXPECT_EQ(nearestName(wide, many), "");
    EXPECT_EQ(nearestName("\xff\xfe", std::vector<std::string>{"ab"}), "");
    EXPECT_LT(std::clock() - start, 2 * CLOCKS_PER_SEC);
}

} // namespace
