// Members of every type, filled, written and filled again; what they refuse.

#include "Structs.h"

#include <array>
#include <chrono>

using structs::attributeField;
using structs::Circle;
using structs::errorOf;
using structs::Owner;
using structs::Place;
using structs::Shape;
using structs::Structs;
using structs::Tree;

namespace {

enum class Fix { none, flat, full };
enum class Wind { calm = 0, strong = 9 };

} // namespace

template <>
struct qx::EnumNames<Wind> {
    static constexpr auto table =
        std::to_array<qx::EnumName<Wind>>({{Wind::calm, "calm"}, {Wind::strong, "strong"}});
};

// A type with traits of its own.
struct Grams {
    double value = 0;
    bool operator==(const Grams&) const = default;
};
template <>
struct qx::ValueTraits<Grams> {
    static Value toValue(Grams grams) {
        return String::concat({Value(grams.value).description(), "g"});
    }
    static bool fromValue(const Value& value, Grams& grams) {
        const std::string text = value.string().str();
        return text.ends_with('g') &&
               ValueTraits<double>::fromValue(text.substr(0, text.size() - 1), grams.value);
    }
};

namespace {

struct Everything {
    std::int8_t i8 = 0;
    std::int16_t i16 = 0;
    std::int32_t i32 = 0;
    std::int64_t i64 = 0;
    std::uint8_t u8 = 0;
    std::uint16_t u16 = 0;
    std::uint32_t u32 = 0;
    std::uint64_t u64 = 0;
    char letter = 0;
    float single = 0;
    double real = 0;
    bool flag = false;
    std::string text;
    qx::String shared;
    Fix fix = Fix::none;
    Wind wind = Wind::calm;
    std::vector<std::byte> bytes;
    std::chrono::year_month_day day{};
    std::chrono::sys_seconds time{};
    std::chrono::milliseconds lasts{};
    qx::DateTime zoned;
    Grams weight;
    std::optional<double> maybe;
    std::optional<int> missing;
    std::unique_ptr<std::string> own;

    Place place;
    std::optional<Place> second;
    std::vector<Place> places;
    std::array<Place, 2> pair;
    std::unique_ptr<Shape> shape;
    std::shared_ptr<Shape> common;
    std::vector<std::unique_ptr<Shape>> shapes;
    std::variant<std::monostate, Place, Tree> either;
    qx::Ref<Owner> owner;
    std::vector<qx::Ref<Owner>> owners;
    Tree tree;
};

// In the order in which the mapping has them.
constexpr const char* attributes[][2] = {{"i8", "-128"},
                                         {"i16", "-32768"},
                                         {"i32", "-2147483648"},
                                         {"i64", "-9223372036854775808"},
                                         {"u8", "255"},
                                         {"u16", "65535"},
                                         {"u32", "4294967295"},
                                         {"u64", "18446744073709551615"},
                                         {"letter", "%"},
                                         {"single", "0.5"},
                                         {"real", "-INF"},
                                         {"flag", "0"},
                                         {"text", ""},
                                         {"shared", "s"},
                                         {"fix", "2d"},
                                         {"wind", "strong"},
                                         {"bytes", "AAECAw=="},
                                         {"day", "2026-03-01"},
                                         {"time", "2026-03-01T09:30:00Z"},
                                         {"lasts", "PT1.5S"},
                                         {"zoned", "2026-03-01T10:30:00+01:00"},
                                         {"weight", "2.5g"},
                                         {"maybe", "0"},
                                         {"own", "mine"}};

constexpr const char* elements =
    R"(<place city="Bath" zip="0"></place><second city="" zip="1"></second>)"
    R"(<item city="a" zip="1"></item><item city="b" zip="2"></item>)"
    R"(<one city="c" zip="3"></one><one city="d" zip="4"></one>)"
    R"(<shape label="s"></shape><circle label="" radius="1.5"></circle>)"
    R"(<shapes><circle label="c" radius="2"></circle><shape label="t"></shape></shapes>)"
    R"(<tree name="either"></tree><boss name="B"></boss><owner name="o"></owner>)"
    R"(<root name="r"><branch name="x"><branch name="y"></branch></branch>)"
    R"(<graft name="g"></graft></root>)";

// What is read from this is written like this.
std::string everything() {
    std::string text = "<everything";
    for (const auto& [name, value] : attributes)
        text += std::string(" ") + name + "=\"" + value + "\"";
    return text + ">" + elements + "</everything>";
}

std::string mappingOfEverything() {
    std::string fields = attributeField("missing");
    for (const auto& [name, value] : attributes)
        fields += attributeField(name);
    return "<class name='Everything'><map-to xml='everything'/>" + fields +
           "<field name='place' type='Place'><bind-xml node='element'/></field>"
           "<field name='second' type='Place'><bind-xml node='element'/></field>"
           "<field name='places' type='Place' collection='array'><bind-xml name='item'/></field>"
           "<field name='pair' type='Place' collection='array'><bind-xml name='one'/></field>"
           "<field name='shape'><bind-xml node='element'/></field>"
           "<field name='common'><bind-xml name='nothing' node='element'/><alt-xml name='circle'/>"
           "</field><field name='shapes' collection='array'><bind-xml name='shapes'/></field>"
           "<field name='either'><bind-xml name='tree' node='element'/></field>"
           "<field name='owner' type='Owner'><bind-xml name='boss' node='element'/></field>"
           "<field name='owners' type='Owner' collection='array'><bind-xml name='owner'/></field>"
           "<field name='tree' type='Tree'><bind-xml name='root' node='element'/></field></class>";
}

class StructMembers : public Structs {
protected:
    StructMembers() : Structs(mappingOfEverything()) {}

