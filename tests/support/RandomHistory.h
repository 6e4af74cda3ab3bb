#pragma once

// Objects changed at random under one undo manager, beside a plain list of the states that they
// went through. Undoing and redoing must walk that list, whatever the objects are.
//
//     ASSERT_TRUE(support::RandomHistory(seed, objects, rename).agreesFor(30)) << "seed " << seed;

#include <QXXMLMarshalling/platform/UndoManager.h>
#include <QXXMLMarshalling/platform/Value.h>

#include <random>
#include <string>
#include <vector>

namespace support {

class RandomHistory {
public:
    // Changes "name" without setValueForKey.
    using Rename = void (*)(qx::Object&, const qx::String&);

    // The objects answer "setUndoManager:", take texts and null for "name", numbers for "age" and
    // each other and null for "partner".
    RandomHistory(unsigned seed, std::vector<qx::Ref<qx::Object>> objects, Rename rename);
    // Takes the objects apart.
    ~RandomHistory();
    RandomHistory(const RandomHistory&) = delete;
    RandomHistory& operator=(const RandomHistory&) = delete;

    // Makes so many steps, then undoes and redoes all. False as soon as objects and list disagree.
    bool agreesFor(int steps);

private:
    using State = std::vector<qx::Value>;

    unsigned below(unsigned limit) { return static_cast<unsigned>(_random() % limit); }
    unsigned size() const { return static_cast<unsigned>(_objects.size()); }
    State state() const;
    bool agrees() const;
    bool undo();
    bool redo();
    void setSomething();
    void change();

    std::mt19937 _random;
    qx::Ref<qx::UndoManager> _manager = qx::make<qx::UndoManager>();
    std::vector<qx::Ref<qx::Object>> _objects;
    Rename _rename;
    std::vector<State> _states;
    std::size_t _position = 0;
};

} // namespace support
