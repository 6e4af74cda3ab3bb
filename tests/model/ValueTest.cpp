// What a value is as another type, and which values a property takes.

#include "support/Texts.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Dictionary.h>
#include <QXXMLMarshalling/model/Format.h>
#include <QXXMLMarshalling/model/Null.h>

#include "model/LentText.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <array>
#include <charconv>
#include <cmath>
#include <numeric>

namespace {

using namespace qx;
using support::oneLine;
using support::raised;
using support::taken;

enum class Fix { none, flat = 4 };

} // namespace

template <>
struct qx::EnumNames<Fix> {
    static constexpr auto table =
        std::to_array<qx::EnumName<Fix>>({{Fix::none, "none"}, {Fix::flat, "2d"}});
};

namespace {

Ref<Array> array(std::initializer_list<Value> items) { return make<Array>(items); }

TEST(ValueTest, APropertyTakesWhatLosesNothing) {
    const Value object = make<Dictionary>();
    constexpr const char* most = "18446744073709551615";
    const struct {
        std::string (*taken)(const Value&);
        std::vector<std::pair<Value, const char*>> values;
        std::vector<Value> refused;
    } cases[] = {
        {taken<bool>, {{"YES", "1"}, {"no", "0"}, {0.5, "1"}}, {"maybe", object}},
        {taken<signed char>,
         {{" +127 ", "127"}, {-3.0, "-3"}},
         {128, "7 pieces", "", "+-3", 2.5, nullptr}},
        {taken<std::uint64_t>,
         {{1e19, "10000000000000000000"}, {most, most}},
         {"18446744073709551616", -1, -1.0, object}},
        {taken<double>,
         {{"2.5", "2.5"}, {7, "7"}, {" -INF", "-INF"}, {"NaN", "NaN"}},
         {"x", "inf", "nan", "+INF", object}},
        {taken<std::string>, {{12, "12"}}, {nullptr, object}},
        {taken<std::optional<int>>, {{"12", "12"}, {nullptr, "(null)"}}, {"x"}},
        {taken<Ref<Dictionary>>, {{nullptr, "(null)"}}, {"text", array({})}},
        {taken<std::vector<int>>, {{array({1, "2"}), "( 1, 2 )"}}, {array({1, "b"}), "1"}},
        {taken<char>, {{"y", "y"}, {"", ""}, {7, "7"}}, {"yz", nullptr, "\u00E9"}},
        {taken<Fix>, {{"2d", "2d"}, {0, "none"}, {4, "2d"}}, {"2D", "4", 1, nullptr}},
        {taken<std::set<std::string>>,
         {{array({"b", "a", "b"}), "( a, b )"}},
         {array({nullptr}), "a"}},
        {taken<std::array<int, 2>>, {{array({1, 2}), "( 1, 2 )"}}, {array({1}), array({1, 2, 3})}},
        {taken<std::vector<std::byte>>,
         {{"", ""}, {" aGk=\n", "aGk="}, {"aGkh", "aGkh"}, {"/+8=", "/+8="}},
         {"aGk", "aGk=a", "aG=k", "aGl=", "a", "====", "a-kh", 1}},
    };
    for (const auto& [taken, values, refused] : cases) {
        for (const auto& [value, expected] : values)
            EXPECT_EQ(taken(value), expected) << oneLine(value);
        for (const Value& value : refused)
            EXPECT_EQ(taken(value), "refused") << oneLine(value);
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
                 {make<Dictionary>(), 0, true},
                 {Null::marker(), 0, false},
                 {"99999999999999999999", INT64_MAX, true}};
    for (const auto& [value, integer, boolean] : cases) {
        EXPECT_EQ(value.intValue(), integer) << value.description().view();
        EXPECT_EQ(value.boolValue(), boolean) << value.description().view();
    }
}

TEST(ValueTest, ARealIsDescribedByTheShortestTextThatReadsBack) {
    for (const double real : {0.001, 0.0005, 5.95, 100.5, 1e-4, 0.1 + 0.2, 1234567.875, 2.0 / 3,
                              999999999999.999, 1e12, 12345678901234.5})
        for (const double value : {real, -real, std::nextafter(real, 0.0), std::round(real)}) {
            std::array<char, 64> text;
            const auto end = std::to_chars(text.data(), text.data() + text.size(), value,
                                           std::chars_format::fixed);
            EXPECT_EQ(Value(value).description(), std::string_view(text.data(), end.ptr));
        }
}

TEST(ValueTest, ATextIsTheSameWhereverItsBytesLie) {
    for (std::size_t size = 0; size <= 20; ++size) {
        std::string text(size, '\0');
        std::iota(text.begin(), text.end(), '\0');
        const Value inside = text, shared = String(text);
        const std::vector<Value> grown = {inside, shared, detail::LentText::of(text)};
        std::string bytes = text;
        Value kept = detail::LentText::of(bytes);
        const Value copy = kept;
        detail::LentText::keep(kept);
        bytes.assign(size, 'x');
        Value moved = copy;
        moved = Value(std::move(moved));
        for (const Value& value :
             {inside, shared, grown[0], grown[1], grown[2], copy, kept, moved}) {
            EXPECT_EQ(value.view(), text);
            EXPECT_EQ(value.string(), text);
            EXPECT_EQ(value, inside);
            EXPECT_TRUE(value.isSameAs(Value(value)));
        }
        EXPECT_FALSE(inside.isSameAs(Value(text + "x")));
    }
}

TEST(ValueTest, EqualNumbersAreEqualWhateverTheirKindAndNoOthers) {
    EXPECT_EQ(Value(array({1, array({"a"})})), Value(array({1.0, array({"a"})})));
    EXPECT_EQ(Value(3.0), Value(3));
    EXPECT_NE(Value(9'007'199'254'740'993), Value(9007199254740992.0));
    EXPECT_NE(Value("3"), Value(3));
}

TEST(ValueTest, ValuesHaveOneOrderWhateverTheirKind) {
    constexpr std::int64_t odd = 9'007'199'254'740'993; // no double
    const std::vector<Value> values{nullptr, NAN,      -INFINITY, INT64_MIN, -3.5, -3,
                                    false,   1,        1.5,       odd - 1,   odd,  INT64_MAX,
                                    0x1p63,  INFINITY, "",        "10",      "9",  make<Array>()};
    const std::vector<Value> others{
        nullptr, NAN, -INFINITY, -0x1p63, -3.5,     -3.0, 0.0,  true, 1.5,
        0x1p53,  odd, INT64_MAX, 0x1p63,  INFINITY, "",   "10", "9",  make<Dictionary>()};
    for (std::size_t i = 0; i < values.size(); ++i)
        for (std::size_t j = 0; j < others.size(); ++j) {
            EXPECT_EQ(values[i] <=> others[j], std::weak_ordering(i <=> j)) << i << ' ' << j;
            EXPECT_EQ(others[j] <=> values[i], std::weak_ordering(j <=> i)) << i << ' ' << j;
        }
}

struct Spot {
    int number = 0;
};

TEST(ValueTest, AValueIsHadAsWhatAPropertyWouldTake) {
    Class::define<Spot>("ValueTest.Spot").members<&Spot::number>();
    EXPECT_EQ(Value("7").get<int>(), 7);
    EXPECT_EQ(Value("2d").get<Fix>(), Fix::flat);
    EXPECT_EQ(Value().get<std::optional<int>>(), std::nullopt);
    EXPECT_EQ(Value().tryGet<int>(), std::nullopt);
    EXPECT_EQ(Value("7 pieces").tryGet<int>(), std::nullopt);
    EXPECT_EQ(raised([] { Value("7 pieces").get<int>(); }),
              "NSInvalidArgumentException: the value 7 pieces is no int");
    // Structs are copied, at any depth, though nobody else holds their boxes.
    const Value spot = make<Boxed<Spot>>(Spot{3});
    const Value spots = array({array({make<Boxed<Spot>>(Spot{4})})});
    for (int times = 0; times < 2; ++times) {
        EXPECT_EQ(spot.get<Spot>().number, 3);
        EXPECT_EQ(spot.get<std::unique_ptr<Spot>>()->number, 3);
        EXPECT_EQ((spots.get<std::vector<std::vector<Spot>>>()[0][0].number), 4);
    }
}

TEST(ValueTest, CollectionsAreRanges) {
    const auto list = array({"b", 3, "a", nullptr, 2.5});
    std::ranges::sort(*list);
    EXPECT_EQ(oneLine(list), "( (null), 2.5, 3, a, b )");
    std::ranges::stable_sort(*list, std::greater(), &Value::intValue);
    EXPECT_EQ(oneLine(list), "( 3, 2.5, (null), a, b )");
    EXPECT_EQ(std::ranges::find(std::as_const(*list), "a") - std::as_const(*list).begin(), 3);
    list->at(0) = list[4];
    EXPECT_EQ(oneLine(list), "( b, 2.5, (null), a, b )");
    EXPECT_EQ(raised([&] { list[5] = 1; }), "NSRangeException: index 5 in an array of 5 items");
    EXPECT_EQ(
        raised([&] { std::ranges::for_each(*list, [&](const Value&) { list->removeAll(); }); }),
        "NSGenericException: an array was changed while it was walked");

    const auto map = make<Dictionary>();
    map["b"] = 2;
    map["a"] = Fix::flat;
    map["c"] = map["b"];
    map["gone"] = 1;
    map["gone"] = nullptr;
    std::string all;
    for (const auto& [key, value] : *map)
        all += key.str() + "=" + value.description().str() + " ";
    EXPECT_EQ(all, "b=2 a=2d c=2 ");
    EXPECT_EQ(std::ranges::find(*map, "a", &Dictionary::Entry::key)->value, "2d");
    EXPECT_EQ(map["b"].get<int>() + map->at("b").get<int>(), 4);
    EXPECT_EQ(std::as_const(*map)["gone"].value(), nullptr);
    EXPECT_EQ(raised([&] { map->at("gone"); }),
              "NSUndefinedKeyException: a dictionary has no key gone");
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
        EXPECT_EQ(qx::format(text, arguments), expected) << text;
}

} // namespace
