#pragma once

// Objects changed at random under one undo manager, beside a plain list of the states that they
// went through. Undoing and redoing must walk that list, whatever the objects are.
//
//     ASSERT_TRUE(RandomHistory(seed, objects).agreesFor(30)) << "seed " << seed;

#include <QXXMLMarshalling/model/Value.h>
#include <QXXMLMarshalling/observe/Observation.h>
#include <QXXMLMarshalling/undo/UndoManager.h>

#include <optional>
#include <random>
#include <string>
#include <vector>

class RandomHistory {
public:
    // The objects answer "setUndoManager:", take texts and null for "name", numbers for "age" and
    // each other and null for "partner".
    RandomHistory(unsigned seed, std::vector<qx::Ref<qx::Object>> objects)
        : _random(seed), _objects(std::move(objects)) {
        for (const auto& object : _objects)
            object->perform("setUndoManager:", _manager);
        _states.push_back(state());
    }
    // Takes the objects apart.
    ~RandomHistory() {
        for (const auto& object : _objects) {
            object->setValueForKey(nullptr, "partner"); // the caches hold no partner either
            object->perform("setUndoManager:", nullptr);
        }
        _manager->removeAllActions();
    }

    // Makes so many steps, then undoes and redoes all. False as soon as objects and list disagree.
    bool agreesFor(int steps) {
        while (--steps >= 0) {
            const unsigned choice = below(6);
            if (choice > 1)
                change();
            else
                walk(choice == 0 ? -1 : 1);
            if (!agrees())
                return false;
        }
        return walksAllTheWay(-1) && walksAllTheWay(1);
    }

private:
    using State = std::vector<qx::Value>;

    unsigned below(unsigned limit) { return static_cast<unsigned>(_random() % limit); }
    unsigned size() const { return static_cast<unsigned>(_objects.size()); }
    State state() const {
        State values;
        for (const auto& object : _objects)
            for (const char* key : {"name", "age", "partner"})
                values.push_back(object->valueForKey(key));
        return values;
    }
    bool agrees() const {
        return state() == _states[_position] && _manager->canUndo() == (_position > 0) &&
               _manager->canRedo() == (_position + 1 < _states.size());
    }
    // One undo or redo, if there is one.
    void walk(int direction) {
        direction < 0 ? _manager->undo() : _manager->redo();
        if (_position + direction < _states.size())
            _position += direction;
    }
    bool walksAllTheWay(int direction) {
        while (direction < 0 ? _manager->canUndo() : _manager->canRedo()) {
            walk(direction);
            if (!agrees())
                return false;
        }
        return true;
    }
    void setSomething() {
        qx::Object& object = *_objects[below(size())];
        const unsigned number = below(size() + 1);
        switch (below(4)) {
        case 0:
            return object.setValueForKey(number, "age");
        case 1: {
            const qx::ChangeScope scope(object, "name");
            return object.setValueForKey(std::to_string(number), "name");
        }
        case 2:
            return object.setValueForKey(nullptr, below(2) == 0 ? "name" : "partner");
        default:
            object.setValueForKey(number < size() ? _objects[number] : qx::Ref<qx::Object>(),
                                  "partner");
        }
    }
    // One entry: a group opened by hand or by itself, perhaps with groups inside; none where
    // nothing changed. Changes that take each other back are an entry all the same.
    void change() {
        bool changed = false;
        {
            std::optional<qx::UndoGroup> outer;
            if (below(2) == 0)
                outer.emplace(_manager);
            for (unsigned i = below(4); i != 0; --i) {
                std::optional<qx::UndoGroup> inner;
                if (outer && below(3) == 0)
                    inner.emplace(_manager);
                const State before = state();
                setSomething();
                changed = changed || state() != before;
            }
        }
        _manager->endEventGroup();
        if (!changed)
            return;
        _states.resize(++_position);
        _states.push_back(state());
    }

    std::mt19937 _random;
    qx::Ref<qx::UndoManager> _manager = qx::make<qx::UndoManager>();
    std::vector<qx::Ref<qx::Object>> _objects;
    std::vector<State> _states;
    std::size_t _position = 0;
};