    void SetUp() override {
        using E = Everything;
        Structs::SetUp();
        qx::Class::define<E>("Everything")
            .members<&E::i8, &E::i16, &E::i32, &E::i64, &E::u8, &E::u16, &E::u32, &E::u64,
                     &E::letter, &E::single, &E::real, &E::flag, &E::text, &E::shared>()
            .members<&E::fix, &E::wind, &E::bytes, &E::day, &E::time, &E::lasts, &E::zoned,
                     &E::weight, &E::maybe, &E::missing, &E::own>()
            .members<&E::place, &E::second, &E::places, &E::pair, &E::shape, &E::common, &E::shapes,
                     &E::either, &E::owner, &E::owners, &E::tree>()
            .names({{Fix::none, "none"}, {Fix::flat, "2d"}, {Fix::full, "3d"}});
    }
    void TearDown() override {
        qx::Class::forget("Everything");
        Structs::TearDown();
    }
};

} // namespace

TEST_F(StructMembers, AreOfEveryType) {
    const auto read = marshaller->readString<Everything>(everything());
    ASSERT_TRUE(read) << errorOf(read);
    EXPECT_EQ(read->u64, 18446744073709551615U);
    EXPECT_EQ(read->fix, Fix::flat);
    EXPECT_EQ(read->zoned.offset, std::chrono::minutes(60));
    EXPECT_EQ(read->maybe, 0);
    EXPECT_EQ(read->missing, std::nullopt);
    EXPECT_EQ(*read->own, "mine");
    EXPECT_EQ(read->place, (Place{"Bath", 0}));
    EXPECT_EQ(read->places, (std::vector<Place>{{"a", 1}, {"b", 2}}));
    EXPECT_EQ(read->pair[1], (Place{"d", 4}));
    EXPECT_EQ(dynamic_cast<Circle&>(*read->common).radius, 1.5);
    EXPECT_EQ(dynamic_cast<Circle&>(*read->shapes.at(0)).label, "c");
    EXPECT_EQ(read->shapes.at(1)->label, "t");
    EXPECT_EQ(std::get<Tree>(read->either).name, "either");
    EXPECT_EQ(read->owner->name, "B");
    EXPECT_EQ(read->tree.branches.at(0).branches.at(0).name, "y");
    EXPECT_EQ(read->tree.graft->name, "g");

    qx::Ref<qx::Error> error;
    const auto written = marshaller->marshall(*read, &error);
    ASSERT_TRUE(written) << error->description().view();
    EXPECT_EQ(written->rootElement()->XMLString().view(), everything());
    const auto again = marshaller->unmarshall<Everything>(written);
    ASSERT_TRUE(again) << errorOf(again);
    EXPECT_EQ(again->tree, read->tree);
    EXPECT_EQ(marshaller->marshall(*again)->rootElement()->XMLString().view(), everything());
    Everything reloaded;
    for (const std::string& text :
         {everything(), everything(), std::string("<everything/>"), everything()}) {
        ASSERT_TRUE(marshaller->readStringInto(reloaded, text, &error))
            << support::told(error) << text;
        EXPECT_EQ(marshaller->marshall(reloaded)->rootElement()->XMLString(),
                  marshaller->marshall(*marshaller->readString<Everything>(text))
                      ->rootElement()
                      ->XMLString());
    }
}

// Kinds of text that members do not take, with the whole message each.
TEST_F(StructMembers, RefuseWhatTheyCannotTake) {
    constexpr const char* refused[][2] = {
        {"i8", "128"},       {"i16", "1.5"},        {"i32", "7 pieces"},
        {"u8", "-1"},        {"u64", "1e3"},        {"letter", "ab"},
        {"single", "much"},  {"flag", "perhaps"},   {"fix", "4d"},
        {"wind", "9"},       {"bytes", "A"},        {"day", "2026-02-30"},
        {"time", "soon"},    {"lasts", "1s"},       {"zoned", "2026-03-01"},
        {"weight", "heavy"}, {"maybe", "zero"},     {"missing", "99999999999"},
        {"place", "text"},   {"either", "no tree"}, {"owner", "text"}};
    std::string fields;
    for (const auto& [name, value] : refused)
        fields += attributeField(name);
    const auto texts =
        scenario::marshaller("<class name='Everything'><map-to xml='e'/>" + fields + "</class>");
    for (const auto& [name, value] : refused)
        EXPECT_EQ(errorOf(texts->readString<Everything>(std::string("<e ") + name + "='" + value +
                                                        "'/>")),
                  std::string("-222: Unable to set value: ") + value + " for key: " + name +
                      " in class: Everything (Invalid Value)");
    EXPECT_EQ(errorOf(marshaller->readString<Place>("<place zip='x'/>")),
              "-222: Unable to set value: x for key: zip in class: Place (Invalid Value)");
}

TEST_F(StructMembers, RefuseOneItemTooFew) {
    const auto error =
        errorOf(marshaller->readString<Everything>("<everything><one/></everything>"));
    EXPECT_TRUE(error.ends_with(" for key: pair in class: Everything (Invalid Value)")) << error;
}
