#include <QXXMLMarshalling/base/String.h>
#include <QXXMLMarshalling/detail/ShortVector.h>

#include <gtest/gtest.h>

TEST(ShortVector, GrowsWithACopyOfWhatItHoldsAndEndsItInOrder) {
    struct Item {
        qx::String name;
        std::string* ended;
        Item(qx::String aName, std::string* end) : name(std::move(aName)), ended(end) {}
        Item(const Item&) = default;
        Item(Item&& other) noexcept
            : name(std::move(other.name)), ended(std::exchange(other.ended, nullptr)) {}
        Item& operator=(Item&&) noexcept = default;
        ~Item() {
            if (ended != nullptr)
                *ended += name.view();
        }
    };
    std::string ended;
    {
        qx::detail::ShortVector<Item, 2> items;
        items.emplace_back("a", &ended);
        items.emplace_back("b", &ended);
        items.emplace_back(items[0]);
        items.emplace_back("c", &ended);
        items.emplace_back(items[1]);
        ASSERT_EQ(items.size(), 5U);
        EXPECT_EQ(items[2].name, "a");
        EXPECT_EQ(items[4].name, "b");
    }
    EXPECT_EQ(ended, "abacb");
}
