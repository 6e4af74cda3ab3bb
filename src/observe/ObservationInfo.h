#pragma once

// What an object that takes part in observation keeps: the observances of its own key paths, the
// links of everybody's paths that pass through it, the observances in which it is the observer, and
// the changes that were announced and are not over.
//
// An observance has one link for each value that it hears of: those on its path, and those that one
// of them depends on (ObservationPath.h). A link that leads on knows the object that the value led
// to; once it leads to another, or an object on the way has ended, the path is walked again from
// its beginning and all links are made anew.
//
// Telling runs foreign code, which may end anything: whatever is walked meanwhile is a copy that
// keeps the observances, which know when they have ended.

#include <QXXMLMarshalling/model/Value.h>
#include <QXXMLMarshalling/observe/Observation.h>

#include "model/ObjectExtras.h"
#include "observe/ObservationPath.h"

#include <list>
#include <map>
#include <optional>
#include <span>
#include <tuple>
#include <unordered_map>

namespace qx {

struct ObservationInfo;

struct ObservationLink {
    using List = std::list<ObservationLink>;

    Observance* observance = nullptr;
    Object* object = nullptr;
    Key key;
    std::size_t place = 0; // among the links of the observance
    bool endsPath = false; // the value is the observed one itself
    bool leadsOn = false;
    const Object* next = nullptr; // what the value led to; for comparison only
    List::iterator position;
};

class Observance {
public:
    Observance(Object& root, Key keyPath, unsigned options);

    void retain() noexcept { ++_count; }
    void release() noexcept {
        if (--_count == 0)
            delete this;
    }

    // Ended at once where one of the objects is ending.
    void begin(Object* observer, Selector context,
               detail::UniqueFunction<void(const ValueChange&)> call);
    // Takes it out of all objects; the callable lives on until nobody tells it any more.
    void end() noexcept;
    bool hasEnded() const noexcept { return _root == nullptr; }
    bool isEarlierThan(const Observance& other) const noexcept { return _number < other._number; }

    // Links the values on the path and those that they depend on. When that fails, which raises,
    // the links stay as they were, and are outdated.
    void walkPath();
    bool isOutdated() const noexcept { return _isOutdated; }
    void markOutdated() noexcept { _isOutdated = true; }
    // The object of the link ends.
    void loseLink(const ObservationLink& link) noexcept;

    // A change is announced. `kind` and `indexes` count for the end of the path only.
    void changeBegins(bool atEndOfPath, ChangeKind kind, std::span<const std::size_t> indexes);
    // Whether this was the outermost announced change.
    bool changeEnds() noexcept { return --_changing == 0; }
    std::optional<ValueChange> priorChange() const;
    // The change that has just ended, with the new value; none when the observance has ended.
    std::optional<ValueChange> finishedChange();
    void tell(const ValueChange& change);

private:
    friend struct ObservationInfo;

    bool maySpeak() const noexcept;
    void enlist(Object* observer);
    void link(const std::vector<ObservedValue>& values);
    static void unlink(const std::vector<ObservationLink*>& links) noexcept;
    Value currentValue() const;

    unsigned _count = 1;
    std::uint64_t _number; // counts all observances of the process
    Object* _root;
    Object* _observer = nullptr;
    Key _keyPath;
    unsigned _options;
    Selector _context;
    detail::UniqueFunction<void(const ValueChange&)> _call;
    std::vector<ObservationLink*> _links; // null for a link whose object has ended
    bool _isOutdated = false;
    bool _isWalking = false;
    std::list<Ref<Observance>>::iterator _rootPosition;
    std::list<Observance*>::iterator _observerPosition;

    std::size_t _changing = 0;
    ChangeKind _kind = ChangeKind::setting;
    std::vector<std::size_t> _indexes;
    Value _oldValue;
};

struct ObservationInfo final : ChangeListener, private EndListener {
    explicit ObservationInfo(Object& owner);
    ~ObservationInfo() override = default;
    ObservationInfo(const ObservationInfo&) = delete;
    ObservationInfo& operator=(const ObservationInfo&) = delete;

    static ObservationInfo& of(Object& object);
    // Null when nothing was ever observed at or by the object.
    static ObservationInfo* existing(const Object& object) noexcept;

    void willChange(Key key, ChangeKind kind, std::span<const std::size_t> indexes) override;
    void didChange(Key key) override;

    ObservationLink& addLink(Key key);
    void removeLink(const ObservationLink& link) noexcept;

    // The latest observance of the key path by the observer, with the context if one is given;
    // null when there is none.
    Observance* latest(const Object* observer, Key keyPath, const Selector* context) const;

    std::list<Ref<Observance>> observances;
    std::list<Observance*> observing;

private:
    friend class Observance;

    // By observer, key path, context and number.
    using Listing = std::tuple<const void*, const void*, const void*, std::uint64_t>;

    // The links of one key, and the change of its value that is announced. Neither: no entry.
    struct ObservedKey {
        ObservationLink::List links;
        std::size_t depth = 0;
        std::uint64_t change = 0; // tells one change from the next
        std::vector<Ref<Observance>> told;
    };
    struct Concerned {
        Ref<Observance> observance;
        bool atEndOfPath;
    };

    static Listing listingOf(const Observance& observance) noexcept;
    void objectEnds(Object&) noexcept override;
    bool isUnderWay(Key key, std::uint64_t change) const noexcept;
    std::vector<Ref<Observance>> takeTold(Key key) noexcept;
    // Those of the earliest observance first.
    std::vector<Concerned> concernedBy(Key key) const;
    // Those whose path leads elsewhere now that the value under the key has changed.
    std::vector<Ref<Observance>> outdatedBy(Key key) const;

    Object& _owner;
    std::uint64_t _changes = 0;
    std::unordered_map<Key, ObservedKey> _keys;
    std::map<Listing, Observance*> _byObserver;
};

} // namespace qx
