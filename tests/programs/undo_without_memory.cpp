// Changes are undone and redone while memory fails, with observers and without (Trials.h).

#include "Trials.h"

#include <QXXMLMarshalling/QXXMLMarshalling.h>

namespace {

using qx::Ref;

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
    std::string state() const {
        std::string text;
        for (const qx::String& key : record->keys())
            text += key.str() + "=" + record->valueForKey(key).description().str() + " ";
        for (const auto& [person, partner] : {std::pair{one, other}, std::pair{other, one}})
            text += person->name.str() +
                    (person->partner().isNull()            ? " alone"
                     : person->partner().isSameAs(partner) ? " paired"
                                                           : " lost") +
                    " ";
        return text + std::to_string(manager->groupingLevel()) +
               (manager->canUndo() ? " can undo" : "") + (manager->canRedo() ? " can redo" : "");
    }
    void undoAll() const {
        while (manager->canUndo())
            manager->undo();
    }
    // All that can still be undone and redone, and whether observers still hear.
    std::string outcome() {
        std::string text = state();
        undoAll();
        text += "\n  undone " + state();
        while (manager->canRedo())
            manager->redo();
        text += "\n  redone " + state();
        told = 0;
        record->setValueForKey("told?", "key3");
        return text + "\n  told " + std::to_string(told);
    }

    bool observed;
    int told = 0;
    Ref<qx::UndoManager> manager = qx::make<qx::UndoManager>();
    Ref<QXGenericRecord> record = qx::make<QXGenericRecord>();
    Ref<Person> one = qx::make<Person>();
    Ref<Person> other = qx::make<Person>();
    std::vector<qx::ObservationToken> tokens;
};

void undoing() {
    qx::Class::define<Person, qx::UndoableObject>("Person")
        .property<&Person::name>("name")
        .property<&Person::partner, &Person::setPartner>("partner");
    using Step = void (*)(Scene&);
    const Step change = [](Scene& scene) { scene.change(); };
    const Step undo = [](Scene& scene) { scene.manager->undo(); };
    const Step redo = [](Scene& scene) { scene.manager->redo(); };
    const struct {
        std::string name;
        std::vector<Step> before;
        Step operation;
        bool isWhole; // has happened or not
    } rows[] = {{"setting", {}, change, false},
                {"undoing", {change}, undo, true},
                {"redoing", {change, undo}, redo, true}};
    for (const bool observed : {false, true})
        for (const auto& row : rows)
            tryEach(row.name + (observed ? ", observed" : ""), [&row, observed] {
                const auto scene = std::make_shared<Scene>(observed);
                for (const Step step : row.before)
                    step(*scene);
                Trial trial;
                trial.operation = [&row, scene] { row.operation(*scene); };
                trial.outcome = [scene] { return scene->outcome(); };
                // Of several changes some may have happened. Without memory nobody can be told, and
                // what nobody is told of stays as it is.
                if (!row.isWhole)
                    trial.restore = [scene] { scene->undoAll(); };
                else if (!observed || !failing::allFollowing)
                    trial.kept = [scene] { return scene->state(); };
                return trial;
            });
}

} // namespace

int main() {
    undoing();
    std::cout << faults << " faults\n";
    return faults == 0 ? 0 : 1;
}
