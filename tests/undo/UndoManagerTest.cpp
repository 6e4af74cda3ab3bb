// Walking back and forth through groups, at random: tests/record/QXGenericRecordUndoTest.cpp.

#include "support/Texts.h"

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
    void reset() { setNumber(0); }
    void fail() { throw std::runtime_error("fails"); }

    UndoManager& manager;
    int number = 0;
};

const bool described = [] {
    Class::define<Counter>("UndoManagerTest.Counter")
        .operation<&Counter::setNumber>("setNumber:")
        .operation<&Counter::reset>("reset")
        .operation<&Counter::fail>("fail");
    return true;
}();

const std::string inconsistent = "NSInternalInconsistencyException: ";

struct UndoManagerTest : testing::Test {
    Ref<UndoManager> manager = make<UndoManager>();
    Ref<Counter> counter = make<Counter>(*manager);

    void setInGroup(int value, const String& name = nullptr) {
        const UndoGroup group(manager, name);
        counter->setNumber(value);
    }
};

TEST_F(UndoManagerTest, ARegistrationOutsideAnyGroupOpensOneUntilTheEventEnds) {
    counter->setNumber(1);
    counter->setNumber(2);
    EXPECT_EQ(manager->groupingLevel(), 1U);
    manager->endEventGroup();
    EXPECT_EQ(manager->groupingLevel(), 0U);
    manager->endEventGroup(); // there is none any more
    manager->undo();
    EXPECT_EQ(counter->number, 0);
}

TEST_F(UndoManagerTest, NestedGroupsCanBeUndoneWhileTheOuterStaysOpen) {
    manager->beginUndoGrouping();
    EXPECT_EQ(manager->groupingLevel(), 1U); // it opens no other
    setInGroup(1);
    setInGroup(2);
    manager->undoNestedGroup();
    EXPECT_EQ(counter->number, 1);
    EXPECT_EQ(manager->groupingLevel(), 1U);
    counter->setNumber(7);
    EXPECT_EQ(raised([&] { manager->undoNestedGroup(); }),
              inconsistent + "the last entry of the open group is an action, not a nested group");
    manager->undo(); // ends the group and undoes all of it
    EXPECT_EQ(counter->number, 0);
    EXPECT_EQ(manager->groupingLevel(), 0U);
}

TEST_F(UndoManagerTest, FaultsOfTheCallerRaise) {
    EXPECT_EQ(raised([&] { manager->endUndoGrouping(); }),
              inconsistent + "no undo group is open to be ended");
    EXPECT_EQ(raised([&] { manager->enableUndoRegistration(); }),
              inconsistent + "undo registration is not disabled");
    manager->setGroupsByEvent(false);
    EXPECT_EQ(raised([&] { counter->setNumber(1); }),
              inconsistent + "an undo action was registered outside any group");
    EXPECT_EQ(raised([&] { manager->registerUndoWithTarget(nullptr, "reset", nullptr); }),
              "NSInvalidArgumentException: an undo action was registered without target");
    EXPECT_EQ(
        raised([&] { manager->prepareWithInvocationTarget(counter.get()).perform("unknown"); }),
        "NSInvalidArgumentException: an undo action was registered for the operation unknown, "
        "which class UndoManagerTest.Counter does not answer");
    const UndoGroup outer(manager);
    const UndoGroup inner(manager);
    EXPECT_EQ(raised([&] { manager->undo(); }),
              inconsistent + "undo was called inside a nested group");
    EXPECT_EQ(raised([&] { manager->redo(); }),
              inconsistent + "redo was called inside a nested group");
    EXPECT_EQ(manager->groupingLevel(), 2U);
}

TEST_F(UndoManagerTest, ScopesEndTheirGroupWhateverWasLeftOpenOrClosedInside) {
    try {
        const UndoGroup group(manager);
        manager->beginUndoGrouping();
        counter->setNumber(1);
        throw 1;
    } catch (int) {
    }
    EXPECT_EQ(manager->groupingLevel(), 0U);
    {
        const UndoGroup group(manager);
        manager->endUndoGrouping();
        manager->beginUndoGrouping();
    }
    EXPECT_EQ(manager->groupingLevel(), 1U);
    manager->undo();
    EXPECT_EQ(counter->number, 0);
}

