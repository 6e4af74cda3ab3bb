#include "support/ObjectSteps.h"

#include <QXXMLMarshalling/base/Exception.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/Dictionary.h>
#include <QXXMLMarshalling/model/Null.h>
#include <QXXMLMarshalling/model/WeakRef.h>
#include <QXXMLMarshalling/observe/Observation.h>

#include <gtest/gtest.h>

#include <chrono>
#include <random>

namespace {

using namespace qx;
using support::Notebook;
using support::raised;
using Texts = std::vector<std::string>;

class Place : public Object {
public:
    String city;
    String country;
    Ref<Place> within;
    Ref<Array> streets = make<Array>();
    String silent;

    String label() const { return String::concat({city, ", ", country}); }
    static std::vector<String> affecting(const String& key) {
        if (key == "label")
            return {"city", "country"};
        if (key == "ring")
            return {"within.ring"};
        return {};
    }
    static std::vector<String> affectingAddress() { return {"label", "within.city"}; }
    String address() const {
        return String::concat({label(), " in ", within ? within->city : String("the world")});
    }
    static bool notifies(const String& key) { return key != "silent"; }
};

// Does something at its end.
struct Wagon : Place {
    ~Wagon() override { onEnd(*this); }
    Ref<Wagon> next;
    std::function<void(Wagon&)> onEnd;
};

const bool described = [] {
    Class::define<Place>("Place")
        .property<&Place::city>("city")
        .property<&Place::country>("country")
        .property<&Place::within>("within")
        .property<&Place::streets>("streets")
        .property<&Place::silent>("silent")
        .property<&Place::label>("label")
        .property<&Place::address>("address")
        .property<&Place::city>("ring")
        .classOperation<&Place::affecting>("keyPathsForValuesAffectingValueForKey:")
        .classOperation<&Place::affectingAddress>("keyPathsForValuesAffectingAddress")
        .classOperation<&Place::notifies>("automaticallyNotifiesObserversForKey:");
    Class::define<Wagon, Place>("Wagon");
    return true;
}();

Ref<Place> place(const char* city, Ref<Place> within = nullptr) {
    auto result = make<Place>();
    result->city = city;
    result->within = std::move(within);
    return result;
}

const bool added = support::addSteps<support::ObjectSteps>("tests/observe/changes.md");

struct ObservationTest : testing::Test {
    Ref<Notebook> notebook = make<Notebook>();
    Ref<Place> italy = place("Italy"), rome = place("Rome", italy);

    void observe(Key path) { rome->addObserver(notebook.get(), path); }

