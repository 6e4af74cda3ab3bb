#pragma once

// Hearing of changes: an observer is told after (or before) the value at a key path of another
// object changed, whichever object on the path changed it.
//
//     order.addObserver(view, "shipTo.city", 3, "cityChanged:");   // old and new value
//     auto token = order.observe("total", [](const ValueChange& change) { show(change); });
//     {
//         const ChangeScope scope(order, "total");                 // a change in plain C++
//         order.addLine(line);
//     }
//
// Neither side keeps the other alive: with the observer or the observed object the observation
// ends. Observers are told in the order in which they came; while told they may remove themselves
// or others, and what they throw comes out of the change when all have been told. Changes nested in
// a change of the same value are told once, when the outermost ends. A value that depends on others
// is announced by the class operations "keyPathsForValuesAffectingValueForKey:" (the key) or
// "keyPathsForValuesAffecting<Key>", which return an array or a set of key paths; asked once for
// each class and key. A path that leads through an array hears of a new array, not of changes
// inside its items.
//
// Paths and what they depend on are followed at any distance and may come back to where they began;
// beyond 1,000,000 values whoever adds the observer, or makes the change that leads there, gets
// NSInternalInconsistencyException. A change that leads a path to other objects costs as much as
// adding the observer, every other change nothing but the telling.

#include <QXXMLMarshalling/platform/Value.h>

#include <vector>

namespace qx {

class Observance;

enum class ChangeKind : std::uint8_t { setting = 1, insertion, removal, replacement };

// What an observer wants to be told; joined with |.
struct Observing {
    enum Option : unsigned {
        newValue = 1, // the value after the change
        oldValue = 2, // the value before it
        initial = 4,  // once at the beginning, with the value as it is
        prior = 8,    // also before each change, without the new value
    };
};

// The keys of a change dictionary.
struct ChangeKey {
    static constexpr const char* kind = "kind";       // the number of a ChangeKind
    static constexpr const char* newValue = "new";    // the null marker for null
    static constexpr const char* oldValue = "old";    // likewise
    static constexpr const char* indexes = "indexes"; // an array of numbers; not when setting
    static constexpr const char* isPrior = "notificationIsPrior"; // true, or absent
};

// One change as a callable is told it. For all kinds but setting, the values are arrays of the
// items at the indexes.
struct ValueChange {
    Object& object; // the one that is observed
    ChangeKind kind = ChangeKind::setting;
    Value oldValue{}; // null too when it was not asked for
    Value newValue{};
    std::vector<std::size_t> indexes{};
    bool isPrior = false;
};

// Ends its observation with its scope. Empty by default and after a move.
class QX_API ObservationToken {
public:
    ObservationToken() noexcept;
    explicit ObservationToken(Ref<Observance> observance) noexcept;
    ObservationToken(ObservationToken&& other) noexcept;
    ObservationToken& operator=(ObservationToken&& other) noexcept;
    ~ObservationToken();

    void end() noexcept;

private:
    Ref<Observance> _observance;
};

// Announces a change that is made in its scope. The observed object must outlive it.
class QX_API ChangeScope {
public:
    ChangeScope(Object& object, Key key);
    // Items inserted into, removed from or replaced in the collection under the key.
    ChangeScope(Object& object, Key key, ChangeKind kind, std::vector<std::size_t> indexes);
    // What observers throw comes out, unless another exception is on its way already.
    ~ChangeScope() noexcept(false);
    ChangeScope(const ChangeScope&) = delete;
    ChangeScope& operator=(const ChangeScope&) = delete;

private:
    void announceEnd();

    Object& _object;
    Key _key;
    ChangeKind _kind = ChangeKind::setting;
    std::vector<std::size_t> _indexes;
    int _exceptions;
};

} // namespace qx
