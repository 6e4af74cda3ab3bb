// Objects as such: how they end, observed or not, which class they are of, key paths.

#include "support/Texts.h"

#include <QXXMLMarshalling/model/Array.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Null.h>
#include <QXXMLMarshalling/model/WeakRef.h>
#include <QXXMLMarshalling/observe/Observation.h>

#include <gtest/gtest.h>

namespace {

using namespace qx;
using support::raised;

class Wagon : public Object {
public:
    ~Wagon() override {
        if (onEnd)
            onEnd(*this);
    }
    Ref<Wagon> next;
    Ref<Wagon> engine;
    Value load;
    std::function<void(Wagon&)> onEnd;
};

// Nobody describes these two.
class Coach : public Wagon {};
struct Painted {
    virtual ~Painted() = default;
    int colour = 0;
};
class DiningCar : public Painted, public Coach {};

class Sleeper : public DiningCar {
public:
    int beds = 0;
};
class Siding : public Object {
public:
    int length = 0;
};
class LongSiding : public Siding {};

const bool described = [] {
    Class::define<Sleeper, DiningCar>("ObjectTest.Sleeper").property<&Sleeper::beds>("beds");
    Class::define<Wagon>("ObjectTest.Wagon")
        .property<&Wagon::next>("next")
        .property<&Wagon::engine>("engine")
        .property<&Wagon::load>("load");
    return true;
}();

TEST(ObjectTest, ALongChainOfObservedObjectsEndsWholeWhateverItsDestructorsDo) {
    const auto engine = make<Wagon>();
    int told = 0, ended = 0;
    std::vector<WeakRef<Object>> seen;
    std::vector<ObservationToken> tokens;
    const auto atEnd = [&](Wagon& wagon) {
        ++ended;
        seen.emplace_back(&wagon);
        tokens.push_back(wagon.observe("load", [&](const ValueChange&) { ++told; }));
        // Beyond a depth the following one is whole still and waits for its end.
        Wagon* following = ended % 64 == 0 ? wagon.next.get() : nullptr;
        wagon.next = nullptr;
        if (following != nullptr) {
            EXPECT_EQ(following->isa().name(), "ObjectTest.Wagon");
            WeakRef<Wagon> waiting(following);
            EXPECT_FALSE(waiting);
            tokens.push_back(following->observe("load", [&](const ValueChange&) { ++told; }));
            following->setValueForKey("coal", "load");
        }
        engine->setValueForKey(ended, "load");
    };
    for (const bool observed : {false, true}) {
        Ref<Wagon> train;
        for (int i = 0; i < 640; ++i) {
            auto wagon = make<Wagon>();
            wagon->next = std::move(train);
            wagon->engine = engine;
            wagon->onEnd = atEnd;
            if (observed)
                tokens.push_back(wagon->observe("engine.load", [&](const ValueChange& change) {
                    ++told;
                    EXPECT_EQ(change.object.isa().name(), "ObjectTest.Wagon");
                }));
            train = std::move(wagon);
        }
        train = nullptr;
    }
    EXPECT_EQ(ended, 1280);
    EXPECT_GT(told, 0); // by those whose turn it was not yet
    for (const auto& one : seen)
        EXPECT_FALSE(one);
}

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
}

} // namespace