    // What the call adds to the notebook.
    template <class F>
    Texts notes(F call) {
        notebook->notes.clear();
        call();
        return notebook->notes;
    }
    Texts afterSetting(Object& object, Key key, const Value& value) {
        return notes([&] { object.setValueForKey(value, key); });
    }
};

TEST_F(ObservationTest, DependenciesReachAnyDistanceAndMayFormRings) {
    const auto one = place("One");
    const auto two = place("Two", one);
    one->within = two;
    two->addObserver(notebook.get(), "ring", 0, "of two");
    EXPECT_EQ(afterSetting(*one, "ring", "one"), Texts{"of two: (null) > (null)"});
    const auto end = place("end", one);
    auto chain = end;
    for (int i = 0; i < 20000; ++i)
        chain = place("link", chain);
    chain->addObserver(notebook.get(), "ring");
    EXPECT_EQ(afterSetting(*end, "ring", "new"), Texts{"ring: link > link"});
    EXPECT_EQ(afterSetting(*end, "within", place("other")), Texts{"ring: link > link"});
    EXPECT_EQ(afterSetting(*one, "ring", "1"), Texts{"of two: (null) > (null)"});
    EXPECT_EQ(afterSetting(*end->within, "ring", "2"), Texts{"ring: link > link"});
    one->setValueForKey(nullptr, "within");
}

TEST_F(ObservationTest, ChangesOfItemsCarryIndexesAndTheItems) {
    rome->streets = make<Array>(std::initializer_list<Value>{"a", "b", "c"});
    observe("streets");
    const auto told = [&](ChangeKind kind, std::vector<std::size_t> indexes, const auto& apply) {
        rome->willChange(kind, indexes, "streets");
        apply(*rome->streets);
        rome->didChange(kind, indexes, "streets");
        return support::oneLine(notebook->seen);
    };
    EXPECT_EQ(told(ChangeKind::insertion, {1}, [](Array& array) { array.insert(1, "x"); }),
              "{ kind = 2; new = ( x ); indexes = ( 1 ); }");
    EXPECT_EQ(told(ChangeKind::removal, {3}, [](Array& array) { array.remove(3); }),
              "{ kind = 3; old = ( c ); indexes = ( 3 ); }");
    const std::vector<std::size_t> ends = {0, 2};
    {
        const ChangeScope scope(*rome, "streets", ChangeKind::replacement, ends);
        for (const std::size_t index : ends)
            rome->streets->replace(index, "y");
    }
    EXPECT_EQ(support::oneLine(notebook->seen),
              "{ kind = 4; old = ( a, b ); new = ( y, y ); indexes = ( 0, 2 ); }");
}

TEST_F(ObservationTest, AnObserverMayRemoveItselfAndOthersWhileItIsTold) {
    auto second = make<Notebook>();
    observe("city");
    rome->addObserver(second.get(), "city");
    int calls = 0;
    ObservationToken token = rome->observe("city", [&](const ValueChange&) { ++calls; });
    notebook->then = [&](Object& object) {
        object.removeObserver(notebook.get(), "city");
        second = nullptr;
        token.end();
        token = object.observe("city", [&](const ValueChange&) { calls += 10; });
    };
    rome->setValueForKey("Roma", "city");
    EXPECT_EQ(notebook->notes.size(), 1U);
    EXPECT_EQ(calls, 0); // the one removed is told no more, the new one not yet
    rome->setValueForKey("Rome", "city");
    EXPECT_EQ(notebook->notes.size(), 1U);
    EXPECT_EQ(calls, 10);
}

// The first lies in the observation, the second outside.
TEST_F(ObservationTest, CallablesNeedNotBeCopiedAndEndWithTheirToken) {
    const auto held = std::make_shared<int>(0);
    ObservationToken tokens[] = {
        rome->observe("city", [own = std::make_unique<int>(1),
                               &held](const ValueChange&) { *held += ++*own; }),
        rome->observe("city", [own = std::make_unique<int>(10), kept = held](const ValueChange&) {
            *kept += ++*own;
        })};
    rome->setValueForKey("Roma", "city");
    rome->setValueForKey("Rome", "city");
    EXPECT_EQ(*held, 2 + 11 + 3 + 12);
    tokens[1].end();
    EXPECT_EQ(held.use_count(), 1);
    const std::function<void(const ValueChange&)> empty;
    void (*const none)(const ValueChange&) = nullptr;
    const std::string refused = "NSInvalidArgumentException: no callable was given for city";
    EXPECT_EQ(raised([&] { tokens[1] = rome->observe("city", empty); }), refused);
    EXPECT_EQ(raised([&] { tokens[1] = rome->observe("city", none); }), refused);
    EXPECT_EQ(raised([&] { tokens[1] = rome->observe("city", nullptr); }), refused);
}

TEST_F(ObservationTest, EitherSideMayGoFirst) {
    {
        const auto shortLived = make<Notebook>();
        rome->addObserver(shortLived.get(), "within.city");
        Place onStack;
        onStack.addObserver(shortLived.get(), "city");
        onStack.addObserver(notebook.get(), "city");
    }
    italy->setValueForKey("Italia", "city");
    observe("within.city");
    ObservationToken token = rome->observe("within.city", [](const ValueChange&) {});
    rome->within = nullptr; // by a change that nobody announced
    const WeakRef<Place> watched(italy);
    italy = nullptr;
    EXPECT_FALSE(watched);
    rome->setValueForKey(nullptr, "within");
    rome = nullptr;
    token.end();
}

TEST_F(ObservationTest, ADestructorMayRemoveItsObjectOnceMore) {
    struct Watcher : Object {
        explicit Watcher(Ref<Place> place) : watched(std::move(place)) {
            watched->addObserver(this, "city");
        }
        ~Watcher() override { watched->removeObserver(this, "city"); }
        Ref<Place> watched;
    };
    make<Watcher>(rome);
    rome->setValueForKey("Roma", "city");
    EXPECT_EQ(rome->city, "Roma");
}

TEST_F(ObservationTest, AnObserverMayEndTheObservedObjectBeforeOrAfterTheChange) {
    auto early = place("Rome");
    Place& object = *early;
    const auto token = object.observe(
        "city", [&](const ValueChange&) { early = nullptr; }, Observing::prior);
    object.setValueForKey("Roma", "city");
    EXPECT_FALSE(early);
    observe("city");
    observe("city");
    notebook->then = [&](Object&) { rome = nullptr; };
    rome.get()->setValueForKey("Roma", "city");
    EXPECT_EQ(notebook->notes.size(), 2U);
}

TEST_F(ObservationTest, WhatAnObserverThrowsComesOutWhenAllHaveBeenTold) {
    rome->addObserver(make<Object>().get(), "city"); // gone at once
    const auto deaf = make<Object>();
    rome->addObserver(deaf.get(), "city"); // does not take changes
    observe("city");
    EXPECT_EQ(notes([&] { EXPECT_THROW(rome->setValueForKey("A", "city"), Exception); }),
              Texts{"city: Rome > A"});
    rome->removeObserver(deaf.get(), "city");
    EXPECT_EQ(afterSetting(*rome, "city", "B"), Texts{"city: A > B"});
}

TEST_F(ObservationTest, AChangeThatFailsInItsScopeIsStillTold) {
    observe("city");
    notebook->then = [](Object&) { throw std::runtime_error("observer"); };
    EXPECT_THROW(
        {
            const ChangeScope scope(*rome, "city");
            rome->city = "Roma";
            throw std::logic_error("change");
        },
        std::logic_error);
    EXPECT_EQ(notebook->notes, Texts{"city: Rome > Roma"});
}

TEST_F(ObservationTest, AThrowingPriorObserverCancelsTheAnnouncement) {
    bool refuses = true;
    const auto token = rome->observe(
        "city",
        [&](const ValueChange& change) {
            if (change.isPrior && refuses)
                throw std::runtime_error("no");
        },
        Observing::prior);
    observe("city");
    EXPECT_THROW(rome->setValueForKey("Roma", "city"), std::runtime_error);
    EXPECT_EQ(rome->city, "Rome");
    refuses = false;
    EXPECT_EQ(afterSetting(*rome, "city", "Roma"), Texts{"city: Rome > Roma"});
}

TEST_F(ObservationTest, ALongChainOfObservedObjectsEndsWholeWhateverItsDestructorsDo) {
    const auto engine = place("engine");
    int told = 0, ended = 0;
    std::vector<WeakRef<Object>> seen;
    std::vector<ObservationToken> tokens;
    const auto atEnd = [&](Wagon& wagon) {
        ++ended;
        seen.emplace_back(&wagon);
        tokens.push_back(wagon.observe("city", [&](const ValueChange&) { ++told; }));
        // Beyond a depth the following one is whole still and waits for its end.
        Wagon* following = ended % 64 == 0 ? wagon.next.get() : nullptr;
        wagon.next = nullptr;
        if (following != nullptr) {
            EXPECT_EQ(following->isa().name(), "Wagon");
            WeakRef<Wagon> waiting(following);
            EXPECT_FALSE(waiting);
            tokens.push_back(following->observe("city", [&](const ValueChange&) { ++told; }));
            following->setValueForKey("coal", "city");
        }
        engine->setValueForKey(std::to_string(ended), "city");
    };
    for (const bool observed : {false, true}) {
        Ref<Wagon> train;
        for (int i = 0; i < 640; ++i) {
            auto wagon = make<Wagon>();
            wagon->next = std::move(train);
            wagon->within = engine;
            wagon->onEnd = atEnd;
            if (observed)
                tokens.push_back(wagon->observe("within.city", [&](const ValueChange& change) {
                    ++told;
                    EXPECT_EQ(change.object.isa().name(), "Wagon");
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

TEST_F(ObservationTest, ManyObservationsCostTheSameInAnyOrder) {
    constexpr int many = 40000;
    const auto start = std::chrono::steady_clock::now();
    const auto shared = place("Italy");
    std::vector<Ref<Place>> places;
    std::vector<Ref<Notebook>> notebooks;
    std::vector<Key> keys;
    for (int i = 0; i < many; ++i) {
        places.push_back(place("town", shared));
        places.back()->addObserver(notebook.get(), "within.city", 0);
        notebooks.push_back(make<Notebook>());
        shared->addObserver(notebooks.back().get(), "city", 0);
        keys.emplace_back("key" + std::to_string(i));
        shared->addObserver(notebook.get(), keys.back(), 0);
    }
    places.clear();
    EXPECT_EQ(afterSetting(*shared, "city", "Italia"), Texts{});
    for (const Key key : keys)
        shared->willChangeValueForKey(key);
    EXPECT_EQ(notes([&] {
                  for (const Key key : keys)
                      shared->didChangeValueForKey(key);
              }).size(),
              many);
    for (int i = 0; i < many; ++i) {
        shared->removeObserver(notebooks[i].get(), "city");
        shared->removeObserver(notebook.get(), keys[i]);
    }
    EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(20));
}

// Observers that do at random what they may do at all: the sanitizers watch.
struct Chaos {
    std::minstd_rand random{7};
    std::vector<Ref<Place>> places = std::vector<Ref<Place>>(12);
    std::vector<Ref<Notebook>> notebooks = std::vector<Ref<Notebook>>(4);
    std::vector<ObservationToken> tokens = std::vector<ObservationToken>(6);
    std::vector<WeakRef<Place>> all;
    int depth = 0;

    ~Chaos() {
        for (const auto& one : all)
            if (one)
                one.lock()->within = nullptr; // there are rings
    }
    template <class List>
    auto& any(List& list) {
        return list[random() % list.size()];
    }
    void act() {
        const std::function<void(Object&)> further = [this](Object&) {
            if (depth < 4)
                act();
        };
        static const std::vector<Key> keys = {"city", "within", "ring"};
        static const std::vector<Key> paths = {
            "city", "within.city", "within.within.ring", "address", "within.within.within", "ring"};
        const auto options = static_cast<unsigned>(random() % 16);
        const Ref<Place> one = any(places);
        const Ref<Notebook> observer = any(notebooks);
        const Key key = any(keys);
        ++depth;
        try {
            switch (one && observer ? random() % 10 : random() % 3) {
            case 0:
                all.emplace_back(any(places) = place("new", any(places)));
                break;
            case 1:
                any(places) = nullptr;
                break;
            case 2:
                (any(notebooks) = make<Notebook>())->then = further;
                break;
            case 3:
                throw std::runtime_error("observer");
            case 4:
                any(tokens) = one->observe(
                    any(paths), [=](const ValueChange& change) { further(change.object); },
                    options);
                break;
            case 5:
                one->addObserver(observer.get(), any(paths), options);
                break;
            case 6:
                one->removeObserver(observer.get(), any(paths));
                break;
            default:
                one->setValueForKey(key == "within" ? Value(any(places).get()) : Value("new"), key);
            }
        } catch (const std::exception&) {
            if (--depth > 0 && options < 8)
                throw;
            return;
        }
        --depth;
    }
};

TEST_F(ObservationTest, ObserversMayDoAnythingWhileTheyAreTold) {
    Chaos chaos;
    for (int i = 0; i < 20000; ++i)
        chaos.act();
    // Whatever happened, what is observed now is told.
    if (chaos.places[0])
        rome->within = chaos.places[0];
    rome->addObserver(notebook.get(), "within.city", 0);
    EXPECT_EQ(afterSetting(*rome->within, "city", "Italia").size(), 1U);
}

} // namespace