TEST_F(UndoManagerTest, AScopeIsAStepOfItsOwnUnderItsOwnName) {
    counter->setNumber(1); // in the group that opens by itself
    {
        const UndoGroup outer(manager, "Outer");
        counter->setNumber(2);
        const UndoGroup inner(manager, "Inner");
        counter->setNumber(3);
    }
    setInGroup(4);
    EXPECT_EQ(manager->undoActionName(), nullptr);
    manager->undo();
    EXPECT_EQ(manager->undoActionName(), "Outer");
    manager->undo();
    EXPECT_EQ(counter->number, 1);
    manager->undo();
    EXPECT_EQ(counter->number, 0);
}

TEST_F(UndoManagerTest, DisablingIsCounted) {
    manager->disableUndoRegistration();
    manager->disableUndoRegistration();
    manager->enableUndoRegistration();
    setInGroup(1);
    EXPECT_FALSE(manager->canUndo());
    manager->enableUndoRegistration();
    setInGroup(2);
    manager->undo();
    EXPECT_EQ(counter->number, 1);
}

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

TEST_F(UndoManagerTest, AnActionThatThrowsDoesNotKeepTheOthersFromBeingUndone) {
    const auto other = make<Counter>(*manager);
    setInGroup(1);
    {
        const UndoGroup group(manager);
        counter->setNumber(2);
        manager->registerUndoWithTarget(counter.get(), "fail", nullptr);
        other->setNumber(3);
    }
    EXPECT_THROW(manager->undo(), std::runtime_error);
    EXPECT_FALSE(manager->isUndoing());
    EXPECT_EQ(manager->groupingLevel(), 0U);
    EXPECT_EQ(counter->number * 10 + other->number, 10);
    manager->redo();
    EXPECT_EQ(counter->number * 10 + other->number, 23);
    EXPECT_FALSE(manager->canRedo());
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

TEST_F(UndoManagerTest, ActionsCannotUndoOrEndTheGroupTheyRunIn) {
    const std::pair<void (UndoManager::*)(), const char*> cases[] = {
        {&UndoManager::undo, "undo was called by an undo action"},
        {&UndoManager::redo, "redo was called by an undo action"},
        {&UndoManager::endUndoGrouping, "no undo group is open to be ended"},
        {&UndoManager::undoNestedGroup, "undoNestedGroup was called by an undo action"}};
    for (const auto& [call, reason] : cases) {
        setInGroup(1);
        manager->registerUndo(*counter,
                              [step = call](Counter& target) { (target.manager.*step)(); });
        EXPECT_EQ(raised([&] { manager->undo(); }), inconsistent + reason);
        EXPECT_EQ(manager->groupingLevel(), 0U);
    }
}

TEST_F(UndoManagerTest, AnActionMayRemoveThoseThatWouldFollow) {
    setInGroup(1);
    counter->setNumber(2);
    manager->registerUndo(*counter, [](Counter& c) { c.manager.removeAllActions(); });
    manager->undo();
    EXPECT_EQ(counter->number, 2);
    EXPECT_FALSE(manager->canUndo() || manager->canRedo());
}

TEST_F(UndoManagerTest, LevelsOfUndoDropTheOldest) {
    manager->setLevelsOfUndo(3);
    for (int value = 1; value <= 5; ++value)
        setInGroup(value);
    while (manager->canUndo())
        manager->undo();
    EXPECT_EQ(counter->number, 2);
    manager->setLevelsOfUndo(1);
    manager->redo();
    EXPECT_FALSE(manager->canRedo());
}

TEST_F(UndoManagerTest, NamesGoAlongFromUndoToRedo) {
    setInGroup(1, "One");
    counter->setNumber(2);
    manager->setActionName("Two");
    EXPECT_EQ(manager->undoActionName(), "Two");
    manager->undo();
    EXPECT_EQ(manager->undoActionName(), "One");
    EXPECT_EQ(manager->redoActionName(), "Two");
    manager->setActionName("First"); // no group is open: the last entry
    manager->undo();
    EXPECT_EQ(manager->undoActionName(), nullptr);
    EXPECT_EQ(manager->redoActionName(), "First");
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
