// What a value is as another type, and which values a property takes.

#include "support/Texts.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Dictionary.h>
#include <QXXMLMarshalling/model/Format.h>
#include <QXXMLMarshalling/model/Null.h>

#include <gtest/gtest.h>

#include <cmath>

namespace {

using namespace qx;
using support::oneLine;
using support::raised;

enum class Fix { none, flat = 4 };

} // namespace

template <>
struct qx::EnumNames<Fix> {
    static constexpr auto table =
        std::to_array<qx::EnumName<Fix>>({{Fix::none, "none"}, {Fix::flat, "2d"}});
};

namespace {

class Holder : public Object {
public:
    bool flag = false;
    signed char small = 0;
    std::uint64_t large = 0;
    double real = 0;
    std::string text;
    std::optional<int> perhaps;
    Ref<Holder> next;
    std::vector<int> numbers;
    char letter = 'x';
    Fix fix = Fix::none;
    std::set<std::string> names;
    std::array<int, 2> pair{};
    std::vector<std::byte> bytes;
};

const bool described = [] {
    Class::define<Holder>("ValueTest.Holder")
        .property<&Holder::flag>("flag")
        .property<&Holder::small>("small")
        .property<&Holder::large>("large")
        .property<&Holder::real>("real")
        .property<&Holder::text>("text")
        .property<&Holder::perhaps>("perhaps")
        .property<&Holder::next>("next")
        .property<&Holder::numbers>("numbers")
        .property<&Holder::letter>("letter")
        .property<&Holder::fix>("fix")
        .property<&Holder::names>("names")
        .property<&Holder::pair>("pair")
        .property<&Holder::bytes>("bytes");
    return true;
}();

Ref<Array> array(std::initializer_list<Value> items) { return make<Array>(items); }

TEST(ValueTest, APropertyTakesWhatLosesNothing) {
    const Value object = make<Holder>();
    constexpr const char* most = "18446744073709551615";
    const struct {
        const char* key;
        std::vector<std::pair<Value, const char*>> taken;
        std::vector<Value> refused;
    } cases[] = {
        {"flag", {{"YES", "1"}, {"no", "0"}, {0.5, "1"}}, {"maybe", object}},
        {"small", {{" +127 ", "127"}, {-3.0, "-3"}}, {128, "7 pieces", "", 2.5, nullptr}},
        {"large",
         {{1e19, "10000000000000000000"}, {most, most}},
         {"18446744073709551616", -1, -1.0, object}},
        {"real",
         {{"2.5", "2.5"}, {7, "7"}, {" -INF", "-INF"}, {"NaN", "NaN"}},
         {"x", "inf", "nan", "+INF", object}},
        {"text", {{12, "12"}}, {nullptr, object}},
        {"perhaps", {{"12", "12"}, {nullptr, "(null)"}}, {"x"}},
        {"next", {{nullptr, "(null)"}}, {"text", array({})}},
        {"numbers", {{array({1, "2"}), "( 1, 2 )"}}, {array({1, "b"}), "1"}},
        {"letter", {{"y", "y"}, {"", ""}, {7, "7"}}, {"yz", nullptr, "\u00E9"}},
        {"fix", {{"2d", "2d"}, {0, "none"}, {4, "2d"}}, {"2D", "4", 1, nullptr}},
        {"names", {{array({"b", "a", "b"}), "( a, b )"}}, {array({nullptr}), "a"}},
        {"pair", {{array({1, 2}), "( 1, 2 )"}}, {array({1}), array({1, 2, 3})}},
        {"bytes",
         {{"", ""}, {" aGk=\n", "aGk="}, {"aGkh", "aGkh"}, {"/+8=", "/+8="}},
         {"aGk", "aGk=a", "aG=k", "aGl=", "a", "====", "a-kh", 1}},
    };
    for (const auto& [key, taken, refused] : cases) {
        const auto holder = make<Holder>();
        for (const auto& [value, expected] : taken) {
            EXPECT_EQ(holder->trySetValueForKey(value, key), SetOutcome::set) << key << expected;
            EXPECT_EQ(oneLine(holder->valueForKey(key)), expected) << key;
        }
        for (const Value& value : refused)
            EXPECT_EQ(holder->trySetValueForKey(value, key), SetOutcome::refused)
                << key << " " << oneLine(value);
    }
}

TEST(ValueTest, AnyValueIsANumberAndATruth) {
    const struct {
        Value value;
        std::int64_t integer;
        bool boolean;
    } cases[] = {{nullptr, 0, false},
                 {true, 1, true},
                 {NAN, 0, true},
                 {1e30, INT64_MAX, true},
                 {-1e30, INT64_MIN, true},
                 {" -007 pieces", -7, true},
                 {"\xC2\x85\xC2\xA0\xE2\x80\x83\xE2\x80\xA8\xE3\x80\x80\x0B+7", 7, false},
                 {"\xE3\x80", 0, false},
                 {"Yes", 0, true},
                 {"  ", 0, false},
                 {"+0", 0, false},
                 {make<Holder>(), 0, true},
                 {Null::marker(), 0, false},
                 {"99999999999999999999", INT64_MAX, true}};
    for (const auto& [value, integer, boolean] : cases) {
        EXPECT_EQ(value.intValue(), integer) << value.description().view();
        EXPECT_EQ(value.boolValue(), boolean) << value.description().view();
    }
}

TEST(ValueTest, EqualNumbersAreEqualWhateverTheirKindAndNoOthers) {
    EXPECT_EQ(Value(array({1, array({"a"})})), Value(array({1.0, array({"a"})})));
    EXPECT_EQ(Value(3.0), Value(3));
    EXPECT_NE(Value(9'007'199'254'740'993), Value(9007199254740992.0));
    EXPECT_NE(Value("3"), Value(3));
}

// Paths through nulls and to what is no object: tests/observe/ObjectTest.cpp.
TEST(ValueTest, PathsLeadThroughObjectsAndLists) {
    const auto holder = make<Holder>();
    holder->next = make<Holder>();
    holder->setValueForKeyPath(7, "next.small");
    const auto list = array({holder, holder->next, "text"});
    EXPECT_EQ(oneLine(list->valueForKey("small")), "( 0, 7, <null> )");
    EXPECT_EQ(list->valueForKey("@count"), Value(3));
    EXPECT_EQ(list->trySetValueForKey(1, "small"), SetOutcome::unknownKey);
    EXPECT_EQ(raised([&] { holder->valueForKeyPath("next.nothing"); }),
              "NSUndefinedKeyException: class ValueTest.Holder has no key nothing to read");
    EXPECT_EQ(raised([&] { holder->setValueForKey("x", "small"); }),
              "NSInvalidArgumentException: class ValueTest.Holder does not take the value x for "
              "its key small");
}

TEST(ValueTest, CollectionsRaiseForWhatTheyCannotDo) {
    const auto list = array({1});
    const std::string range = " in an array of 1 items";
    EXPECT_EQ(raised([&] { list->at(1); }), "NSRangeException: index 1" + range);
    EXPECT_EQ(raised([&] { list->insert(2, 0); }), "NSRangeException: index 2" + range);
    EXPECT_EQ(raised([&] { list->replace(1, 0); }), "NSRangeException: index 1" + range);
    EXPECT_EQ(raised([&] { list->remove(1); }), "NSRangeException: index 1" + range);
}

TEST(ValueTest, DictionariesAreEqualWhateverTheirOrder) {
    const auto one = make<Dictionary>(), other = make<Dictionary>();
    one->set("a", 1);
    one->set("b", array({"x"}));
    other->set("b", array({"x"}));
    EXPECT_NE(Value(one), Value(other));
    other->setValueForKey(1.0, "a");
    EXPECT_EQ(Value(one), Value(other));
    EXPECT_EQ(oneLine(one->allKeys()) + oneLine(other->allValues()), "( a, b )( ( x ), 1 )");
    EXPECT_EQ(raised([&] {
                  for (const auto& entry : *one)
                      one->setValueForKey(nullptr, entry.key);
              }),
              "NSGenericException: a dictionary was changed while it was walked");
}

// In quadratic time this would take longer than a test may.
TEST(ValueTest, ADictionaryIsEmptiedFromTheFrontInLinearTime) {
    const auto map = make<Dictionary>();
    for (int i = 0; i < 500'000; ++i)
        map->set(std::to_string(i), i);
    while (map->count() > 1)
        map->remove((*map->begin()).key);
    EXPECT_EQ(oneLine(map), "{ 499999 = 499999; }");
    map->set("7", "again");
    EXPECT_EQ(oneLine(map->allKeys()), "( 7, 499999 )");
}

// Empties the collections that it stands in when it is looked at.
struct Emptying : Object {
    Ref<Array> list = make<Array>();
    Ref<Dictionary> map = make<Dictionary>();
    String empty() const {
        list->removeAll();
        map->removeAll();
        return "gone";
    }
    String description() const override { return empty(); }
    bool isEqual(const Object&) const override { return empty().isNull(); }
};

TEST(ValueTest, CollectionsMayChangeWhileTheirItemsAreAsked) {
    const auto filled = [] {
        auto item = make<Emptying>();
        for (const char* key : {"a", "b", "c"}) {
            item->list->add(item);
            item->map->set(key, item);
        }
        return item;
    };
    const auto printed = filled();
    EXPECT_EQ(oneLine(printed->list), "( gone )");
    EXPECT_EQ(oneLine(filled()->map), "{ a = gone; }");
    const auto one = filled(), two = filled(), other = filled();
    EXPECT_NE(Value(one->list), Value(other->list));
    EXPECT_NE(Value(two->map), Value(other->map));
    EXPECT_FALSE(filled()->list->contains(other));
    for (const auto& item : {one, two, other})
        item->empty();
}

TEST(ValueTest, FormatsTakeTheirArgumentsInOrderOrByPosition) {
    const Value arguments[] = {"a", -2, 255};
    const std::pair<const char*, const char*> cases[] = {
        {"%@ %d %x", "a -2 ff"},         {"%2$ld%1$@", "-2a"},
        {"%3$06X|%2$4d", "0000FF|  -2"}, {"100%% %q", "100% %q"},
        {"%@%@%@%@ %", "a-2255%@ %"},    {"%0$@ %9$@", "%0$@ %9$@"},
        {"%2$u", "18446744073709551614"}};
    for (const auto& [text, expected] : cases)
        EXPECT_EQ(format(text, arguments), expected) << text;
}

} // namespace
