// Plain structs: members of every type, filled, written and filled again; what they refuse; where
// they lie meanwhile. The tables of UnmarshalTest.cpp and MarshalTest.cpp run on structs, too.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXXMLMarshalling.h>

#include <chrono>

namespace {

enum class Fix { none, flat, full };
enum class Wind { calm = 0, strong = 9 };

struct Place {
    std::string city;
    int zip = 0;
    bool operator==(const Place&) const = default;
};

struct Shape {
    Shape() = default;
    Shape(Shape&&) = default;
    Shape& operator=(Shape&&) = default;
    virtual ~Shape() = default;
    std::string label;
};
struct Padding {
    virtual ~Padding() = default;
    double padding = 0;
};
struct Circle : Padding, Shape {
    double radius = 0;
};

struct Tree {
    std::string name;
    std::vector<Tree> branches;
    std::unique_ptr<Tree> graft;
    bool operator==(const Tree& other) const {
        return name == other.name && branches == other.branches && !graft == !other.graft &&
               (!graft || *graft == *other.graft);
    }
};

class Owner : public qx::Object {
public:
    std::string name;
    bool isRemovable() const { return false; }
    QXUnknownXML unknown;
};

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

std::string attributeField(const std::string& name) {
    return "<field name='" + name + "'><bind-xml node='attribute'/></field>";
}

std::string mapping() {
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
           "<field name='tree' type='Tree'><bind-xml name='root' node='element'/></field></class>"
           "<class name='Place'>" +
           attributeField("city") + attributeField("zip") + "</class><class name='Owner'>" +
           attributeField("name") + "</class><class name='Shape'><map-to xml='shape'/>" +
           attributeField("label") +
           "</class><class name='Circle' extends='Shape'><map-to xml='circle'/>" +
           attributeField("radius") + "</class><class name='Tree'><map-to xml='tree'/>" +
           attributeField("name") +
           "<field name='branches' type='Tree' collection='array'><bind-xml name='branch'/>"
           "</field><field name='graft' type='Tree'><bind-xml node='element'/></field></class>"
           "<class name='Nobody'/><class name='Counted'>" +
           attributeField("zero") + attributeField("cut") + attributeField("plain") + "</class>";
}

// A class of the library's with optional members.
class Counted : public qx::Object {
public:
    std::optional<int> zero;
    std::optional<double> cut;
    int plain = 0;
    Place place;
    QXUnknownXML unknown;
};

class Structs : public testing::Test {
protected:
    void SetUp() override {
        using E = Everything;
        qx::Class::define<Place>("Place").members<&Place::city, &Place::zip>();
        qx::Class::define<Shape>("Shape").members<&Shape::label>();
        qx::Class::define<Circle, Shape>("Circle").members<&Circle::radius>();
        qx::Class::define<Tree>("Tree").members<&Tree::name, &Tree::branches, &Tree::graft>();
        qx::Class::define<Owner>("Owner")
            .members<&Owner::name, &Owner::unknown>()
            .operation<&Owner::isRemovable>("isRemovable");
        qx::Class::define<Counted>("Counted")
            .members<&Counted::zero, &Counted::cut, &Counted::plain, &Counted::place,
                     &Counted::unknown>();
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
        for (const char* name :
             {"Place", "Shape", "Circle", "Tree", "Owner", "Counted", "Everything"})
            qx::Class::forget(name);
    }

    qx::Ref<QXXMLMarshaller> marshaller = scenario::marshaller(mapping());
};

template <class Result>
std::string errorOf(const Result& result) {
    return support::told(result.error());
}

} // namespace

TEST_F(Structs, HaveMembersOfEveryType) {
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
}

