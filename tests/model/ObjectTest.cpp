// Objects as such: which class they are of, key paths.

#include "support/Texts.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Null.h>
#include <QXXMLMarshalling/model/WeakRef.h>

#include <gtest/gtest.h>

namespace {

using namespace qx;
using support::raised;

class Wagon : public Object {
public:
    Ref<Wagon> next;
    Value load;
    signed char seats = 0;
};

// Nobody describes these two.
class Coach : public Wagon {};
struct Painted {
    virtual ~Painted() = default;
    int colour = 0;
};
class DiningCar : public Painted, public Coach {};

struct Sleeper : DiningCar {
    int beds = 0;
};
struct Siding : Object {
    int length = 0;
};
struct LongSiding : Siding {};

const bool described = [] {
    Class::define<Sleeper, DiningCar>("ObjectTest.Sleeper").property<&Sleeper::beds>("beds");
    Class::define<Wagon>("ObjectTest.Wagon")
        .property<&Wagon::next>("next")
        .property<&Wagon::load>("load")
        .property<&Wagon::seats>("seats");
    return true;
}();

TEST(ObjectTest, AClassThatNobodyDescribedIsOneOfItsNearestDescribedBase) {
    EXPECT_NE(make<Coach>()->isa().property("load"), nullptr);
    const auto car = make<DiningCar>();
    car->setValueForKey("soup", "load");
    EXPECT_EQ(car->valueForKey("load"), "soup");
    EXPECT_TRUE(car->isa().isSubclassOf(*Class::named("ObjectTest.Wagon")));
    EXPECT_EQ(Class::described(typeid(DiningCar)), nullptr);
    // One in the middle, too.
    const auto sleeper = make<Sleeper>();
    sleeper->setValueForKey(2, "beds");
    sleeper->setValueForKey("linen", "load");
    EXPECT_EQ(sleeper->load, "linen");
}

TEST(ObjectTest, ADescriptionThatComesLateIsThatOfTheObjectsMadeFromThenOn) {
    const auto early = make<LongSiding>();
    EXPECT_THROW(early->valueForKey("length"), Exception);
    Class::define<Siding>("ObjectTest.Siding").property<&Siding::length>("length");
    EXPECT_EQ(make<LongSiding>()->valueForKey("length"), 0);
    Class::define<LongSiding, Siding>("ObjectTest.LongSiding");
    EXPECT_EQ(make<LongSiding>()->isa().name(), "ObjectTest.LongSiding");
    EXPECT_TRUE(Class::forget("ObjectTest.LongSiding"));
    EXPECT_TRUE(Class::forget("ObjectTest.Siding"));
    EXPECT_THROW(make<LongSiding>()->valueForKey("length"), Exception);
}

TEST(ObjectTest, KeyPathsPassOverNullAndRaiseAtWhatIsNoObject) {
    const auto wagon = make<Wagon>();
    wagon->next = make<Wagon>();
    wagon->next->load = "tea";
    const auto train =
        make<Array>(std::initializer_list<Value>{wagon, Null::marker(), wagon->next});
    const auto station = make<Wagon>();
    station->load = train;
    EXPECT_EQ(support::oneLine(station->valueForKeyPath("load.next.load")),
              "( tea, <null>, <null> )");
    EXPECT_EQ(train->valueForKey("@count"), Value(3));
    const auto mixed = make<Array>(std::initializer_list<Value>{wagon, "text"});
    EXPECT_EQ(mixed->trySetValueForKey(1, "seats"), SetOutcome::unknownKey);
    station->setValueForKeyPath("milk", "load.next.load");
    EXPECT_EQ(wagon->next->load, "milk");
    for (const Value& missing : {Value(), Value(Null::marker())}) {
        station->load = missing;
        EXPECT_TRUE(station->valueForKeyPath("load.next.load").isNull());
        station->setValueForKeyPath("milk", "load.next");
    }
    station->load = "Bath";
    EXPECT_EQ(raised([&] { station->setValueForKeyPath("milk", "load.next"); }),
              "NSUndefinedKeyException: class <string> has no key next to set");
    EXPECT_EQ(raised([&] { station->valueForKeyPath("load.next.load"); }),
              "NSUndefinedKeyException: class <string> has no key next.load to read");
    EXPECT_EQ(raised([&] { wagon->valueForKeyPath("next.nothing"); }),
              "NSUndefinedKeyException: class ObjectTest.Wagon has no key nothing to read");
    EXPECT_EQ(raised([&] { wagon->setValueForKey("x", "seats"); }),
              "NSInvalidArgumentException: class ObjectTest.Wagon does not take the value x for "
              "its key seats");
}

TEST(ObjectTest, KeysAreReadAndAssignedInBrackets) {
    const auto wagon = make<Wagon>();
    wagon["load"] = "tea";
    wagon["seats"] = 4;
    wagon["next"] = make<Wagon>();
    wagon->next["load"] = wagon["load"];
    (*wagon)["load"] = std::vector{1, 2};
    EXPECT_EQ(wagon->next["load"], "tea");
    EXPECT_EQ(wagon["load"].get<std::vector<int>>(), (std::vector{1, 2}));
    const Wagon& read = *wagon;
    EXPECT_EQ(read["seats"].get<std::string>(), "4");
    EXPECT_EQ(read["load"].tryGet<int>(), std::nullopt);
    wagon["load"] = nullptr;
    EXPECT_EQ(support::oneLine(read["load"]), "(null)");
    EXPECT_THROW(wagon["seats"] = "x", Exception);
    EXPECT_THROW(read["nothing"].get<int>(), Exception);
}

} // namespace
