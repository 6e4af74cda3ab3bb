// Each allocation in turn fails, alone or with all that follow, while values are set, undone and
// redone: what fails has changed nothing, and what was told to observers is never left half said.

#include "FailingMemory.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/observe/Observation.h>
#include <QXXMLMarshalling/undo/UndoableObject.h>

#include <cstdio>

namespace {

// Both sides of a pair change in one setter.
class Person : public qx::UndoableObject {
public:
    qx::Value partner() const { return _partner; }
    void setPartner(qx::Value partner) {
        if (partner.isSameAs(_partner))
            return;
        const auto former = _partner.as<Person>();
        const auto next = partner.as<Person>();
        {
            const qx::ChangeScope scope(*this, "partner");
            _partner = std::move(partner);
        }
        if (former)
            former->setValueForKey(nullptr, "partner");
        if (next)
            next->setValueForKey(this, "partner");
    }
    qx::String name;

private:
    qx::Value _partner;
};

using State = std::vector<qx::Value>;

// A few objects with all that can be changed about them.
struct Scene {
    explicit Scene(bool isObserved) : observed(isObserved) {
        for (int i = 0; i < 12; ++i)
            record->setValueForKey(i, "key" + std::to_string(i));
        record->setUndoManager(manager);
        one->setUndoManager(manager);
        other->setUndoManager(manager);
        if (observed)
            for (qx::Object* object :
                 {static_cast<qx::Object*>(record.get()), static_cast<qx::Object*>(one.get())})
                for (const char* key : {"key3", "new", "partner", "partner.name"})
                    tokens.push_back(
                        object->observe(key, [this](const qx::ValueChange&) { ++told; }));
    }
    ~Scene() {
        manager->removeAllActions();
        one->setUndoManager(nullptr);
        one->setValueForKey(nullptr, "partner");
        one->setChangeCache(nullptr);
        other->setChangeCache(nullptr);
    }
    Scene(const Scene&) = delete;
    Scene& operator=(const Scene&) = delete;

    void change() const {
        const qx::UndoGroup group(manager);
        record->setValueForKey("three", "key3");
        record->setValueForKey(nullptr, "key0");
        record->setValueForKey(nullptr, "key3");
        record->setValueForKey("new", "new");
        one->setValueForKey("One", "name");
        one->setValueForKey(other, "partner");
        other->setValueForKey("Other", "name");
    }
    State state() const {
        State values;
        for (const qx::String& key : record->keys()) {
            values.emplace_back(key);
            values.push_back(record->valueForKey(key));
        }
        for (const auto& person : {one, other})
            for (const char* key : {"name", "partner"})
                values.push_back(person->valueForKey(key));
        return values;
    }
    State undone() const {
        while (manager->canUndo())
            manager->undo();
        return state();
    }
    State redone() const {
        while (manager->canRedo())
            manager->redo();
        return state();
    }

    bool observed;
    int told = 0;
    qx::Ref<qx::UndoManager> manager = qx::make<qx::UndoManager>();
    qx::Ref<QXGenericRecord> record = qx::make<QXGenericRecord>();
    qx::Ref<Person> one = qx::make<Person>();
    qx::Ref<Person> other = qx::make<Person>();
    std::vector<qx::ObservationToken> tokens;
};

int failures = 0;

void expect(bool holds, const char* what, const char* step, long allocation) {
    if (holds)
        return;
    ++failures;
    std::printf("%s: %s, %s allocation %ld\n", step, what, failing::allFollowing ? "from" : "at",
                allocation);
}

// A step that is whole has happened or not.
void tryEach(const char* name, bool isWhole, bool observed,
             const std::function<void(Scene&)>& before, const std::function<void(Scene&)>& step) {
    failing::eachAllocation([&](long allocation) {
        Scene scene(observed);
        const State first = scene.undone();
        before(scene);
        const State start = scene.state();
        const bool canUndo = scene.manager->canUndo();
        const bool canRedo = scene.manager->canRedo();
        const failing::Outcome end = failing::run(allocation, [&] { step(scene); });
        if (end == failing::Outcome::undisturbed)
            return end;
        // Without memory nobody can be told, and what nobody is told of stays as it is.
        if (isWhole && end == failing::Outcome::failed && !(observed && failing::allFollowing)) {
            expect(scene.state() == start, "other values", name, allocation);
            expect(scene.manager->canUndo() == canUndo, "other steps to undo", name, allocation);
            expect(scene.manager->canRedo() == canRedo, "other steps to redo", name, allocation);
        }
        expect(scene.manager->groupingLevel() == 0, "an open group", name, allocation);
        const State last = canRedo ? scene.redone() : start;
        expect(scene.undone() == first, "not undone", name, allocation);
        const State redone = scene.redone();
        if (isWhole)
            expect(redone == last, "not redone", name, allocation);
        scene.told = 0;
        scene.record->setValueForKey("told?", "key3");
        expect(scene.told == (observed ? 1 : 0), "an observer is deaf", name, allocation);
        return end;
    });
}

} // namespace

int main() {
    qx::Class::define<Person, qx::UndoableObject>("Person")
        .property<&Person::name>("name")
        .property<&Person::partner, &Person::setPartner>("partner");
    for (const bool observed : {false, true}) {
        tryEach(
            "set", false, observed, [](Scene&) {}, [](Scene& scene) { scene.change(); });
        tryEach(
            "undo", true, observed, [](Scene& scene) { scene.change(); },
            [](Scene& scene) { scene.manager->undo(); });
        tryEach(
            "redo", true, observed,
            [](Scene& scene) {
                scene.change();
                scene.manager->undo();
            },
            [](Scene& scene) { scene.manager->redo(); });
    }
    return failures == 0 ? 0 : 1;
}
