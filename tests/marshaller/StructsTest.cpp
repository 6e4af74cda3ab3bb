// Plain structs: how they are asked for, and where they lie while they are read and written. The
// types of their members are tried in StructMembersTest.cpp, kinds of binding by the pages of
// cases.

#include "Structs.h"

#include <sstream>

using structs::Counted;
using structs::errorOf;
using structs::Owner;
using structs::Place;
using structs::Shape;
using structs::Structs;
using structs::Tree;

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

TEST_F(Structs, AreMadeInPlaceAndNeverCopied) {
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
    // What is held by value is made anew first; twice is moved what the Result holds in itself.
    EXPECT_EQ(Watched::moves, 1 + 2 * 2);
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
