// Walking back and forth through groups, at random: tests/record/QXGenericRecordUndoTest.cpp.

#include "UndoSteps.h"

#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/WeakRef.h>
#include <QXXMLMarshalling/undo/UndoManager.h>

#include <gtest/gtest.h>

namespace {

using namespace qx;
using support::raised;

// Registers the inverse of each of its changes by hand.
class Counter : public Object {
public:
    explicit Counter(UndoManager& undoManager) : manager(undoManager) {}

    void setNumber(int value) {
        manager.prepareWithInvocationTarget(this).perform("setNumber:", number);
        number = value;
    }
    int getNumber() const { return number; }
    void reset() { setNumber(0); }

    UndoManager& manager;
    int number = 0;
};

const bool described = [] {
    Class::define<Counter>("UndoManagerTest.Counter")
        .operation<&Counter::setNumber>("setNumber:")
        .operation<&Counter::reset>("reset")
        .property<&Counter::getNumber, &Counter::setNumber>("number");
    return true;
}();

struct CounterSteps : UndoSteps {
    CounterSteps() {
        for (const char* name : {"counter", "other"})
            objects[name] = make<Counter>(*manager);
        know("fail", [](auto&) { throw std::runtime_error("it fails"); });
    }
};
const bool added = support::addSteps<CounterSteps>("tests/undo/groups.md");

struct UndoManagerTest : testing::Test {
    Ref<UndoManager> manager = make<UndoManager>();
    Ref<Counter> counter = make<Counter>(*manager);

    void setInGroup(int value, const String& name = nullptr) {
        const UndoGroup group(manager, name);
        counter->setNumber(value);
    }
};

TEST_F(UndoManagerTest, ATargetThatDiesOrIsTakenOutIsForgottenInEveryGroup) {
    setInGroup(1);
    Counter onStack(*manager); // counted by nobody
    auto other = make<Counter>(*manager);
    {
        const UndoGroup group(manager);
        onStack.setNumber(1);
        other->setNumber(1);
        const UndoGroup nested(manager);
        other->setNumber(2);
    }
    other->setNumber(3); // in a group that is open
    other = nullptr;
    manager->removeAllActionsWithTarget(nullptr);
    manager->undo();
    EXPECT_EQ(onStack.number, 0);
    manager->removeAllActionsWithTarget(&onStack);
    EXPECT_FALSE(manager->canRedo());
    manager->undo();
    EXPECT_EQ(counter->number, 0);
    counter = nullptr;
    EXPECT_FALSE(manager->canRedo());
}

TEST_F(UndoManagerTest, ArgumentsAreKeptUntilTheActionGoes) {
    auto kept = make<Counter>(*manager);
    const WeakRef<Counter> watched(kept);
    manager->registerUndo(*counter, [kept](Counter& target) { target.number = kept->number; });
    kept->number = 9;
    kept = nullptr;
    EXPECT_TRUE(watched);
    manager->undo();
    EXPECT_EQ(counter->number, 9);
    EXPECT_FALSE(watched);
}

TEST_F(UndoManagerTest, AnUndoOrRedoWithoutMemoryLeavesEverythingAsItWas) {
    bool fails = true;
    manager->beginUndoGrouping();
    setInGroup(1, "One");
    {
        const UndoGroup group(manager);
        counter->setNumber(2);
        manager->registerUndo(*counter, [&](Counter& c) {
            c.setNumber(9); // half of what it does
            if (fails)
                throw std::bad_alloc();
        });
        counter->setNumber(3);
    }
    EXPECT_THROW(manager->undoNestedGroup(), std::bad_alloc);
    manager->endUndoGrouping();
    for (int i = 0; i < 2; ++i) {
        EXPECT_THROW(manager->undo(), std::bad_alloc);
        EXPECT_EQ(counter->number, 3);
        EXPECT_FALSE(manager->isUndoing() || manager->canRedo() || manager->groupingLevel() != 0);
    }
    EXPECT_EQ(manager->undoActionName(), "One");
    fails = false;
    manager->undo();
    EXPECT_EQ(counter->number, 0);
    manager->redo();
    EXPECT_EQ(counter->number, 3);
}

TEST_F(UndoManagerTest, CallablesNeedNotBeCopied) {
    manager->registerUndo(*counter,
                          [own = std::make_unique<int>(4)](Counter& c) { c.number += *own; });
    manager->registerUndo(*counter, &Counter::reset);
    counter->number = 7;
    manager->undo();
    EXPECT_EQ(counter->number, 4);
}

// Each as the second of three actions, alone and before one that finds no memory.
TEST_F(UndoManagerTest, ActionsMayDoAnythingToTheManagerAndItsTargets) {
    Ref<Counter> ending;
    const std::function<void(Counter&)> deeds[] = {
        [](Counter& c) { c.manager.removeAllActions(); },
        [](Counter& c) { c.manager.removeAllActionsWithTarget(&c); },
        [&](Counter& c) { c.manager.removeAllActionsWithTarget(ending.get()); },
        [&](Counter&) { ending = nullptr; },
        [&](Counter&) { counter = nullptr; },
        [&](Counter&) { manager = nullptr; },
        [](Counter& c) { c.manager.beginUndoGrouping(); },
        [](Counter& c) { c.manager.setLevelsOfUndo(1); },
        [](Counter& c) { c.manager.endEventGroup(); },
        [](Counter& c) {
            c.manager.registerUndo(c, [](Counter& changed) {
                changed.setNumber(7);
                changed.manager.enableUndoRegistration();
            });
        },
        [](Counter& c) {
            const UndoGroup group(c.manager, "Inner");
            c.setNumber(9);
            c.manager.endUndoGrouping();
        },
    };
    for (const auto& deed : deeds)
        for (const bool memoryFails : {false, true}) {
            manager = make<UndoManager>();
            counter = make<Counter>(*manager);
            ending = make<Counter>(*manager);
            {
                const UndoGroup group(manager, "Outer");
                if (memoryFails)
                    manager->registerUndo(*ending, [](Counter&) { throw std::bad_alloc(); });
                ending->setNumber(1);
                manager->registerUndo(*counter, deed);
                counter->setNumber(2);
                ending->setNumber(3);
            }
            const WeakRef<UndoManager> watched(manager);
            try {
                manager->undo();
            } catch (const std::bad_alloc&) {
                EXPECT_TRUE(memoryFails);
            }
            if (!watched.lock())
                continue;
            EXPECT_FALSE(manager->isUndoing() || manager->groupingLevel() != 0);
            EXPECT_TRUE(!manager->canRedo() || manager->redoActionName() == "Outer");
            while (manager->canRedo())
                raised([&] { manager->redo(); });
            manager->removeAllActions();
        }
}

TEST_F(UndoManagerTest, AManagerMayEndWithATargetOrTheActionsThatHoldIt) {
    for (const bool targetEnds : {true, false}) {
        manager = make<UndoManager>();
        auto target = make<Counter>(*manager);
        for (int i = 0; i < 3; ++i)
            manager->registerUndoWithTarget(target.get(),
                                            "setNumber:", i == 1 ? Value(manager) : Value(i));
        const WeakRef<UndoManager> watched(manager);
        UndoManager* last = manager.get();
        manager = nullptr;
        EXPECT_TRUE(watched.lock());
        if (targetEnds)
            target = nullptr;
        else
            last->removeAllActions();
        EXPECT_FALSE(watched.lock());
    }
}

} // namespace
