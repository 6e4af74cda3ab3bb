// Strings beside the texts and containers of the standard library.

#include <QXXMLMarshalling/base/Key.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <iomanip>
#include <sstream>

namespace {

using namespace qx;

TEST(StringTest, StringsAreComparedWithEveryTextByTheirBytes) {
    // In their order.
    const std::vector<String> texts{nullptr, "", "B", "a", Key("a b").string(), "a\xC3\xA9"};
    for (std::size_t i = 0; i < texts.size(); ++i)
        for (std::size_t j = 0; j < texts.size(); ++j) {
            const String &a = texts[i], &b = texts[j];
            SCOPED_TRACE(testing::Message() << i << " and " << j);
            const auto order = i <=> j;
            EXPECT_EQ(a <=> b, order);
            EXPECT_EQ(a <=> String(b.isNull() ? nullptr : b.c_str()), order); // of its own
            EXPECT_EQ(a <=> (b.isNull() ? nullptr : b.c_str()), order);
            EXPECT_EQ(a == (b.isNull() ? nullptr : b.c_str()), i == j);
            EXPECT_EQ(a == Key(b), i == j);
            EXPECT_EQ(Key(b) != a, i != j);
            if (b.isNull())
                continue;
            EXPECT_EQ(b.str() <=> a, j <=> i);
            EXPECT_EQ(a <=> b.view(), order);
            EXPECT_EQ(a == b.str(), i == j);
            EXPECT_EQ(b.view() == a, i == j);
            EXPECT_EQ(std::hash<String>()(a) == std::hash<String>()(b.str()), i == j);
        }
    EXPECT_EQ(std::ranges::find(texts, "B") - texts.begin(), 2);
    EXPECT_EQ(std::ranges::lower_bound(texts, std::string("a")) - texts.begin(), 3);
}

TEST(StringTest, StringsAreJoinedAndPrintedWithNullAsNothing) {
    const String text = "Bath";
    const char* const none = nullptr;
    EXPECT_EQ(std::string("to ") + text + ", " + std::string_view("UK") + String() + none + text,
              "to Bath, UKBath");
    EXPECT_FALSE((String() + none).isNull());
    std::ostringstream out;
    out << std::setw(6) << text << '|' << String() << '|';
    EXPECT_EQ(out.str(), "  Bath||");
}

} // namespace