// Kinds of text that members do not take, with the whole message each.
TEST_F(Structs, RefuseWhatTheirMembersCannotTake) {
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

// An object of a wrong class, and one item too many.
TEST_F(Structs, RefuseWhatIsOfAnotherClass) {
    const auto message = [](const auto& result) {
        const std::string text = errorOf(result);
        return text.substr(0, text.find('<')) + text.substr(std::min(text.find('>'), text.size()));
    };
    const auto wrong =
        scenario::marshaller("<class name='Everything'><map-to xml='e'/>"
                             "<field name='place'><bind-xml name='tree' node='element'/></field>"
                             "<field name='shape'><bind-xml name='place' node='element'/></field>"
                             "<field name='either'><bind-xml name='owner' node='element'/></field>"
                             "<field name='pair' type='Place' collection='array'>"
                             "<bind-xml name='one'/></field></class><class name='Tree'/>"
                             "<class name='Place'/><class name='Owner'/>");
    for (const char* key : {"place:tree:Tree", "shape:place:Place", "either:owner:Owner"}) {
        const std::string all = key;
        const auto first = all.find(':'), second = all.rfind(':');
        EXPECT_EQ(message(wrong->readString<Everything>(
                      "<e><" + all.substr(first + 1, second - first - 1) + "/></e>")),
                  "-222: Unable to set value: > for key: " + all.substr(0, first) +
                      " in class: Everything (Invalid Value)");
    }
    EXPECT_NE(errorOf(wrong->readString<Everything>("<e><one/></e>"))
                  .find("for key: pair in class: Everything"),
              std::string::npos);
}

TEST_F(Structs, AreReadByTheTypeThatIsAskedFor) {
    EXPECT_EQ(errorOf(marshaller->readString<Place>("<tree/>")),
              "-211: The root is of class: Tree, not of class: Place (Invalid Mapping)");
    EXPECT_EQ(errorOf(marshaller->readString<Shape>("<circle radius='bad'/>")),
              "-211: The root is of class: Circle, not of class: Shape (Invalid Mapping)")
        << "nothing is cut off a struct";
    EXPECT_EQ(errorOf(marshaller->readString<Place>("<other/>")),
              "-211: No definition to handle element: <other></other> (Invalid Mapping)");
    EXPECT_EQ(errorOf(marshaller->readString<Place>("<nobody/>")),
              "-211: The root is of class: Nobody, not of class: Place (Invalid Mapping)")
        << "a record";
    EXPECT_EQ(errorOf(marshaller->readString<Owner>("<place/>")),
              "-211: The root is of class: Place, not of class: Owner (Invalid Mapping)");
    EXPECT_EQ(marshaller->readString<Owner>("<owner name='n'/>").value()->name, "n");
    EXPECT_TRUE(marshaller->readString<qx::Object>("<nobody/>"));
    EXPECT_FALSE(marshaller->readFile<Place>("/nowhere/place.xml"));
    std::istringstream stream("<place zip='7'/>");
    EXPECT_EQ(marshaller->readStream<Place>(stream)->zip, 7);
    EXPECT_THROW(marshaller->readString<Place>("<place zip='x'/>").value(), qx::Exception);
}

TEST_F(Structs, ServeOneSlotManyCalls) {
    qx::Ref<qx::Error> error;
    EXPECT_FALSE(marshaller->readString("<place zip='x'/>", &error));
    EXPECT_TRUE(error);
    EXPECT_TRUE(marshaller->readString("<place zip='1'/>", &error).as<qx::Boxed<Place>>());
    EXPECT_FALSE(error);
    EXPECT_TRUE(marshaller->writeString(qx::Value(1), &error).isNull());
    EXPECT_TRUE(error);
    EXPECT_FALSE(marshaller->writeString(Place{}, &error).isNull());
    EXPECT_FALSE(error);
}

TEST_F(Structs, LoseNoZero) {
    EXPECT_EQ(marshaller->marshall(Place{})->rootElement()->XMLString(),
              R"(<Place city="" zip="0"></Place>)");
    const auto counted = qx::make<Counted>();
    EXPECT_EQ(scenario::write(*marshaller, counted), "<Counted></Counted>");
    counted->zero = 0;
    counted->cut = -0.1276;
    EXPECT_EQ(scenario::write(*marshaller, counted),
              R"(<Counted zero="0" cut="-0.1276"></Counted>)");
    marshaller->setOmitsZeroAttributes(false);
    EXPECT_EQ(scenario::write(*marshaller, counted),
              R"(<Counted zero="0" cut="-0.1276" plain="0"></Counted>)");
}

namespace {

// Counts how often it is copied and moved.
struct Watched {
    int number = 0;
    static inline int copies = 0, moves = 0;
    Watched() = default;
    Watched(const Watched& other) : number(other.number) { ++copies; }
    Watched(Watched&& other) noexcept : number(other.number) { ++moves; }
    Watched& operator=(const Watched& other) {
        number = other.number;
        ++copies;
        return *this;
    }
    Watched& operator=(Watched&& other) noexcept {
        number = other.number;
        ++moves;
        return *this;
    }
};
struct Watchers {
    Watched one;
    std::optional<Watched> maybe;
    std::vector<Watched> all;
};

} // namespace

TEST_F(Structs, AreMovedOnceAndNeverCopied) {
    qx::Class::define<Watched>("Watched").members<&Watched::number>();
    qx::Class::define<Watchers>("Watchers")
        .members<&Watchers::one, &Watchers::maybe, &Watchers::all>();
    const auto watching = scenario::marshaller(
        "<class name='Watchers'><field name='one' type='Watched'><bind-xml node='element'/></field>"
        "<field name='maybe' type='Watched'><bind-xml node='element'/></field>"
        "<field name='all' type='Watched' collection='array'><bind-xml name='w'/></field></class>"
        "<class name='Watched'><field name='number'><bind-xml name='n' node='attribute'/></field>"
        "</class>");
    const auto read =
        watching->readString<Watchers>("<watchers><one n='1'/><maybe n='2'/><w n='3'/><w n='4'/>"
                                       "<w n='5'/></watchers>");
    ASSERT_TRUE(read) << errorOf(read);
    EXPECT_EQ(read->all.at(2).number, 5);
    // Each once, and twice more what the Result holds in itself.
    EXPECT_EQ(Watched::moves, 5 + 2 * 2);
    watching->marshall(*read);
    EXPECT_EQ(Watched::copies, 0);
    qx::Class::forget("Watched");
    qx::Class::forget("Watchers");
}

TEST_F(Structs, AreCopiedByKeyValueAccess) {
    const auto counted = qx::make<Counted>();
    counted->setValueForKey(qx::make<qx::Boxed<Place>>(Place{"Bath", 1}), "place");
    EXPECT_EQ(counted->place, (Place{"Bath", 1}));
    const auto copy = counted->valueForKey("place").as<qx::Boxed<Place>>();
    (*copy)->zip = 2;
    EXPECT_EQ(counted->place.zip, 1);
    counted->setValueForKey(copy, "place");
    EXPECT_EQ(counted->place.zip, 2);
    EXPECT_EQ((*copy)->city, "Bath") << "somebody else holds it: it was copied";

    qx::Boxed<Tree> tree;
    tree->name = "a";
    tree->graft = std::make_unique<Tree>();
    tree->graft->name = "b";
    const qx::Value graft = tree.valueForKey("graft");
    tree.setValueForKey(graft, "graft");
    EXPECT_EQ(tree->graft->name, "b");
    EXPECT_TRUE(graft.object()->valueForKey("name").isNull()) << "it was given away";
    EXPECT_EQ(tree.trySetValueForKey(graft, "graft"), qx::SetOutcome::refused);
    EXPECT_EQ(tree->graft->name, "b");
    EXPECT_THROW(tree.valueForKey("height"), qx::UndefinedKeyException);
}

TEST_F(Structs, AreUndoneAsMembersOfObjects) {
    struct Undone : qx::UndoableObject {
        Place place;
        std::vector<Place> places;
    };
    qx::Class::define<Undone, qx::UndoableObject>("Undone")
        .members<&Undone::place, &Undone::places>();
    const auto object = qx::make<Undone>();
    const auto manager = qx::make<qx::UndoManager>();
    object->setUndoManager(manager);
    {
        const qx::UndoGroup group(*manager);
        object->setValueForKey(qx::make<qx::Boxed<Place>>(Place{"Bath", 1}), "place");
        auto all = qx::make<qx::Array>();
        all->add(qx::make<qx::Boxed<Place>>(Place{"Wells", 2}));
        object->setValueForKey(all, "places");
    }
    for (int i = 0; i < 2; ++i) {
        manager->undo();
        EXPECT_EQ(object->place, Place());
        EXPECT_EQ(object->places.size(), 0U);
        manager->redo();
        EXPECT_EQ(object->place, (Place{"Bath", 1}));
        EXPECT_EQ(object->places, (std::vector<Place>{{"Wells", 2}}));
    }
    qx::Class::forget("Undone");
}

TEST_F(Structs, ArePartOfRecordsAndHostClasses) {
    const auto mixed = scenario::marshaller(
        "<class name='Counted'><map-to xml='c'/>"
        "<field name='place' type='Place'><bind-xml node='element'/></field></class>"
        "<class name='Nobody'><map-to xml='n'/>"
        "<field name='places' type='Place' collection='array'><bind-xml name='p'/></field></class>"
        "<class name='Place'><field name='zip'><bind-xml node='attribute'/></field></class>");
    const std::string record = R"(<n><p zip="0"></p><p zip="1"></p></n>)";
    EXPECT_EQ(scenario::write(*mixed, mixed->readString(record)), record);
    const std::string host = R"(<c><place zip="0"></place></c>)";
    const auto counted = mixed->readString<Counted>(host);
    ASSERT_TRUE(counted) << errorOf(counted);
    EXPECT_EQ(scenario::write(*mixed, *counted), host);
}
