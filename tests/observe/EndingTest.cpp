// How objects end that are observed, and observe.

#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/WeakRef.h>
#include <QXXMLMarshalling/observe/Observation.h>

#include <gtest/gtest.h>

namespace {

using namespace qx;

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

const bool described = [] {
    Class::define<Wagon>("EndingTest.Wagon")
        .property<&Wagon::engine>("engine")
        .property<&Wagon::load>("load");
    return true;
}();

TEST(EndingTest, ALongChainOfObservedObjectsEndsWholeWhateverItsDestructorsDo) {
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
            EXPECT_EQ(following->isa().name(), "EndingTest.Wagon");
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
                    EXPECT_EQ(change.object.isa().name(), "EndingTest.Wagon");
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

} // namespace
